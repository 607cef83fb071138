#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sys/stat.h>

#include "platform/linux/DesktopEntries.h"
#include "tests/support/TemporaryFolder.h"

using namespace platform;
using namespace testing_support;
using testing::ElementsAre;
using testing::Eq;
using testing::Optional;

namespace {

std::string entryText(const std::string& keys) {
    return "[Desktop Entry]\nType=Application\nName=Test\n" + keys;
}

class DesktopEntriesTest : public testing::Test {
  protected:
    // `folder` is "home" or "system", the first of which wins.
    void add(const std::string& folder, const std::string& file, const std::string& keys) {
        folder_.writeFile(folder + "/applications/" + file, entryText(keys));
    }
    std::optional<std::string> execOf(std::string_view identifier) const {
        const auto entry = entries_.entryWithIdentifier(identifier);
        return entry ? std::optional(entry->exec) : std::nullopt;
    }
    std::optional<std::string> identifierForCreator(std::string_view code) const {
        const auto entry = entries_.entryWithCreatorCode(code);
        return entry ? std::optional(entry->identifier) : std::nullopt;
    }

    const TemporaryFolder folder_;
    const DesktopEntries entries_{{folder_.path("home"), folder_.path("system")}};
};

}  // namespace

TEST_F(DesktopEntriesTest, AnEntryIsFoundByItsIdentifier) {
    add("system", "org.example.Viewer.desktop",
        "Exec=viewer --open %U\nTryExec=/opt/viewer\nIcon=viewer\nX-Vexo-CreatorCode=view\n");
    const auto entry = entries_.entryWithIdentifier("org.example.Viewer");
    ASSERT_TRUE(entry);
    EXPECT_EQ(entry->identifier, "org.example.Viewer");
    EXPECT_EQ(entry->exec, "viewer --open %U");
    EXPECT_EQ(entry->tryExec, "/opt/viewer");
    EXPECT_EQ(entry->icon, "viewer");
    EXPECT_EQ(entry->creatorCode, "view");
    EXPECT_EQ(execOf("org.example.Other"), std::nullopt);
}

TEST_F(DesktopEntriesTest, TheFirstFolderWins) {
    add("home", "viewer.desktop", "Exec=mine\n");
    add("system", "viewer.desktop", "Exec=theirs\n");
    EXPECT_THAT(execOf("viewer"), Optional(Eq("mine")));
}

TEST_F(DesktopEntriesTest, AHiddenEntryRemovesTheOnesBehindIt) {
    add("home", "viewer.desktop", "Hidden=true\n");
    add("system", "viewer.desktop", "Exec=theirs\nX-Vexo-CreatorCode=view\n");
    EXPECT_EQ(execOf("viewer"), std::nullopt);
    EXPECT_EQ(identifierForCreator("view"), std::nullopt);
}

TEST_F(DesktopEntriesTest, EntriesThatMenusLeaveOutCount) {
    add("system", "viewer.desktop", "Exec=viewer\nNoDisplay=true\n");
    EXPECT_THAT(execOf("viewer"), Optional(Eq("viewer")));
}

TEST_F(DesktopEntriesTest, FoldersBecomePartOfTheIdentifier) {
    add("system", "suite/tools/viewer.desktop", "Exec=viewer\n");
    EXPECT_THAT(execOf("suite-tools-viewer"), Optional(Eq("viewer")));
    EXPECT_EQ(execOf("viewer"), std::nullopt);
}

TEST_F(DesktopEntriesTest, AnIdentifierIsNoPath) {
    folder_.writeFile("home/outside.desktop", entryText("Exec=outside\n"));
    add("home", "viewer.desktop", "Exec=viewer\n");
    EXPECT_EQ(execOf("../outside"), std::nullopt);
    EXPECT_EQ(execOf(""), std::nullopt);
}

TEST_F(DesktopEntriesTest, ACreatorCodeFindsTheFirstEntryThatStatesIt) {
    add("system", "a.desktop", "Exec=a\nX-Vexo-CreatorCode=view\n");
    add("home", "z.desktop", "Exec=z\nX-Vexo-CreatorCode=view\n");
    add("home", "y.desktop", "Exec=y\nX-Vexo-CreatorCode=view\n");
    EXPECT_THAT(identifierForCreator("view"), Optional(Eq("y")));
    EXPECT_EQ(identifierForCreator("none"), std::nullopt);
    EXPECT_EQ(identifierForCreator(""), std::nullopt);
}

