// The program in odd environments: what it says of a home is the same, and it writes nothing where it happens
// to be.
#include <gmock/gmock.h>
#include <pwd.h>
#include <unistd.h>

#include <filesystem>
#include <nlohmann/json.hpp>
#include <sstream>

#include "tests/support/Program.h"
#include "tests/support/TemporaryFolder.h"

namespace {

using testing::ContainsRegex;
using testing::HasSubstr;
using testing::Not;
using testing::StartsWith;
using testing_support::Outcome;
using testing_support::runProgram;

class EnvironmentTest : public testing::Test {
  protected:
    EnvironmentTest() {
        home.writeFile("Movies/Reelix Projects/Film.qnproject/Movies/HD.mov", "no real movie");
        home.writeFile("Movies/Reelix Events/Trip/clip-2009-07-01 12;00;00.mov", "no real movie");
    }
    // Runs the program in a folder of its own with the settings, "NAME=value" or "-uNAME", after the others.
    Outcome run(std::vector<std::string> settings, const std::vector<std::string>& arguments) const {
        std::vector<std::string> line{"--chdir=" + current};
        for (auto& setting : settings)
            if (setting.starts_with("-u"))
                line.push_back(std::move(setting));
        for (auto& setting : settings)
            if (!setting.empty())
                line.push_back(std::move(setting));
        line.push_back(VEXO_BIN_DIR "/vexo");
        line.insert(line.end(), arguments.begin(), arguments.end());
        return runProgram("/usr/bin/env", line);
    }
    Outcome tree(const std::vector<std::string>& settings) const {
        return run(settings, {"--home", home.path(), "tree", "--json"});
    }
    // What is left out is warned of, and nothing else is said.
    static void expectWarningsAlone(const Outcome& outcome) {
        std::istringstream errors(outcome.errors);
        for (std::string line; std::getline(errors, line);)
            EXPECT_THAT(line, StartsWith("vexo: warning: cannot "));
    }
    static std::string plugins(const Outcome& outcome) {
        return nlohmann::json::parse(outcome.output)["plugins"].dump();
    }
    void expectNothingWritten() const { EXPECT_TRUE(std::filesystem::is_empty(current)); }

