#include "framework/pathwatcher/PathWatcher.h"

#include <gtest/gtest.h>

namespace vexo {
namespace {

class SilentObserver final : public VXPathObserver {
  public:
    void watchedPathChanged(const std::string&, std::uint64_t) override {}
    void watchedQueryChanged(const platform::Notification&, const VXPathListRef&) override {}
};

class PathWatcherTest : public testing::Test {
  protected:
    PathWatcher watcher;
    VXPathObserverRef observer = std::make_shared<SilentObserver>();
    VXPathObserverRef other = std::make_shared<SilentObserver>();
};

TEST_F(PathWatcherTest, APathIsUniqueUntilItIsWatched) {
    EXPECT_TRUE(watcher.watchPathIsUnique("/a/b", observer));
    watcher.watchPath("/a/b", observer);
    EXPECT_FALSE(watcher.watchPathIsUnique("/a/b", observer));
}

TEST_F(PathWatcherTest, APathBelowAWatchedFolderIsNotUnique) {
    watcher.watchPath("/a", observer);
    EXPECT_FALSE(watcher.watchPathIsUnique("/a/b/c", observer));
    EXPECT_TRUE(watcher.watchPathIsUnique("/ab", observer));
    EXPECT_TRUE(watcher.watchPathIsUnique("/", observer));
}

TEST_F(PathWatcherTest, AWatchedRootCoversEverything) {
    watcher.watchPath("/", observer);
    EXPECT_FALSE(watcher.watchPathIsUnique("/a", observer));
}

TEST_F(PathWatcherTest, AWatchedChildLeavesItsFolderUnique) {
    watcher.watchPath("/a/b", observer);
    EXPECT_TRUE(watcher.watchPathIsUnique("/a", observer));
}

TEST_F(PathWatcherTest, UniquenessIsPerObserver) {
    watcher.watchPath("/a", observer);
    EXPECT_TRUE(watcher.watchPathIsUnique("/a", other));
}

TEST_F(PathWatcherTest, SlashesAtTheEndMakeNoDifference) {
    watcher.watchPath("/a/", observer);
    EXPECT_FALSE(watcher.watchPathIsUnique("/a", observer));
    EXPECT_FALSE(watcher.watchPathIsUnique("/a//", observer));
}

TEST_F(PathWatcherTest, ARegistrationEndsWithItsObserver) {
    watcher.watchPath("/a", observer);
    EXPECT_EQ(watcher.watchedAncestor("/a/b"), "/a");
    observer.reset();
    EXPECT_EQ(watcher.watchedAncestor("/a/b"), std::nullopt);
}

TEST_F(PathWatcherTest, RelativeAndEmptyPathsAreOrdinaryNames) {
    EXPECT_TRUE(watcher.watchPathIsUnique("", observer));
    EXPECT_TRUE(watcher.watchPathIsUnique("XXX", observer));
    watcher.watchPath("XXX", observer);
    EXPECT_FALSE(watcher.watchPathIsUnique("XXX", observer));
}

TEST_F(PathWatcherTest, TheSameQueryOfOneObserverIsOneRegistrationWithTheNewestScope) {
    const auto first = std::make_shared<VXPathList>();
    const auto second = std::make_shared<VXPathList>();
    watcher.watchQuery("query", observer, first, 4);
    watcher.watchQuery("query", observer, second, 4);
    watcher.watchQuery("query", other, first, 4);
    watcher.watchQuery("another", observer, first, 4);

    const auto queries = watcher.queries();
    ASSERT_EQ(queries.size(), 3u);
    EXPECT_EQ(queries[0].scope, second);
    EXPECT_EQ(queries[0].runMode, 4u);
}

TEST_F(PathWatcherTest, FoldersAddedToAScopeLaterAreInIt) {
    const auto scope = std::make_shared<VXPathList>();
    watcher.watchQuery("query", observer, scope, 4);
    scope->append("/later");
    EXPECT_EQ(watcher.queries()[0].scope->snapshot(), std::vector<std::string>{"/later"});
}

TEST_F(PathWatcherTest, QueriesOfVanishedObserversAreForgotten) {
    watcher.watchQuery("query", observer, std::make_shared<VXPathList>(), 4);
    observer.reset();
    EXPECT_TRUE(watcher.queries().empty());
}

}  // namespace
}  // namespace vexo
