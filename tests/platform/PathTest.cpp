#include "platform/Path.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "tests/platform/StandInServices.h"

namespace platform::path {
namespace {

using testing::ElementsAre;

TEST(PathTest, TheLastComponentIsTheName) {
    EXPECT_EQ(lastComponent("/a/b.mov"), "b.mov");
    EXPECT_EQ(lastComponent("/a/b.mov/"), "b.mov");
    EXPECT_EQ(lastComponent("/a/b///"), "b");
    EXPECT_EQ(lastComponent("b"), "b");
    EXPECT_EQ(lastComponent("/b"), "b");
    EXPECT_EQ(lastComponent("/My Movies/Day 1.mov"), "Day 1.mov");
    EXPECT_EQ(lastComponent("/a/."), ".");
}

TEST(PathTest, TheRootIsItsOwnLastComponent) {
    EXPECT_EQ(lastComponent("/"), "/");
    EXPECT_EQ(lastComponent("//"), "/");
    EXPECT_EQ(lastComponent(""), "");
}

TEST(PathTest, WithoutItsLastComponentAPathIsTheFolderAbove) {
    EXPECT_EQ(withoutLastComponent("/a/b"), "/a");
    EXPECT_EQ(withoutLastComponent("/a/b/"), "/a");
    EXPECT_EQ(withoutLastComponent("/a//b"), "/a");
    EXPECT_EQ(withoutLastComponent("a/b"), "a");
    EXPECT_EQ(withoutLastComponent("/a"), "/");
    EXPECT_EQ(withoutLastComponent("//a"), "/");
    EXPECT_EQ(withoutLastComponent("a"), "");
    EXPECT_EQ(withoutLastComponent("a/"), "");
}

TEST(PathTest, NothingIsAboveTheRoot) {
    EXPECT_EQ(withoutLastComponent("/"), "/");
    EXPECT_EQ(withoutLastComponent("///"), "/");
    EXPECT_EQ(withoutLastComponent(""), "");
}

TEST(PathTest, ExactlyOneSlashJoinsTwoParts) {
    for (const char* path : {"/a", "/a/", "/a//"}) {
        for (const char* component : {"b/c", "/b/c", "b/c/", "//b/c//"})
            EXPECT_EQ(appending(path, component), "/a/b/c") << path << " " << component;
    }
    EXPECT_EQ(appending("/", "x"), "/x");
    EXPECT_EQ(appending("//", "/x"), "/x");
    EXPECT_EQ(appending("a", "b"), "a/b");
}

TEST(PathTest, AnEmptyPartAddsNothing) {
    EXPECT_EQ(appending("", "x"), "x");
    EXPECT_EQ(appending("", "/x/"), "/x");
    EXPECT_EQ(appending("", ""), "");
    EXPECT_EQ(appending("/a/", ""), "/a");
    EXPECT_EQ(appending("/a", "/"), "/a");
    EXPECT_EQ(appending("/", ""), "/");
}

TEST(PathTest, TheExtensionIsWhatFollowsTheLastDotOfTheName) {
    EXPECT_EQ(extension("x.mov"), "mov");
    EXPECT_EQ(extension("/a/x.tar.mov"), "mov");
    EXPECT_EQ(extension("/a/x.MOV/"), "MOV");
    EXPECT_EQ(extension("/a.b/c"), "");
    EXPECT_EQ(extension("x"), "");
    EXPECT_EQ(extension("..mov"), "mov");
    EXPECT_EQ(extension("/a/.hidden.mov"), "mov");
}

TEST(PathTest, AnExtensionMayHoldAnyByte) {
    EXPECT_EQ(extension("a.b c"), "b c");
    EXPECT_EQ(extension("a.\xFF\xFE"), "\xFF\xFE");
    EXPECT_EQ(extension("\xFF.mov"), "mov");
    EXPECT_EQ(withoutExtension("\xFF.b c"), "\xFF");
}

TEST(PathTest, SomeDotsMakeNoExtension) {
    for (const char* path : {"", "/", "a.", ".qnproject", "/a/.qnproject", ".", "..", "/a/..", "a.b."}) {
        EXPECT_EQ(extension(path), "") << path;
        EXPECT_EQ(withoutExtension(path), path) << path;
    }
}

TEST(PathTest, WithoutTheExtensionTheRestOfThePathStays) {
    EXPECT_EQ(withoutExtension("/a/x.tar.mov"), "/a/x.tar");
    EXPECT_EQ(withoutExtension("/a.b/x.mov/"), "/a.b/x");
    EXPECT_EQ(withoutExtension("/a.b/x"), "/a.b/x");
    EXPECT_EQ(withoutExtension("/a/x/"), "/a/x");
    EXPECT_EQ(withoutExtension("Reelix Events.localized"), "Reelix Events");
}

TEST(PathTest, AnExtensionIsAppendedToTheName) {
    EXPECT_EQ(appendingExtension("/a/b", "localized"), "/a/b.localized");
    EXPECT_EQ(appendingExtension("/a/b/", "localized"), "/a/b.localized");
    EXPECT_EQ(appendingExtension("b.mov", "part"), "b.mov.part");
    EXPECT_EQ(appendingExtension(".b", "mov"), ".b.mov");
}

TEST(PathTest, WithoutANameOrAnExtensionNothingIsAppended) {
    EXPECT_EQ(appendingExtension("/", "localized"), "/");
    EXPECT_EQ(appendingExtension("", "localized"), "");
    EXPECT_EQ(appendingExtension("/a/", ""), "/a");
}

TEST(PathTest, ComponentsLeaveSlashesOutButForTheRoot) {
    EXPECT_THAT(components("/a//b/"), ElementsAre("/", "a", "b"));
    EXPECT_THAT(components("a/b"), ElementsAre("a", "b"));
    EXPECT_THAT(components("/"), ElementsAre("/"));
    EXPECT_THAT(components("///"), ElementsAre("/"));
    EXPECT_THAT(components(""), ElementsAre());
    EXPECT_THAT(components("/a b/\xFF"), ElementsAre("/", "a b", "\xFF"));
}

TEST(PathTest, ComponentsJoinedAgainMakeThePath) {
    for (const char* path : {"/", "/a", "/a/b.mov", "a", "a/b/c"}) {
        std::string joined;
        for (const std::string& component : components(path))
            joined = appending(joined, component);
        EXPECT_EQ(joined, path);
    }
}

TEST(PathTest, ATildeIsTheHomeDirectory) {
    StandInServices services;
    services.fileManager.home = "/home/anna";
    EXPECT_EQ(expandingTilde("~"), "/home/anna");
    EXPECT_EQ(expandingTilde("~/"), "/home/anna");
    EXPECT_EQ(expandingTilde("~/Movies/x.mov"), "/home/anna/Movies/x.mov");
    services.fileManager.home = "/";
    EXPECT_EQ(expandingTilde("~/Movies"), "/Movies");
}

TEST(PathTest, OtherTildesStay) {
    StandInServices services;
    services.fileManager.home = "/home/anna";
    for (const char* path : {"~berta/Movies", "/a/~/b", "a~", "", "/"})
        EXPECT_EQ(expandingTilde(path), path);
}

TEST(PathTest, WithoutAHomeATildeStays) {
    StandInServices services;
    EXPECT_EQ(expandingTilde("~/Movies"), "~/Movies");
    services.fileManager.home = "";
    EXPECT_EQ(expandingTilde("~/Movies"), "~/Movies");
}

}  // namespace
}  // namespace platform::path