    const testing_support::TemporaryFolder home;
    const testing_support::TemporaryFolder elsewhere;
    const std::string current = elsewhere.makeFolder("current");
    const std::string longText = std::string(10'000, 'x');
};

// Whoever can write there could otherwise run code of theirs. A path without a slash in front is one.
TEST_F(EnvironmentTest, NoLibraryIsLookedForInTheCurrentFolder) {
    const auto expectNone = [](const Outcome& outcome) {
        EXPECT_THAT(outcome.errors, HasSubstr("trying file=/"));
        EXPECT_THAT(outcome.errors, Not(ContainsRegex("trying file=[^/]")));
    };
    const Outcome whole = run({"LD_DEBUG=libs"}, {"--home", home.path(), "tree", "--json"});
    for (const char* library : {"libVexoMediaBrowser.so", "Reelix.so", "libVexoDrawing.so", "libavformat.so"})
        EXPECT_THAT(whole.errors, HasSubstr(library));
    expectNone(whole);
    expectNone(runProgram("/usr/bin/env", {"--chdir=" + current, "LD_DEBUG=libs",
                                           VEXO_BIN_DIR "/vexo-sample-movie", "--version"}));
}

TEST_F(EnvironmentTest, TheTreeIsTheSameInOddOnes) {
    const Outcome plain = tree({"TZ=UTC0"});
    ASSERT_EQ(plain.status, 0) << plain.errors;
    ASSERT_THAT(plain.output, HasSubstr("2009-07-01"));
    const std::string file = elsewhere.writeFile("file"), folder = elsewhere.makeFolder("folder");
    // In each the home or the cache is a folder of the test's, so that nothing lands in the user's own.
    const std::vector<std::string> odd[] = {
        {"-uHOME", "-uPATH", "-uLANG", "-uLC_ALL", "-uTERM", "TZ=UTC0"},
        {"HOME=" + folder,
         "XDG_CACHE_HOME=", "XDG_DATA_HOME=", "XDG_DATA_DIRS=", "XDG_CONFIG_HOME=", "PATH=", "LANG=",
         "LC_ALL=", "LANGUAGE=", "TERM=", "TMPDIR=", "VEXO_PLUGIN_PATH=", "VEXO_MEDIA_READER=", "TZ=UTC0"},
        {"HOME=" + folder, "XDG_CACHE_HOME=relative", "XDG_DATA_HOME=./here", "XDG_DATA_DIRS=a:./b:..",
         "XDG_CONFIG_HOME=c", "XDG_RUNTIME_DIR=r", "PATH=.:bin", "VEXO_PLUGIN_PATH=plugins:.", "TZ=UTC0"},
        {"HOME=/proc/nowhere", "XDG_CACHE_HOME=/proc/nowhere", "XDG_DATA_HOME=/proc/nowhere",
         "XDG_DATA_DIRS=/proc/nowhere", "TMPDIR=/proc/nowhere", "VEXO_PLUGIN_PATH=/proc/nowhere",
         "VEXO_MEDIA_READER=/proc/nowhere", "TZ=Nowhere/Unknown"},
        {"HOME=" + file, "XDG_CACHE_HOME=" + file, "XDG_DATA_HOME=" + file, "XDG_DATA_DIRS=" + file,
         "TMPDIR=" + file, "VEXO_PLUGIN_PATH=" + file, "VEXO_MEDIA_READER=" + folder, "TZ=:"},
        {"XDG_CACHE_HOME=/dev/null", "XDG_DATA_DIRS=::/dev/zero::", "VEXO_PLUGIN_PATH=::::",
         "LANGUAGE=:::zz::", "VEXO_MEDIA_READER=/dev/null", "LC_ALL=xx_YY.nonsense@nothing",
         "TZ=../../../etc/passwd"},
        {"HOME=/" + longText, "XDG_CACHE_HOME=/" + longText, "XDG_DATA_DIRS=/" + longText, "TZ=" + longText,
         "VEXO_PLUGIN_PATH=" + longText, "LANGUAGE=" + longText, "LC_ALL=" + longText, "PATH=" + longText},
        {"HOME=relative", "COLUMNS=99999999999999999999", "NO_COLOR=\xff",
         "DBUS_SESSION_BUS_ADDRESS=nonsense:", "LANG=\xff\xfe", "LANGUAGE=%s%n", "LC_MESSAGES=../../..",
         "TZ=\xff"},
    };
    for (const auto& settings : odd) {
        const Outcome outcome = tree(settings);
        ASSERT_EQ(outcome.status, 0) << settings[0] << outcome.errors;
        EXPECT_EQ(plugins(outcome), plugins(plain)) << settings[0];
        expectWarningsAlone(outcome);
    }
    expectNothingWritten();
}

TEST_F(EnvironmentTest, WithoutAUsableHomeItIsThatOfThePasswordDatabase) {
    const passwd* const user = getpwuid(getuid());
    if (!user)
        GTEST_SKIP() << "the user has no entry";
    for (const std::string odd : {"-uHOME", "HOME=", "HOME=relative"}) {
        const Outcome outcome = run({odd}, {"info", "--json"});
        ASSERT_EQ(outcome.status, 0) << outcome.errors;
        EXPECT_EQ(nlohmann::json::parse(outcome.output)["suitePreferences"],
                  user->pw_dir + std::string("/.config/vexo/com.vexo.suite.plist"))
            << odd;
    }
    expectNothingWritten();
}

TEST_F(EnvironmentTest, AHomeThatIsNotThereIsAnEmptyOne) {
    for (const std::string& odd : {std::string("/proc/nowhere"), elsewhere.writeFile("file"),
                                   std::string("/dev/null"), "/" + longText}) {
        const Outcome outcome = run({"HOME=" + odd}, {"tree"});
        EXPECT_EQ(outcome.status, 0) << odd.substr(0, 100);
        EXPECT_THAT(outcome.output, HasSubstr("No Reelix projects or events"));
        expectWarningsAlone(outcome);
    }
    expectNothingWritten();
}

// A zone that nobody lives in: whatever the dates become, they are some.
TEST_F(EnvironmentTest, AnyZoneWillDo) {
    for (const std::string zone : {"AAA999999999999:99:99BBB", "AAA-24BBB,J1/0,J365/25"}) {
        const Outcome outcome = tree({"TZ=" + zone});
        EXPECT_EQ(outcome.status, 0) << zone << outcome.errors;
        EXPECT_THAT(outcome.output, HasSubstr("2009-0"));
    }
}

// Each odd file in turn; the tree is that of a home without preferences.
TEST_F(EnvironmentTest, PreferencesThatAreNoneHideNothing) {
    const std::string plain = plugins(tree({}));
    const std::string name = ".config/vexo/com.vexo.suite.plist";
    const auto expectPlain = [&](const std::string& what) {
        const Outcome outcome = tree({});
        EXPECT_EQ(outcome.status, 0) << what << outcome.errors;
        EXPECT_EQ(plugins(outcome), plain) << what;
        expectWarningsAlone(outcome);
        home.remove(name);
    };
    home.makeFolder(".config/vexo");
    home.makeFifo(name);
    expectPlain("pipe");
    home.makeFolder(name);
    expectPlain("folder");
    home.makeLink(name, "/dev/zero");
    expectPlain("device");
    std::filesystem::resize_file(home.writeFile(name), 100'000'000);
    expectPlain("sparse");
    for (const char* odd :
         {"<array/>", "<dict><key>dateSortReverse</key><array><true/><string/></array></dict>"}) {
        home.writeFile(
            name, "<plist version=\"1.0\"><dict><key>Reelix</key>" + std::string(odd) + "</dict></plist>");
        expectPlain(odd);
    }
}

}  // namespace
