// Menus from the command line: the real program, real applications and a real session bus.
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sys/stat.h>

#include <nlohmann/json.hpp>

#include "platform/URL.h"
#include "tests/support/DesktopBus.h"
#include "tests/support/Mailbox.h"
#include "tests/support/Program.h"
#include "tests/support/RunningProgram.h"

namespace {

using namespace testing_support;
using Json = nlohmann::json;
using testing::AllOf;
using testing::ElementsAre;
using testing::Eq;
using testing::HasSubstr;
using testing::Optional;
using testing::StartsWith;

class MenuCommand : public testing::Test {
  protected:
    MenuCommand() {
        clip_ = home_.writeFile("Movies/Reelix Events/Trip/a clip.mov", "no real movie");
        event_ = home_.path("Movies/Reelix Events/Trip");
    }

    Outcome menu(std::vector<std::string> options) const {
        std::vector<std::string> arguments{"--home", home_.path(), "menu"};
        arguments.insert(arguments.end(), options.begin(), options.end());
        return runVexo(arguments);
    }
    // That it was understood, could not be done, and was told of in one line.
    static void expectFailure(const Outcome& outcome, const std::string& reason) {
        EXPECT_EQ(outcome.status, 1);
        EXPECT_EQ(outcome.output, "");
        EXPECT_THAT(outcome.errors, AllOf(StartsWith("vexo: "), HasSubstr(reason)));
        EXPECT_TRUE(isOneLine(outcome.errors)) << outcome.errors;
    }
    static void expectSilence(const Outcome& outcome) {
        EXPECT_EQ(outcome.status, 0);
        EXPECT_EQ(outcome.output + outcome.errors, "");
    }

    // An application that writes a line into the mailbox.
    void addApplication(const std::string& identifier, const std::string& keys = "") {
        const auto program = folder_.writeFile(
            "bin/" + identifier, "#!/bin/sh\necho \"" + identifier + " $*\" > '" + mailbox_.path() + "'\n");
        chmod(program.c_str(), 0755);
        addEntry(identifier, "Exec=" + program + " %U\n" + keys);
    }
    void addEntry(const std::string& identifier, const std::string& keys) {
        folder_.writeFile("data/applications/" + identifier + ".desktop",
                          "[Desktop Entry]\nType=Application\nName=Test\n" + keys);
    }
    void addApplicationForFolders() {
        addApplication("files");
        folder_.writeFile("data/applications/mimeapps.list",
                          "[Default Applications]\ninode/directory=files.desktop\n");
    }