TEST_F(DesktopEntriesTest, OnlyPlainFilesAreRead) {
    folder_.makeFifo("home/applications/fifo.desktop");
    folder_.makeFolder("home/applications/folder.desktop");
    folder_.makeLink("home/applications/dangling.desktop", folder_.path("nothing"));
    add("system", "real.desktop", "Exec=linked\nX-Vexo-CreatorCode=view\n");
    folder_.makeLink("home/applications/link.desktop", folder_.path("system/applications/real.desktop"));
    EXPECT_EQ(execOf("fifo"), std::nullopt);
    EXPECT_EQ(execOf("folder"), std::nullopt);
    EXPECT_EQ(execOf("dangling"), std::nullopt);
    EXPECT_THAT(execOf("link"), Optional(Eq("linked")));
    EXPECT_THAT(identifierForCreator("view"), Optional(Eq("link")));
}

TEST_F(DesktopEntriesTest, DamagedFilesAreNoEntries) {
    folder_.writeFile("home/applications/empty.desktop");
    folder_.writeFile("home/applications/text.desktop", "no key file at all");
    folder_.writeFile("home/applications/link.desktop",
                      "[Desktop Entry]\nType=Link\nURL=http://example.org\n");
    folder_.writeFile("home/applications/huge.desktop",
                      entryText("Exec=x\n#" + std::string(2 * 1024 * 1024, 'x')));
    for (const char* const identifier : {"empty", "text", "link", "huge"})
        EXPECT_EQ(execOf(identifier), std::nullopt) << identifier;
}

TEST_F(DesktopEntriesTest, MissingFoldersAreEmpty) {
    EXPECT_EQ(execOf("viewer"), std::nullopt);
}

// --- Programs

TEST(DesktopEntryProgram, IsWhatTheEntryTries) {
    EXPECT_THAT((DesktopEntry{"", "/bin/other", "/opt/viewer", "", ""}.programPath()),
                Optional(Eq("/opt/viewer")));
}

TEST(DesktopEntryProgram, IsElseTheFirstWordOfTheCommand) {
    EXPECT_THAT((DesktopEntry{"", "\"/opt/My Viewer/view\" --open %U", "", "", ""}.programPath()),
                Optional(Eq("/opt/My Viewer/view")));
}

TEST(DesktopEntryProgram, IsLookedForInThePath) {
    const TemporaryFolder folder;
    chmod(folder.writeFile("bin/viewer", "#!/bin/sh\n").c_str(), 0755);
    folder.writeFile("bin/not executable");
    const ScopedEnvironment path("PATH", folder.path("bin").c_str());
    EXPECT_THAT((DesktopEntry{"", "viewer %f", "", "", ""}.programPath()),
                Optional(Eq(folder.path("bin/viewer"))));
    for (const char* const command : {"gone", "'not executable'", "bin/viewer", "", "'unbalanced"})
        EXPECT_EQ((DesktopEntry{"", command, "", "", ""}.programPath()), std::nullopt) << command;
}

// --- Folders

TEST(DesktopDataFolders, AreThoseOfTheEnvironment) {
    const ScopedEnvironment home("XDG_DATA_HOME", "/home/me/data");
    const ScopedEnvironment system("XDG_DATA_DIRS", "/opt/share:relative::/usr/share");
    EXPECT_THAT(desktopDataFolders(), ElementsAre("/home/me/data", "/opt/share", "/usr/share"));
}

TEST(DesktopDataFolders, HaveDefaults) {
    const ScopedEnvironment user("HOME", "/home/me");
    const ScopedEnvironment home("XDG_DATA_HOME", nullptr);
    const ScopedEnvironment system("XDG_DATA_DIRS", "");
    EXPECT_THAT(desktopDataFolders(), ElementsAre("/home/me/.local/share", "/usr/local/share", "/usr/share"));
}

TEST(DesktopDataFolders, AreAbsolute) {
    const ScopedEnvironment user("HOME", "/home/me");
    const ScopedEnvironment home("XDG_DATA_HOME", "relative");
    const ScopedEnvironment system("XDG_DATA_DIRS", "relative::./here:");
    EXPECT_THAT(desktopDataFolders(), ElementsAre("/home/me/.local/share", "/usr/local/share", "/usr/share"));
}

TEST(DesktopDataFolders, TheUsersOwnIsOne) {
    const ScopedEnvironment home("XDG_DATA_HOME", "/home/me:/home/you");
    const ScopedEnvironment system("XDG_DATA_DIRS", "/usr/share");
    EXPECT_THAT(desktopDataFolders(), ElementsAre("/home/me:/home/you", "/usr/share"));
}
