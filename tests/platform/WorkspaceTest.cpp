#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sys/stat.h>

#include "platform/linux/IconLookup.h"
#include "platform/linux/LinuxFileManager.h"
#include "platform/linux/LinuxWorkspace.h"
#include "tests/platform/CollectedLog.h"
#include "tests/platform/StandInServices.h"
#include "tests/support/FakeMountTable.h"
#include "tests/support/FakeWorkspace.h"
#include "tests/support/TemporaryFolder.h"

using namespace platform;
using namespace testing_support;
using testing::ElementsAre;
using testing::Eq;
using testing::Optional;

namespace {

class LinuxWorkspaceTest : public testing::Test {
  protected:
    void addEntry(const std::string& identifier, const std::string& keys) {
        folder_.writeFile("data/applications/" + identifier + ".desktop",
                          "[Desktop Entry]\nType=Application\nName=Test\n" + keys);
    }
    std::string addProgram(const std::string& name) {
        const auto path = folder_.writeFile("bin/" + name, "#!/bin/sh\n");
        chmod(path.c_str(), 0755);
        return path;
    }

    const TemporaryFolder folder_;
    const ScopedEnvironment home_{"XDG_DATA_HOME", folder_.path("data").c_str()};
    const ScopedEnvironment system_{"XDG_DATA_DIRS", folder_.path("system").c_str()};
    const ScopedEnvironment path_{"PATH", folder_.path("bin").c_str()};
    FakeMountTable mounts_;
    CollectedLog log_;
    const LinuxWorkspace workspace_{mounts_, log_};
};

const std::string emptyVector = R"(<svg xmlns="http://www.w3.org/2000/svg" width="8" height="8"/>)";

}  // namespace

TEST_F(LinuxWorkspaceTest, VolumesAndMediaAreThoseOfTheMountTable) {
    mounts_.list = {{"/", "/dev/sda1", "ext4", "File System", false},
                    {"/media/card", "/dev/sdb1", "vfat", "CARD", true}};
    EXPECT_THAT(workspace_.mountedLocalVolumePaths(), ElementsAre("/", "/media/card"));
    EXPECT_THAT(workspace_.mountedRemovableMedia(), ElementsAre("/media/card"));
}

TEST_F(LinuxWorkspaceTest, AnApplicationIsFoundByItsCreatorCode) {
    addEntry("org.example.Viewer", "Exec=viewer %U\nIcon=viewer\nX-Vexo-CreatorCode=view\n");
    const auto program = addProgram("viewer");
    const auto application = workspace_.applicationForCreator("view");
    ASSERT_TRUE(application);
    EXPECT_EQ(application->identifier, "org.example.Viewer");
    EXPECT_EQ(application->icon, "viewer");
    EXPECT_EQ(application->url, URL::fileURLWithPath(program));
    EXPECT_EQ(workspace_.applicationForCreator("none"), std::nullopt);
}

TEST_F(LinuxWorkspaceTest, ReelixAppIsFoundByItsIdentifierWhereNoEntryStatesItsCode) {
    addEntry("com.norvale.ReelixApp", "Exec=reelix\n");
    EXPECT_EQ(workspace_.applicationForCreator("rlxm")->identifier, "com.norvale.ReelixApp");
    EXPECT_EQ(workspace_.applicationForCreator("view"), std::nullopt);
    addEntry("org.example.Reelix", "Exec=other\nX-Vexo-CreatorCode=rlxm\n");
    EXPECT_EQ(workspace_.applicationForCreator("rlxm")->identifier, "org.example.Reelix");
}

TEST_F(LinuxWorkspaceTest, AnApplicationWhoseProgramIsGoneIsStillKnown) {
    addEntry("com.norvale.ReelixApp", "Exec=reelix\n");
    const auto nowhere = workspace_.applicationForCreator("rlxm");
    ASSERT_TRUE(nowhere);
    EXPECT_EQ(nowhere->url, std::nullopt);
    EXPECT_EQ(workspace_.absolutePathForAppBundleWithIdentifier("com.norvale.ReelixApp"), "");

    addEntry("com.norvale.ReelixApp", "Exec=" + folder_.path("removed") + "\n");
    EXPECT_EQ(workspace_.applicationForCreator("rlxm")->url, URL::fileURLWithPath(folder_.path("removed")));
    EXPECT_EQ(workspace_.absolutePathForAppBundleWithIdentifier("com.norvale.ReelixApp"), "");
}

TEST_F(LinuxWorkspaceTest, TheBundlePathIsTheProgram) {
    addEntry("com.norvale.ReelixApp", "Exec=reelix\n");
    const auto program = addProgram("reelix");
    EXPECT_EQ(workspace_.absolutePathForAppBundleWithIdentifier("com.norvale.ReelixApp"), program);
    EXPECT_EQ(workspace_.absolutePathForAppBundleWithIdentifier("com.norvale.Other"), "");
}