    TemporaryFolder home_;
    const TemporaryFolder folder_;
    std::string clip_;
    std::string event_;
    const ScopedEnvironment data_{"XDG_DATA_HOME", folder_.path("data").c_str()};
    const ScopedEnvironment system_{"XDG_DATA_DIRS", folder_.path("system").c_str()};
    const ScopedEnvironment settings_{"XDG_CONFIG_HOME", folder_.path("settings").c_str()};
    Mailbox mailbox_{folder_.path("mailbox")};
    const DesktopBus bus_{folder_.makeFolder("services")};
};

const std::string fileManager = "org.freedesktop.FileManager1";

TEST_F(MenuCommand, PrintsTheMenuOfAnItemAsJSON) {
    const Outcome outcome = menu({"--object", clip_, "--json"});
    EXPECT_EQ(outcome.status, 0) << outcome.errors;
    EXPECT_EQ(Json::parse(outcome.output), (Json{{"title", "Object Context Menu"},
                                                 {"autoenablesItems", false},
                                                 {"items",
                                                  {{{"title", "Open in Reelix"},
                                                    {"action", "contextMenuOpen:"},
                                                    {"keyEquivalent", ""},
                                                    {"enabled", true},
                                                    {"representedObject", clip_}},
                                                   {{"title", "Show in Files"},
                                                    {"action", "contextMenuReveal:"},
                                                    {"keyEquivalent", ""},
                                                    {"enabled", true},
                                                    {"representedObject", clip_}}}}}));
}

TEST_F(MenuCommand, PrintsTheMenuOfAGroupForPeople) {
    EXPECT_EQ(menu({"--group", "VXReelix"}).output, "Group Context Menu\n  1  Open Reelix\n");
    EXPECT_EQ(menu({"--group", event_}).output, "Group Context Menu\n  1  Open in Reelix\n");
}

TEST_F(MenuCommand, TakesURLsAsWellAsIDs) {
    const auto url = [](const std::string& path) {
        return platform::URL::fileURLWithPath(path).absoluteString();
    };
    const Outcome object = menu({"--object", url(clip_), "--json"});
    EXPECT_EQ(Json::parse(object.output)["items"][0]["representedObject"], clip_);
    const Outcome group = menu({"--group", url(event_), "--json"});
    EXPECT_EQ(Json::parse(group.output)["items"][0]["title"], "Open in Reelix");
}

TEST_F(MenuCommand, FindsWhatIsNoTextByItsURL) {
    home_.writeFile("Movies/Reelix Events/Trip/\xff.mov", "no real movie");
    const std::string url =
        platform::URL::fileURLWithPath(home_.path("Movies/Reelix Events/Trip/\xff.mov")).absoluteString();
    const Json items = Json::parse(menu({"--object", url, "--json"}).output)["items"];
    EXPECT_EQ(items[1]["representedObject"], home_.path("Movies/Reelix Events/Trip/\uFFFD.mov"));
}

TEST_F(MenuCommand, AnIDThatNothingHasIsStatus1) {
    expectFailure(menu({"--object", "nothing"}), "there is no item with the ID or URL 'nothing'");
    expectFailure(menu({"--group", clip_}), "there is no group with the ID or URL");
}

TEST_F(MenuCommand, WantsExactlyOneItemOrGroup) {
    for (const std::vector<std::string>& options :
         std::initializer_list<std::vector<std::string>>{{},
                                                         {"--object", clip_, "--group", event_},
                                                         {"--object", clip_, "--object", clip_},
                                                         {"--object", clip_, "--choose", "one"},
                                                         {"--object", clip_, "--choose", "1.5"},
                                                         {"--object", clip_, "--choose", ""}}) {
        const Outcome outcome = menu(options);
        EXPECT_EQ(outcome.status, 2);
        EXPECT_TRUE(isOneLine(outcome.errors)) << outcome.errors;
    }
}

TEST_F(MenuCommand, AnEntryThatTheMenuLacksIsStatus1) {
    for (const char* number : {"0", "3", "-1", "99999999999999999999"})
        expectFailure(menu({"--object", clip_, "--choose", number}), "no such entry; it has 2");
}

TEST_F(MenuCommand, OpeningLaunchesTheFirstApplicationThatIsInstalled) {
    addApplication("com.norvale.Reelix8");
    expectSilence(menu({"--object", clip_, "--choose", "1"}));
    EXPECT_THAT(mailbox_.nextLine(), Optional(Eq("com.norvale.Reelix8 ")));
    addApplication("com.norvale.ReelixApp");
    expectSilence(menu({"--group", "VXReelix", "--choose", "1"}));
    EXPECT_THAT(mailbox_.nextLine(), Optional(Eq("com.norvale.ReelixApp ")));
}

TEST_F(MenuCommand, OpeningWithoutAnApplicationIsStatus1) {
    expectFailure(menu({"--object", clip_, "--choose", "1"}), "no application for it is installed");
}

TEST_F(MenuCommand, AnApplicationThatRefusesIsStatus1) {
    const BusService application(bus_, "com.norvale.ReelixApp", BusService::Answer::error);
    addEntry("com.norvale.ReelixApp", "DBusActivatable=true\n");
    expectFailure(menu({"--object", clip_, "--choose", "1"}), "not today");
}

// The bus drops a request whose sender goes before the application is up.
TEST_F(MenuCommand, AnApplicationThatTakesItsTimeIsStillTold) {
    addApplication("com.norvale.ReelixApp", "DBusActivatable=true\n");
    folder_.writeFile("services/reelix.service",
                      "[D-BUS Service]\nName=com.norvale.ReelixApp\nExec=/bin/sh " +
                          folder_.path("bin/com.norvale.ReelixApp") + "\n");
    RunningProgram choosing(VEXO_BIN_DIR "/vexo",
                            {"--home", home_.path(), "menu", "--object", clip_, "--choose", "1"});
    EXPECT_THAT(mailbox_.nextLine(), Optional(Eq("com.norvale.ReelixApp ")));
    const BusService application(bus_, "com.norvale.ReelixApp");
    EXPECT_EQ(choosing.wait(), 0);
    EXPECT_THAT(application.calls(), ElementsAre(StartsWith("Activate ")));
}

TEST_F(MenuCommand, RevealingSelectsTheItem) {
    const BusService service(bus_, fileManager);
    expectSilence(menu({"--object", clip_, "--choose", "2"}));
    const std::string uri = platform::URL::fileURLWithPath(clip_).absoluteString();
    EXPECT_THAT(service.calls(), ElementsAre("ShowItems (['" + uri + "'], '')"));
}

TEST_F(MenuCommand, RevealingOpensTheFolderWhereNoFileManagerAnswers) {
    addApplicationForFolders();
    const std::string opened = "files " + event_;
    expectSilence(menu({"--object", clip_, "--choose", "2"}));
    EXPECT_THAT(mailbox_.nextLine(), Optional(Eq(opened)));
    {
        const BusService service(bus_, fileManager, BusService::Answer::error);
        expectSilence(menu({"--object", clip_, "--choose", "2"}));
        EXPECT_THAT(mailbox_.nextLine(), Optional(Eq(opened)));
    }
    const NoDesktopBus none;
    expectSilence(menu({"--object", clip_, "--choose", "2"}));
    EXPECT_THAT(mailbox_.nextLine(), Optional(Eq(opened)));
}

TEST_F(MenuCommand, RevealingWithoutAnyFileManagerIsStatus1) {
    expectFailure(menu({"--object", clip_, "--choose", "2"}), "install a file manager");
}

TEST_F(MenuCommand, TheLogTellsWhyAFolderIsOpenedInstead) {
    addApplicationForFolders();
    const Outcome outcome =
        runVexo({"--verbose", "--home", home_.path(), "menu", "--object", clip_, "--choose", "2"});
    EXPECT_EQ(outcome.status, 0);
    EXPECT_THAT(outcome.errors, HasSubstr("opens its folder instead"));
}

}  // namespace
