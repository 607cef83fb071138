#include "framework/queries/ScopeWalk.h"

#include <algorithm>

#include "tests/queries/QueriesTest.h"
#include "tests/support/ForwardingFiles.h"

using namespace testing_support;
using namespace vexo;
using testing::ElementsAre;
using testing::IsEmpty;

namespace {

class ScopeWalk : public QueriesTest {
  protected:
    // The paths below the home, relative to it and sorted.
    std::vector<std::string> itemsBelow(const std::string& folder) {
        std::vector<std::string> paths;
        visitItemsBelow(folder, cancelled_, [&](const std::string& path) {
            EXPECT_TRUE(path.starts_with(home().path() + "/")) << path;
            paths.push_back(path.substr(home().path().size() + 1));
        });
        std::sort(paths.begin(), paths.end());
        return paths;
    }

    std::atomic<bool> cancelled_ = false;
};

TEST_F(ScopeWalk, FindsFilesFoldersAndPackagesAtAnyDepth) {
    home().writeFile("a.mov");
    home().writeFile("Folder/Inner/b.mov");
    home().makeFolder("Folder/Empty");
    home().writeFile("Folder/Beach.qnproject/movie.mov");
    EXPECT_THAT(itemsBelow(home().path()), ElementsAre("Folder", "Folder/Beach.qnproject", "Folder/Empty",
                                                       "Folder/Inner", "Folder/Inner/b.mov", "a.mov"));
}

TEST_F(ScopeWalk, HiddenItemsAndWhatIsInThemAreNone) {
    home().writeFile(".hidden", "listed\n");
    home().writeFile(".dot/a.mov");
    home().writeFile("listed/b.mov");
    home().writeFile("seen/c.mov");
    EXPECT_THAT(itemsBelow(home().path()), ElementsAre("seen", "seen/c.mov"));
}

TEST_F(ScopeWalk, LinksAreItemsThatAreNotEntered) {
    home().writeFile("Target/a.mov");
    home().makeLink("Folder/circle", home().path("Folder"));
    home().makeLink("Folder/link", home().path("Target"));
    EXPECT_THAT(itemsBelow(home().path("Folder")), ElementsAre("Folder/circle", "Folder/link"));
}

TEST_F(ScopeWalk, WhereItBeginsMayBeALinkOrHiddenOrAPackage) {
    home().writeFile("Beach.qnproject/a.mov");
    home().writeFile(".dot/b.mov");
    home().makeLink("link", home().path(".dot"));
    EXPECT_THAT(itemsBelow(home().path("Beach.qnproject")), ElementsAre("Beach.qnproject/a.mov"));
    EXPECT_THAT(itemsBelow(home().path(".dot")), ElementsAre(".dot/b.mov"));
    EXPECT_THAT(itemsBelow(home().path("link")), ElementsAre("link/b.mov"));
}

TEST_F(ScopeWalk, MissingAndUnreadableFoldersHoldNothing) {
    EXPECT_THAT(itemsBelow(home().path("missing")), IsEmpty());
    EXPECT_THAT(itemsBelow(home().writeFile("file")), IsEmpty());

    home().writeFile("Folder/b.mov");
    ForwardingFiles files(host_);
    const platform::ServicesScope scope(servicesWith(files, host_));
    files.flags[home().path("file")] = platform::itemIsContainer;  // but it can't be listed
    EXPECT_THAT(itemsBelow(home().path()), ElementsAre("Folder", "Folder/b.mov", "file"));
}

TEST_F(ScopeWalk, NamesMayHoldAnyBytes) {
    home().writeFile("a\nb\xff.mov");
    EXPECT_THAT(itemsBelow(home().path()), ElementsAre("a\nb\xff.mov"));
}

TEST_F(ScopeWalk, ATreeMayBeDeep) {
    std::string deepest = "d";
    while (home().path(deepest).size() < 2000)
        deepest += "/d";
    home().makeFolder(deepest);
    const auto items = itemsBelow(home().path());
    EXPECT_EQ(items.size(), (deepest.size() + 1) / 2);
    EXPECT_EQ(items.back(), deepest);
}

TEST_F(ScopeWalk, ACancelStopsItBeforeTheNextItem) {
    for (const char* name : {"a", "b", "c/d", "e/f"})
        home().writeFile(name);
    int visited = 0;
    visitItemsBelow(home().path(), cancelled_, [&](const std::string&) { cancelled_ = ++visited == 2; });
    EXPECT_EQ(visited, 2);
}

TEST_F(ScopeWalk, APathBelongsToTheFirstItemThatIsNotEntered) {
    home().writeFile("Folder/Beach.qnproject/Media/a.mov");
    home().writeFile("Folder/.dot/b.mov");
    home().makeLink("Folder/link", home().path("Folder"));
    const auto itemOf = [&](const std::string& path) {
        return itemOfWalk(home().path(), home().path(path)).substr(home().path().size() + 1);
    };
    EXPECT_EQ(itemOf("Folder"), "Folder");
    EXPECT_EQ(itemOf("Folder/Beach.qnproject"), "Folder/Beach.qnproject");
    EXPECT_EQ(itemOf("Folder/Beach.qnproject/Media/a.mov"), "Folder/Beach.qnproject");
    EXPECT_EQ(itemOf("Folder/.dot/b.mov"), "Folder/.dot");
    EXPECT_EQ(itemOf("Folder/link/Beach.qnproject"), "Folder/link");
    EXPECT_EQ(itemOf("Folder/missing.mov"), "Folder/missing.mov");
    EXPECT_EQ(itemOf("Folder/missing/deep/a.mov"), "Folder/missing");
}

TEST_F(ScopeWalk, ThePathsOfAScopeHaveOneSpelling) {
    mountArchive();
    EXPECT_EQ(realScopePath("/a//b/"), "/a/b");
    EXPECT_EQ(realScopePath("//"), "/");
    EXPECT_EQ(realScopePath("/Volumes/Archive/x"), home().path("mnt/x"));
    EXPECT_EQ(realScopePath("/Volumes/Unknown/x"), std::nullopt);
    EXPECT_EQ(realScopePath("a/b"), std::nullopt);
    EXPECT_EQ(realScopePath(""), std::nullopt);
}

TEST_F(ScopeWalk, AFolderIsNotBelowOneWhoseNameItBeginsWith) {
    EXPECT_TRUE(isBelow("/a/b", "/a"));
    EXPECT_TRUE(isBelow("/a", "/"));
    EXPECT_FALSE(isBelow("/ab", "/a"));
    EXPECT_FALSE(isBelow("/a", "/a"));
    EXPECT_FALSE(isBelow("/", "/"));
    EXPECT_TRUE(isAtOrBelow("/a", "/a"));
}

}  // namespace
