// The command line as scripts meet it: the real program, its output and its exit status.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <nlohmann/json.hpp>

#include "tests/support/Program.h"
#include "tests/support/SampleMovie.h"
#include "tests/support/TemporaryFolder.h"

namespace {

using Json = nlohmann::json;
using testing::AllOf;
using testing::EndsWith;
using testing::HasSubstr;
using testing::Not;
using testing::StartsWith;
using testing_support::isOneLine;
using testing_support::Outcome;
using testing_support::runVexo;
using testing_support::TemporaryFolder;

class CommandLineTest : public testing::Test {
  protected:
    Json treeOf(const TemporaryFolder& folder, std::vector<std::string> options = {}) {
        std::vector<std::string> arguments{"--home", folder.path(), "tree", "--json"};
        arguments.insert(arguments.end(), options.begin(), options.end());
        const Outcome outcome = runVexo(arguments);
        EXPECT_EQ(outcome.status, 0) << outcome.errors;
        errors = outcome.errors;
        return Json::parse(outcome.output);
    }
    static const Json& root(const Json& document) { return document["plugins"][0]["root"]; }

    TemporaryFolder home;
    std::string errors;
};

struct WrongLine {
    std::vector<std::string> arguments;
    std::string message;
};

TEST_F(CommandLineTest, AWrongLineIsOneMessageAndStatus2) {
    const WrongLine lines[] = {
        {{}, "no command was given"},
        {{"nosuch"}, "'nosuch' is no option or command"},
        {{"tree", "--nosuch"}, "'--nosuch' is no option or command"},
        {{"tree", "--depth", "x"}, "'x' is no whole number"},
        {{"tree", "--depth", "-1"}, "'-1' is no whole number"},
        {{"--quiet", "--verbose", "tree"}, "--quiet excludes --verbose"},
        {{"demo"}, "DIR is required"},
    };
    for (const WrongLine& line : lines) {
        const Outcome outcome = runVexo(line.arguments);
        EXPECT_EQ(outcome.status, 2) << line.message;
        EXPECT_THAT(outcome.errors, AllOf(StartsWith("vexo: "), HasSubstr(line.message)));
        EXPECT_TRUE(isOneLine(outcome.errors)) << outcome.errors;
        EXPECT_EQ(outcome.output, "");
    }
}

TEST_F(CommandLineTest, AHomeThatIsNotThereIsStatus1) {
    const Outcome outcome = runVexo({"--home", home.path("missing"), "tree"});
    EXPECT_EQ(outcome.status, 1);
    EXPECT_THAT(outcome.errors, StartsWith("vexo: there is no home folder"));
    EXPECT_TRUE(isOneLine(outcome.errors));
}

TEST_F(CommandLineTest, APluginThatIsNotThereIsStatus1) {
    const Outcome outcome = runVexo({"--plugin", home.path("missing\n.vxplugin"), "tree"});
    EXPECT_EQ(outcome.status, 1);
    EXPECT_THAT(outcome.errors, HasSubstr("is no usable plug-in"));
    EXPECT_TRUE(isOneLine(outcome.errors));
}

TEST_F(CommandLineTest, HelpAndVersionAreAnswersOnStandardOutput) {
    for (const char* option : {"--help", "--version"}) {
        const Outcome outcome = runVexo({option});
        EXPECT_EQ(outcome.status, 0);
        EXPECT_THAT(outcome.output, HasSubstr("vexo"));
        EXPECT_EQ(outcome.errors, "");
    }
}

TEST_F(CommandLineTest, GlobalOptionsMayFollowTheCommand) {
    EXPECT_EQ(runVexo({"tree", "--home", home.path()}).status, 0);
}

TEST_F(CommandLineTest, AnEmptyHomeIsNoError) {
    const Outcome outcome = runVexo({"--home", home.path(), "tree"});
    EXPECT_EQ(outcome.status, 0);
    EXPECT_THAT(outcome.output, HasSubstr("No Reelix projects or events"));
    EXPECT_EQ(outcome.errors, "");
}

TEST_F(CommandLineTest, TheDocumentOfAnEmptyHomeHasAllItsFields) {
    const Json document = treeOf(home);
    const Json& plugin = document["plugins"][0];
    EXPECT_EQ(plugin["title"], "Reelix");
    EXPECT_EQ(plugin["uniqueID"], "Reelix Media Manager");
    EXPECT_EQ(plugin["mediaTypesSupported"], 4);
    EXPECT_EQ(plugin["managedMediaSource"], false);
    EXPECT_EQ(plugin["version"], 507.3);
    EXPECT_EQ(plugin["canLoadData"], false);
    EXPECT_EQ(plugin["appInstalled"], false);
    EXPECT_TRUE(plugin["defaultNoDataMessage"].is_string());
    EXPECT_EQ(plugin["root"]["id"], "VXReelix");
    EXPECT_EQ(plugin["root"]["type"], "VXReelixRootGroupTypeIdentifier");
    EXPECT_EQ(plugin["root"]["parentID"], nullptr);
    EXPECT_EQ(plugin["root"]["icon"],
              (Json{{"name", "MBReelixAppIconSmall"}, {"width", 16}, {"height", 16}, {"image", 1}}));
    EXPECT_EQ(plugin["root"]["childGroups"], Json::array());
    EXPECT_EQ(document["warnings"], Json::array());
}

TEST_F(CommandLineTest, TheWidestMovieStandsForAProject) {
    using testing_support::makeSampleMovie;
    const std::string movies = home.makeFolder("Movies/Reelix Projects/Film.qnproject/Movies");
    makeSampleMovie(movies + "/small.mov", {.size = "320x240", .seconds = 1});
    makeSampleMovie(movies + "/large.mov", {.size = "640x360", .seconds = 2});

    const Json document = treeOf(home, {"--metadata"});
    ASSERT_EQ(root(document)["mediaObjects"].size(), 1u);
    const Json& representative = root(document)["mediaObjects"][0];
    EXPECT_EQ(representative["name"], "Film");
    EXPECT_EQ(representative["id"], movies + "/large.mov");
    EXPECT_EQ(representative["mediaType"], 3);
    EXPECT_EQ(representative["mediaSourceType"], 2);
    EXPECT_EQ(representative["attributes"]["VXMediaObjectResolutionStringKey"], "{640, 360}");
    EXPECT_EQ(representative["attributes"]["VXReelixProjectRepresentative"], true);
    EXPECT_EQ(representative["duration"], 2.0);
    EXPECT_EQ(representative["resolution"], "{640, 360}");
    EXPECT_EQ(representative["metadata"]["kMDItemPixelHeight"], 360);
}

TEST_F(CommandLineTest, AMediaReaderThatIsNotThereIsWarnedOf) {
    home.writeFile("Movies/Reelix Events/Trip/a.mov", "no real movie");
    home.writeFile("Movies/Reelix Events/Trip/b.mov", "no real movie");
    const testing_support::ScopedEnvironment reader("VEXO_MEDIA_READER", "/nowhere/reader");
    const Outcome outcome = runVexo({"--home", home.path(), "tree", "--metadata"});
    EXPECT_EQ(outcome.status, 0);
    EXPECT_EQ(outcome.errors, "vexo: warning: cannot start /nowhere/reader: No such file or directory\n");
}

TEST_F(CommandLineTest, OneMovieThatIsNoneMakesTheLargestFileStandForAProject) {
    const std::string movies = home.makeFolder("Movies/Reelix Projects/Film.qnproject/Movies");
    testing_support::makeSampleMovie(movies + "/real.mov", {.size = "320x240", .seconds = 1});
    const std::string noMovie =
        home.writeFile("Movies/Reelix Projects/Film.qnproject/Movies/none.mov", std::string(1 << 20, 'x'));
    EXPECT_EQ(root(treeOf(home))["mediaObjects"][0]["id"], noMovie);
}

TEST_F(CommandLineTest, ItemsAndImagesAreNumberedByIdentity) {
    home.writeFile("Movies/Reelix Events/Beach/a.mov");
    const Json document = treeOf(home);
    const Json& library = root(document)["childGroups"][0];
    const Json& event = library["childGroups"][0]["childGroups"][0];
    EXPECT_EQ(event["mediaObjects"][0]["object"], root(document)["mediaObjects"][0]["object"]);
    EXPECT_EQ(event["icon"]["image"], library["icon"]["image"]);
    EXPECT_NE(event["icon"]["image"], library["childGroups"][0]["icon"]["image"]);
}

TEST_F(CommandLineTest, ClipsOfAllEventsHaveOneImage) {
    home.writeFile("Movies/Reelix Events/Beach/a.mov");
    home.writeFile("Movies/Reelix Events/Party/b.mov");
    const Json document = treeOf(home);
    const Json& clips = root(document)["mediaObjects"];
    ASSERT_EQ(clips.size(), 2u);
    EXPECT_EQ(clips[0]["icon"]["image"], clips[1]["icon"]["image"]);
    EXPECT_EQ(clips[0]["icon"]["image"], root(document)["icon"]["image"]);
}

TEST_F(CommandLineTest, BytesThatAreNotUTF8AreReplacedInTextAndExactInTheURL) {
    home.writeFile("Movies/Reelix Events/Beach/a\xff.mov");
    const Json document = treeOf(home);
    const Json& item = root(document)["mediaObjects"][0];
    EXPECT_THAT(item["path"].get<std::string>(), EndsWith("/a\uFFFD.mov"));
    EXPECT_THAT(item["url"].get<std::string>(), EndsWith("/a%FF.mov"));
}

TEST_F(CommandLineTest, DepthLimitsTheLevelsBelowTheRoot) {
    home.writeFile("Movies/Reelix Events/Beach/a.mov");
    const Json rootAlone = treeOf(home, {"--depth", "0"});
    EXPECT_EQ(root(rootAlone)["childGroups"], Json::array());
    const Json oneLevel = treeOf(home, {"--depth", "1"});
    ASSERT_EQ(root(oneLevel)["childGroups"].size(), 1u);
    EXPECT_EQ(root(oneLevel)["childGroups"][0]["childGroups"], Json::array());
}

TEST_F(CommandLineTest, ABrokenDocumentIsAWarningAndTheRestIsThere) {
    home.makeFolder("Movies/Reelix Projects/Good.qnproject");
    const std::string broken =
        home.writeFile("Movies/Reelix Projects/Broken.qnproject/Project", "bplist00 broken");
    home.writeFile("Movies/Reelix Events/Beach/a.mov");

    const Json document = treeOf(home);
    EXPECT_EQ(root(document)["childGroups"].size(), 3u);
    ASSERT_EQ(document["warnings"].size(), 1u);
    EXPECT_THAT(document["warnings"][0].get<std::string>(), StartsWith(broken));
    EXPECT_THAT(errors, StartsWith("vexo: warning: "));
    EXPECT_TRUE(isOneLine(errors)) << errors;
}

TEST_F(CommandLineTest, QuietLeavesWarningsOut) {
    home.writeFile("Movies/Reelix Projects/Broken.qnproject/Project", "bplist00 broken");
    EXPECT_EQ(runVexo({"--quiet", "--home", home.path(), "tree"}).errors, "");
}

TEST_F(CommandLineTest, AFolderThatCannotBeReadIsOneWarning) {
    const std::string file = home.writeFile("Movies/Reelix Projects", "a file where a folder should be");
    const testing_support::ScopedEnvironment english("LC_ALL", "C");
    EXPECT_EQ(runVexo({"--home", home.path(), "tree"}).errors,
              "vexo: warning: cannot list " + file + ": Not a directory\n");
}

TEST_F(CommandLineTest, TheTextNeverCarriesControlCharactersOfNames) {
    home.writeFile("Movies/Reelix Events/Be\033[31mach\n/a\r.mov");
    const Outcome outcome = runVexo({"--home", home.path(), "tree"});
    EXPECT_THAT(outcome.output, AllOf(HasSubstr("Be␛[31mach␊"), HasSubstr("a␍"), Not(HasSubstr("\033")),
                                      Not(HasSubstr("\r"))));
}

TEST_F(CommandLineTest, TheOrderOfEventsFollowsThePreferencesOfTheHome) {
    home.writeFile("Movies/Reelix Events/Old/clip-2007-01-01 10;00;00.mov");
    home.writeFile("Movies/Reelix Events/New/clip-2009-01-01 10;00;00.mov");
    const auto years = [this] {
        const Json document = treeOf(home);
        std::vector<std::string> names;
        for (const Json& year : root(document)["childGroups"][0]["childGroups"])
            names.push_back(year["name"]);
        return names;
    };
    EXPECT_EQ(years(), (std::vector<std::string>{"2009", "2007"}));
    home.writeFile(".config/vexo/com.vexo.suite.plist",
                   "<?xml version=\"1.0\"?><plist version=\"1.0\"><dict><key>Reelix</key><dict>"
                   "<key>dateSortReverse</key><false/></dict></dict></plist>");
    EXPECT_EQ(years(), (std::vector<std::string>{"2007", "2009"}));
}

TEST_F(CommandLineTest, InfoTellsThePluginsIdentityAndTheFilesInUse) {
    const Json document = Json::parse(runVexo({"--home", home.path(), "info", "--json"}).output);
    const Json& plugin = document["plugins"][0];
    EXPECT_EQ(plugin["identifier"], "com.vexo.plugin.reelix");
    EXPECT_EQ(plugin["bundle"], REELIX_BUNDLE_DIR);
    EXPECT_EQ(plugin["versionString"], "@(#)PROGRAM:Reelix  PROJECT:Vexo-507.3\n");
    EXPECT_EQ(plugin["supportedPasteboardTypes"], Json::parse(R"([["VXReelixProjectsPboardType"]])"));
    EXPECT_EQ(document["suitePreferences"], home.path(".config/vexo/com.vexo.suite.plist"));
    EXPECT_THAT(document["userDefaults"].get<std::string>(), StartsWith(home.path(".config/vexo/")));
    EXPECT_THAT(document["index"].get<std::string>(), EndsWith("/vexo/metadata.sqlite"));
}

TEST_F(CommandLineTest, LocationsAreListedInTheOrderInWhichTheyAreLookedAt) {
    home.makeFolder("Movies/Reelix Projects");
    const Json document = Json::parse(runVexo({"--home", home.path(), "locations", "--json"}).output);
    EXPECT_EQ(document["projects"][0]["path"], home.path("Movies/Reelix Projects"));
    EXPECT_EQ(document["projects"][0]["exists"], true);
    EXPECT_EQ(document["projects"][0]["watched"], true);
    EXPECT_EQ(document["projects"][0]["resolvedPath"], home.path("Movies/Reelix Projects"));
    EXPECT_EQ(document["events"][0]["path"], home.path("Movies/Reelix Events"));
    EXPECT_EQ(document["events"][0]["exists"], false);
    EXPECT_EQ(document["events"][1]["path"], home.path("Movies/Reelix Events.localized"));
    EXPECT_TRUE(document["watchLimits"].is_object());
    EXPECT_EQ(document["suitePreferences"], home.path(".config/vexo/com.vexo.suite.plist"));
}

TEST_F(CommandLineTest, NothingIsWrittenIntoTheHomeThatIsBrowsed) {
    home.writeFile("Movies/Reelix Events/Beach/a.mov");
    home.makeFolder("Movies/Reelix Projects/Film.qnproject/Movies");
    const auto filesIn = [this] {
        const Outcome found = testing_support::runProgram("find", {home.path(), "-printf", "%p %T@ %C@\n"});
        return found.output;
    };
    const std::string before = filesIn();
    EXPECT_EQ(runVexo({"--home", home.path(), "tree", "--metadata"}).status, 0);
    EXPECT_EQ(filesIn(), before);
}

TEST_F(CommandLineTest, AnAnswerThatCannotBeWrittenIsStatus1) {
    const Outcome outcome = testing_support::runProgram(
        "sh", {"-c", VEXO_BIN_DIR "/vexo --home '" + home.path() + "' tree > /dev/full"});
    EXPECT_EQ(outcome.status, 1);
    EXPECT_THAT(outcome.errors, HasSubstr("cannot be written"));
}

}  // namespace
