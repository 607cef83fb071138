// Preferences that anything but a program that knows them wrote: each counts as no preferences, and a line of
// the log says so.
#include <gmock/gmock.h>
#include <sys/socket.h>
#include <sys/stat.h>
#include <sys/un.h>

#include <cstring>
#include <filesystem>

#include "platform/PropertyList.h"
#include "platform/linux/FileDescriptor.h"
#include "platform/linux/LinuxUserDefaults.h"
#include "tests/platform/CollectedLog.h"
#include "tests/platform/FileBytes.h"
#include "tests/support/OrdinaryUser.h"
#include "tests/support/TemporaryFolder.h"

namespace platform {
namespace {

using testing::AllOf;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;
using testing_support::repeated;

class PreferencesFileTest : public testing::Test {
  protected:
    std::optional<Dictionary> preferences() {
        defaults.synchronize();
        return defaults.persistentDomainForName("odd");
    }
    // That the file which is there now is none, and that this is said once.
    void expectNone(const std::string& what) {
        const std::size_t before = log.lines().size();
        EXPECT_EQ(preferences(), std::nullopt) << what;
        EXPECT_EQ(defaults.persistentDomainForName("odd"), std::nullopt) << what;
        ASSERT_EQ(log.lines().size(), before + 1) << what;
        EXPECT_THAT(log.lines().back(), AllOf(HasSubstr("cannot read the preferences"), HasSubstr(file)));
        std::filesystem::remove_all(file);
    }
    void expectNoneIn(std::string_view content) {
        folder.writeFile("odd.plist", content);
        expectNone(std::string(content.substr(0, 100)));
    }
    void makeSocket() const {
        sockaddr_un address{AF_UNIX, {}};
        file.copy(address.sun_path, sizeof address.sun_path - 1);
        const FileDescriptor opened(socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0));
        ASSERT_EQ(bind(opened.number(), reinterpret_cast<const sockaddr*>(&address), sizeof address), 0);
    }

    const testing_support::TemporaryFolder folder;
    const std::string file = folder.path("odd.plist");
    CollectedLog log;
    LinuxUserDefaults defaults{folder.path(), "odd", &log};
};

std::string propertyList(const std::string& content) {
    return "<plist version=\"1.0\">" + content + "</plist>";
}

TEST_F(PreferencesFileTest, WhatIsNoPlainFileIsNeitherWaitedForNorRead) {
    folder.makeFifo("odd.plist");
    expectNone("pipe");
    folder.makeFolder("odd.plist");
    expectNone("folder");
    makeSocket();
    expectNone("socket");
    for (const char* target : {"/dev/zero", "/dev/full", "odd.plist", "/proc/self/mem"}) {
        folder.makeLink("odd.plist", target);
        expectNone(target);
    }
}

TEST_F(PreferencesFileTest, AFileOfAHundredMegabytesOfNothingIsNotRead) {
    folder.writeFile("odd.plist");
    std::filesystem::resize_file(file, 100'000'000);
    expectNone("sparse");
}

TEST_F(PreferencesFileTest, ALinkToNothingIsNoFile) {
    folder.makeLink("odd.plist", "missing");
    EXPECT_EQ(preferences(), std::nullopt);
    EXPECT_THAT(log.lines(), IsEmpty());
}

TEST_F(PreferencesFileTest, OneThatMayNotBeReadIsNone) {
    folder.writeFile("odd.plist", propertyList("<dict/>"));
    chmod(file.c_str(), 0);
    const testing_support::OrdinaryUser user(folder.path());
    expectNone("forbidden");
}

TEST_F(PreferencesFileTest, WhatIsNoDictionaryIsNone) {
    using namespace std::string_view_literals;
    for (const std::string_view content :
         {""sv, "\0\0\0\0"sv, "bplist00"sv, "bplist00\xff\xff\xff\xff"sv, "<"sv, "\xff\xfe<\0"sv,
          "<plist version=\"1.0\"><dict>"sv, "<plist version=\"1.0\"><dict><key>a</key></dict></plist>"sv})
        expectNoneIn(content);
    for (const std::string value : {"<array><dict/></array>", "<string>a</string>", "<true/>", "<data/>"})
        expectNoneIn(propertyList(value));
}

TEST_F(PreferencesFileTest, NestingWithoutAnEndIsNone) {
    expectNoneIn(propertyList(repeated("<dict><key>a</key>", 100'000) + repeated("</dict>", 100'000)));
    expectNoneIn(propertyList("<dict><key>a</key>" + repeated("<array>", 2000) + repeated("</array>", 2000) +
                              "</dict>"));
    expectNoneIn("<!DOCTYPE plist [<!ENTITY a \"aaaaaaaaaa\"><!ENTITY b \"&a;&a;&a;&a;&a;&a;&a;&a;\">]>" +
                 propertyList("<dict><key>a</key><string>&b;</string></dict>"));
}

TEST_F(PreferencesFileTest, ListsMayMixWhateverTheyLike) {
    folder.writeFile("odd.plist",
                     propertyList("<dict><key>mixed</key><array><string/><integer>1</integer><dict/>"
                                  "<array><true/></array><data>AA==</data></array>"
                                  "<key></key><string></string></dict>"));
    const auto dictionary = preferences();
    ASSERT_TRUE(dictionary);
    ASSERT_NE(find(*dictionary, "mixed"), nullptr);
    EXPECT_EQ(find(*dictionary, "mixed")->array()->size(), 5u);
    EXPECT_NE(find(*dictionary, ""), nullptr);
    EXPECT_THAT(log.lines(), IsEmpty());
}

// A name in a binary file is counted, not ended, so it may hold anything.
TEST_F(PreferencesFileTest, KeysMayHoldAnyBytesAndAreOthers) {
    using namespace std::string_literals;
    const Data binary = dataWithPropertyList(
        Dictionary{{"key\0more"s, Value("odd")}, {"key", Value("plain")}}, PropertyListFormat::binary);
    folder.writeFile("odd.plist", {reinterpret_cast<const char*>(binary.data()), binary.size()});
    EXPECT_EQ(defaults.objectForKey("key"), Value("plain"));
    EXPECT_EQ(defaults.objectForKey("key\0more"s), Value("odd"));
}

TEST_F(PreferencesFileTest, AFolderThatIsNoneHoldsNoPreferences) {
    for (const std::string& odd : {std::string(), std::string("relative"), std::string("/dev/null"),
                                   std::string(5000, 'x'), std::string("/proc/self/fd")}) {
        LinuxUserDefaults none(odd, "odd", nullptr);
        EXPECT_EQ(none.persistentDomainForName("odd"), std::nullopt) << odd;
    }
}

}  // namespace
}  // namespace platform
