#include <filesystem>

#include "platform/Path.h"
#include "tests/watching/WatchingTest.h"

namespace testing_support {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;

class ChangeWatchingTest : public WatchingTest {
  protected:
    std::string projects() const { return home().path("Movies/Reelix Projects"); }
    std::string localizedProjects() const { return home().path("Movies/Reelix Projects.localized"); }
    std::string events() const { return home().path("Movies/Reelix Events"); }
};

// --- Routing -----------------------------------------------------------------------------------------------

TEST_F(ChangeWatchingTest, FolderInAProjectLibrarySchedulesAProjectReload) {
    for (const char* folder :
         {"Movies/Reelix Projects", "Movies/Reelix Projects/Trip.qnproject",
          "Movies/Reelix Projects.localized/Family/Trip.qnproject", "disk/Reelix Projects/Trip.qnproject"}) {
        report(home().makeFolder(folder));
        EXPECT_EQ(pending(), "projects") << folder;
        environment.dispatcher.advance(delay);
    }
}

TEST_F(ChangeWatchingTest, MissingPathInAProjectLibrarySchedulesAProjectReload) {
    report(localizedProjects() + "/Gone.qnproject");
    EXPECT_EQ(pending(), "projects");
}

TEST_F(ChangeWatchingTest, MountPointNamedLikeAProjectLibrarySchedulesAProjectReload) {
    report(home().makeFolder("mnt/Reelix Projects"));
    EXPECT_EQ(pending(), "projects");
}

TEST_F(ChangeWatchingTest, EveryOtherFolderOrMissingPathSchedulesAnEventReload) {
    for (const std::string& path :
         {home().makeFolder("Movies/Reelix Events/Trip"), home().path("missing"), home().path(),
          home().path("Reelix Projects 2/a"), home().path("reelix projects/a"),
          home().path("Reelix Projects.loc/a"), std::string("relative"), std::string()}) {
        report(path);
        EXPECT_EQ(pending(), "events") << path;
        environment.dispatcher.advance(delay);
    }
}

TEST_F(ChangeWatchingTest, ProjectAndEventReloadsArePendingTogether) {
    report(home().makeFolder("Movies/Reelix Projects.localized/Trip.qnproject"));
    report(home().makeFolder("Movies/Reelix Events/Trip"));
    EXPECT_EQ(pending(), "projects events");
    EXPECT_EQ(scheduled(), 2u);
}

TEST_F(ChangeWatchingTest, FileThatIsNoItemDoesNothingAtAll) {
    home().writeFile("Movies/Reelix Events/Trip/a.mov");
    load();
    publications = 0;
    report(home().writeFile("Movies/Reelix Projects/Trip.qnproject/Project"));
    report(home().writeFile("Movies/Reelix Events/Trip/readme.txt"));
    report(home().makeFifo("fifo"));
    EXPECT_EQ(pending(), "");
    EXPECT_EQ(environment.dispatcher.pendingCount(), 0u);
    EXPECT_EQ(publications, 0);
}

TEST_F(ChangeWatchingTest, FileBeforeTheFirstLoadDoesNothing) {
    report(home().writeFile("Movies/Reelix Events/Trip/a.mov"));
    EXPECT_EQ(environment.dispatcher.pendingCount(), 0u);
}

TEST_F(ChangeWatchingTest, FileOfAnItemKeepsItsThumbnailAndSchedulesNothing) {
    const std::string clip = home().writeFile("Movies/Reelix Events/Trip/a.mov");
    const auto root = load();
    ASSERT_EQ(root->mediaObjects().size(), 1u);
    const auto mediaObject = root->mediaObjects().front();
    const auto thumbnail = std::make_shared<platform::Image>(nullptr, "thumbnail");
    mediaObject->setThumbnailImage(thumbnail);
    report(clip);
    EXPECT_EQ(mediaObject->thumbnailImage(), thumbnail);
    EXPECT_EQ(pending(), "");
}

TEST_F(ChangeWatchingTest, PreferenceFileReadsTheOrderOfEventsAgain) {
    const std::string preferences = platform::path::expandingTilde(vexo::VXSuitePrefsPath);
    environment.userDefaults.storeDomain(std::string(vexo::VXSuitePrefsDomainName),
                                         {{"Reelix", platform::Dictionary{{"dateSortReverse", false}}}});
    home().writeFile(".config/vexo/com.vexo.suite.plist");
    ASSERT_EQ(preferences, home().path(".config/vexo/com.vexo.suite.plist"));
    report(preferences);
    EXPECT_FALSE(plugin()._mostRecentEventFirst);
    EXPECT_EQ(pending(), "events");
    EXPECT_EQ(scheduled(), 1u);
}

TEST_F(ChangeWatchingTest, PreferenceFileSchedulesNothingWhenTheOrderIsTheSame) {
    report(platform::path::expandingTilde(vexo::VXSuitePrefsPath));  // and it is missing besides
    EXPECT_EQ(pending(), "");
}

TEST_F(ChangeWatchingTest, FlagsOfAReportAreNeverLookedAt) {
    report(events(), ~std::uint64_t{0});
    EXPECT_EQ(pending(), "events");
}

// --- Threads -----------------------------------------------------------------------------------------------

TEST_F(ChangeWatchingTest, ReportOnTheMainThreadIsHandedToTheBackground) {
    plugin().watchedPathChanged(events(), 7);
    EXPECT_EQ(pending(), "");
    EXPECT_THAT(environment.log.lines(), IsEmpty());
    EXPECT_THAT(environment.dispatcher.requests(),
                ElementsAre(Request{.place = VirtualDispatcher::Place::background}));
    environment.dispatcher.runDueBlocks();
    EXPECT_EQ(pending(), "events");
    EXPECT_THAT(environment.log.lines(), ElementsAre("watchedPathChanged:" + events()));
}

TEST_F(ChangeWatchingTest, ReportThatWasHandedOverKeepsThePluginAlive) {
    auto other = newPlugin();
    const std::weak_ptr<ExposedPlugin> watched = other;
    other->watchedPathChanged(events(), 0);
    other.reset();
    EXPECT_FALSE(watched.expired());
    environment.dispatcher.runDueBlocks();  // the reload that it schedules holds it on
    EXPECT_FALSE(watched.expired());
    environment.dispatcher.advance(delay);
    EXPECT_TRUE(watched.expired());
}

TEST_F(ChangeWatchingTest, EveryReportIsLoggedOnce) {
    report("/a");
    report("/b");
    EXPECT_THAT(environment.log.lines(), ElementsAre("watchedPathChanged:/a", "watchedPathChanged:/b"));
}

// --- Coalescing --------------------------------------------------------------------------------------------

TEST_F(ChangeWatchingTest, TwentyReportsMakeOneReloadFiveSecondsAfterTheFirst) {
    load();
    publications = 0;
    for (int i = 0; i < 20; ++i) {
        report(projects());
        environment.dispatcher.advance(std::chrono::milliseconds(50));
    }
    EXPECT_EQ(scheduled(), 1u);
    environment.dispatcher.advance(delay - std::chrono::milliseconds(1001));
    EXPECT_EQ(publications, 0);
    environment.dispatcher.advance(std::chrono::milliseconds(1));
    EXPECT_EQ(publications, 1);
    EXPECT_EQ(pending(), "");
    environment.dispatcher.advance(delay);
    EXPECT_EQ(publications, 1);
}

TEST_F(ChangeWatchingTest, ReportDuringAReloadMakesAnother) {
    load();
    publications = 0;
    report(events());
    bool reported = false;
    files.beforeListing = [&](const std::string& folder) {
        if (folder == events() && !std::exchange(reported, true))
            plugin().watchedPathChanged(events(), 0);
    };
    environment.dispatcher.advance(delay);
    EXPECT_EQ(publications, 1);
    EXPECT_EQ(pending(), "events");
    environment.dispatcher.advance(delay);
    EXPECT_EQ(publications, 2);
    EXPECT_EQ(pending(), "");
}

TEST_F(ChangeWatchingTest, ReloadsRunOffTheMainThread) {
    load();
    std::vector<bool> onMainThread;
    files.beforeListing = [&](const std::string&) {
        onMainThread.push_back(environment.dispatcher.isMainThread());
    };
    plugin().watchedPathChanged(events(), 0);
    environment.dispatcher.advance(delay);
    EXPECT_THAT(onMainThread, testing::AllOf(testing::Not(IsEmpty()), testing::Each(false)));
}

TEST_F(ChangeWatchingTest, ReloadOfOneBranchLeavesTheOtherAlone) {
    home().writeFile("Movies/Reelix Events/Trip/a.mov");
    load();
    std::vector<std::string> listed;
    files.beforeListing = [&](const std::string& folder) { listed.push_back(folder); };
    report(projects());
    environment.dispatcher.advance(delay);
    EXPECT_THAT(listed, testing::Each(testing::HasSubstr("Reelix Projects")));
    listed.clear();
    report(events());
    environment.dispatcher.advance(delay);
    EXPECT_THAT(listed, testing::Each(testing::HasSubstr("Reelix Events")));
}

TEST_F(ChangeWatchingTest, ReportsWhileACancelIsPendingAreDroppedForGood) {
    plugin().cancelAfter(0);
    report(projects() + "/Gone.qnproject");
    report(events());
    EXPECT_EQ(pending(), "");
    plugin().neverCancel();
    environment.dispatcher.advance(delay);
    EXPECT_EQ(scheduled(), 0u);
}

TEST_F(ChangeWatchingTest, PreferencesAndFilesAreSeenToWhileACancelIsPending) {
    environment.userDefaults.storeDomain(std::string(vexo::VXSuitePrefsDomainName),
                                         {{"Reelix", platform::Dictionary{{"dateSortReverse", false}}}});
    plugin().cancelAfter(0);
    report(platform::path::expandingTilde(vexo::VXSuitePrefsPath));
    EXPECT_EQ(pending(), "events");
}

// --- Queries -----------------------------------------------------------------------------------------------

TEST_F(ChangeWatchingTest, NotificationsOfOtherNamesAreIgnored) {
    reportQuery({projects()}, "kMDQueryDidFinishNotification");
    reportQuery({events()}, "");
    EXPECT_EQ(pending(), "");
    EXPECT_THAT(environment.log.lines(), IsEmpty());
}

TEST_F(ChangeWatchingTest, QueryOfTheProjectFoldersSchedulesAProjectReload) {
    for (const auto& scope : std::vector<std::vector<std::string>>{
             {projects(), localizedProjects()}, {localizedProjects()}, {"", "/elsewhere", projects()}}) {
        reportQuery(scope);
        EXPECT_EQ(pending(), "projects");
        environment.dispatcher.advance(delay);
    }
    EXPECT_THAT(environment.log.lines(), IsEmpty());
}

TEST_F(ChangeWatchingTest, QueryOfOtherFoldersIsAReportOfThePlaceholder) {
    reportQuery({events(), ""});
    EXPECT_EQ(pending(), "events");
    EXPECT_THAT(environment.log.lines(), ElementsAre("watchedPathChanged:XXX"));
}

TEST_F(ChangeWatchingTest, QueryWithoutAScopeSchedulesAnEventReload) {
    reportQuery({});
    EXPECT_EQ(pending(), "events");
    environment.dispatcher.advance(delay);
    offMainThread([&] {
        plugin().watchedQueryChanged({std::string(platform::kMDQueryDidUpdateNotification)}, nullptr);
    });
    EXPECT_EQ(pending(), "events");
}

TEST_F(ChangeWatchingTest, QueryOfOtherFoldersIsDroppedWhileACancelIsPending) {
    plugin().cancelAfter(0);
    reportQuery({events()});
    EXPECT_EQ(pending(), "");
    reportQuery({projects()});
    EXPECT_EQ(pending(), "projects");
}

TEST_F(ChangeWatchingTest, FileNamedLikeThePlaceholderTakesTheEventReloadAway) {
    const std::string before = std::filesystem::current_path();
    home().writeFile("XXX");
    std::filesystem::current_path(home().path());
    reportQuery({events()});
    std::filesystem::current_path(before);
    EXPECT_EQ(pending(), "");
}

TEST_F(ChangeWatchingTest, MissingDefaultFolderIsRememberedUntilItIsBack) {
    reportQuery({projects()});
    EXPECT_TRUE(plugin()._missingReelixDefaultPath);
    EXPECT_EQ(pending(), "projects");
    EXPECT_EQ(environment.watcher.watchedAncestor(localizedProjects()), std::nullopt);
    environment.dispatcher.advance(delay);

    home().makeFolder("Movies/Reelix Projects");
    reportQuery({projects()});
    EXPECT_FALSE(plugin()._missingReelixDefaultPath);
    EXPECT_EQ(pending(), "projects");
    EXPECT_EQ(environment.watcher.watchedAncestor(localizedProjects()), localizedProjects());
    EXPECT_EQ(environment.watcher.watchedAncestor(projects()), std::nullopt);
}

TEST_F(ChangeWatchingTest, OnlyTheFirstDefaultFolderOfTheScopeIsLookedAt) {
    home().makeFolder("Movies/Reelix Projects.localized");
    reportQuery({projects(), localizedProjects()});
    EXPECT_TRUE(plugin()._missingReelixDefaultPath);
    reportQuery({localizedProjects(), projects()});
    EXPECT_FALSE(plugin()._missingReelixDefaultPath);
}

TEST_F(ChangeWatchingTest, FileInPlaceOfTheDefaultFolderChangesNothing) {
    home().writeFile("Movies/Reelix Projects");
    for (const bool missing : {false, true}) {
        plugin()._missingReelixDefaultPath = missing;
        reportQuery({projects()});
        EXPECT_EQ(plugin()._missingReelixDefaultPath, missing);
    }
    EXPECT_EQ(environment.watcher.watchedAncestor(localizedProjects()), std::nullopt);
}

TEST_F(ChangeWatchingTest, FolderThatWasNeverMissingIsNotWatchedAnew) {
    home().makeFolder("Movies/Reelix Projects");
    reportQuery({projects()});
    EXPECT_FALSE(plugin()._missingReelixDefaultPath);
    EXPECT_EQ(environment.watcher.watchedAncestor(localizedProjects()), std::nullopt);
}

// --- Watches -----------------------------------------------------------------------------------------------

TEST_F(ChangeWatchingTest, PathIsWatchedOnceAndNotInsideAWatchedFolder) {
    plugin()._watchPath("/a/b");
    EXPECT_EQ(environment.watcher.watchedAncestor("/a/b/c"), "/a/b");
    plugin()._watchPath("/a/b/c");
    EXPECT_EQ(environment.watcher.watchedAncestor("/a/b/c"), "/a/b");
    plugin()._watchPath("/a");
    EXPECT_EQ(environment.watcher.watchedAncestor("/a/x"), "/a");
}

}  // namespace
}  // namespace testing_support