TEST_F(LinuxWorkspaceTest, TheIconIsThePictureThatTheEntryNames) {
    folder_.writeFile("data/icons/hicolor/scalable/apps/viewer.svg", emptyVector);
    CollectedLog log;
    LinuxFileManager files(std::nullopt, mounts_, log, [](std::string_view) { return false; });
    StandInServices others;
    const ServicesScope scope(Services{files, others.workspace, others.userDefaults, others.dispatcher,
                                       others.notificationCenter, log});
    const auto icon = workspace_.iconForApplication({"org.example.Viewer", std::nullopt, "viewer"});
    ASSERT_TRUE(icon);
    EXPECT_EQ(icon->name(), "viewer");
    EXPECT_TRUE(icon->isValid());
    EXPECT_EQ(workspace_.iconForApplication({"org.example.Viewer", std::nullopt, "unheard-of"}), nullptr);
    EXPECT_EQ(workspace_.iconForApplication({"org.example.Viewer", std::nullopt, ""}), nullptr);
}

// --- Where icons are

TEST(IconLookup, ScalablePicturesComeBeforeLargeOnesBeforeSmallOnes) {
    const TemporaryFolder folder;
    const auto lookUp = [&] { return pathOfIcon("viewer", {folder.path("home"), folder.path("system")}); };
    EXPECT_EQ(lookUp(), std::nullopt);
    for (const char* const file :
         {"system/pixmaps/viewer.png", "system/icons/hicolor/16x16/apps/viewer.png",
          "system/icons/hicolor/256x256/apps/viewer.png", "system/icons/hicolor/scalable/apps/viewer.svg",
          "home/icons/hicolor/48x48/apps/viewer.png"}) {
        folder.writeFile(file);
        EXPECT_THAT(lookUp(), Optional(Eq(folder.path(file))));
    }
}

TEST(IconLookup, APathIsTakenAsItIs) {
    const TemporaryFolder folder;
    EXPECT_THAT(pathOfIcon(folder.writeFile("own.png"), {}), Optional(Eq(folder.path("own.png"))));
    EXPECT_EQ(pathOfIcon(folder.path("gone.png"), {}), std::nullopt);
    EXPECT_EQ(pathOfIcon(folder.makeFifo("fifo.png"), {}), std::nullopt);
}

TEST(IconLookup, ANameIsNoPath) {
    const TemporaryFolder folder;
    folder.writeFile("outside.png");
    folder.makeFolder("data/pixmaps");
    EXPECT_EQ(pathOfIcon("../../outside", {folder.path("data")}), std::nullopt);
}

TEST(IconLookup, AnExtensionInTheNameIsForgiven) {
    const TemporaryFolder folder;
    folder.writeFile("data/pixmaps/viewer.png");
    EXPECT_THAT(pathOfIcon("viewer.png", {folder.path("data")}),
                Optional(Eq(folder.path("data/pixmaps/viewer.png"))));
}

// --- The tests' own workspace

TEST(FakeWorkspace, AnswersWhatWasSetAndCountsTheQuestions) {
    FakeWorkspace workspace;
    workspace.setApplicationForCreator("rlxm", {"com.norvale.ReelixApp", std::nullopt, "reelix"});
    workspace.setPathForIdentifier("com.norvale.ReelixApp", "/opt/reelix");
    EXPECT_EQ(workspace.applicationForCreator("rlxm")->icon, "reelix");
    workspace.removeApplicationForCreator("rlxm");
    EXPECT_EQ(workspace.applicationForCreator("rlxm"), std::nullopt);
    EXPECT_EQ(workspace.absolutePathForAppBundleWithIdentifier("com.norvale.ReelixApp"), "/opt/reelix");
    EXPECT_EQ(workspace.absolutePathForAppBundleWithIdentifier("com.norvale.Other"), "");
    EXPECT_EQ(workspace.creatorLookups(), 2);
    EXPECT_EQ(workspace.identifierLookups(), 2);
}

TEST(FakeWorkspace, PostsTheMountsThatATestMakes) {
    FakeWorkspace workspace;
    std::vector<std::string> posted;
    const auto observer = std::make_shared<int>();
    workspace.notificationCenter().addObserver(
        observer, NSWorkspaceDidMountNotification, [&](const Notification& notification) {
            posted.push_back(*find(notification.userInfo, "NSDevicePath")->string());
        });
    workspace.mount("/media/card");
    EXPECT_THAT(posted, ElementsAre("/media/card"));
    EXPECT_THAT(workspace.mountedLocalVolumePaths(), ElementsAre("/", "/media/card"));
}
