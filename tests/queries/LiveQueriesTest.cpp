#include "framework/queries/LiveQueries.h"

#include <condition_variable>
#include <fstream>
#include <set>
#include <thread>
#include <utility>

#include "framework/HostServices.h"
#include "platform/KeyedUnarchiver.h"
#include "platform/linux/LinuxDispatcher.h"
#include "tests/queries/QueriesTest.h"

using namespace testing_support;
using namespace vexo;
using platform::Locked;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;
using testing::UnorderedElementsAre;

namespace {

constexpr const char* movieQuery = "kMDItemFSName = '*.mov'";
constexpr unsigned gatherThenReport = 4;

// Writes down each report as "+added ~changed -removed", by the names of the files.
class Listener final : public VXPathObserver {
  public:
    void watchedPathChanged(const std::string&, std::uint64_t) override { ADD_FAILURE(); }
    void watchedQueryChanged(const platform::Notification& notification,
                             const VXPathListRef& queryScope) override {
        EXPECT_EQ(notification.name, platform::kMDQueryDidUpdateNotification);
        EXPECT_NE(notification.object, nullptr);
        EXPECT_EQ(notification.userInfo.size(), 3u);
        scopes.push_back(queryScope);
        reports.push_back(names(notification, kMDQueryUpdateAddedItems, "+") +
                          names(notification, kMDQueryUpdateChangedItems, "~") +
                          names(notification, kMDQueryUpdateRemovedItems, "-"));
        std::exchange(atNextReport, [] {})();
    }

    std::vector<std::string> reports;
    std::vector<VXPathListRef> scopes;
    std::function<void()> atNextReport = [] {};

  private:
    static std::string names(const platform::Notification& notification, std::string_view key,
                             const std::string& sign) {
        std::string text;
        const platform::Value* paths = platform::find(notification.userInfo, key);
        for (const platform::Value& path : *paths->array())
            text += sign + path.string()->substr(path.string()->rfind('/') + 1);
        return text;
    }
};

class LiveQueriesTest : public QueriesTest {
  protected:
    void watch(VXPathListRef scope, const std::string& query = movieQuery) {
        queries_.watchQuery(query, listener_, std::move(scope), gatherThenReport);
    }
    // Watches the folder F of the home, and has it gathered.
    void watchF() {
        watch(scope_);
        run();
    }
    void run() { host_.dispatcher.runDueBlocks(); }
    void report(std::vector<std::string> paths) {
        queries_.changed(paths);
        run();
    }
    std::string write(const std::string& relative) { return home().writeFile(relative); }

    const std::string folder_ = home().path("F");
    const VXPathListRef scope_ = pathList({folder_});
    std::shared_ptr<Listener> listener_ = std::make_shared<Listener>();
    std::vector<std::string> watchedFolders_;
    std::function<void()> atNextWork_ = [] {};
    LiveQueries queries_{
        {.watchFolder = [this](const std::string& folder) { watchedFolders_.push_back(folder); },
         .now =
             [this] {
                 EXPECT_FALSE(host_.dispatcher.isMainThread());
                 std::exchange(atNextWork_, [] {})();
                 return platform::Date::since1970(0);
             }}};

  private:
    const HostServicesScope services_{{hostServices().pathWatcher, hostServices().imageManager, metadata_,
                                       hostServices().thumbnails, hostServices().diagnostics}};
};

TEST_F(LiveQueriesTest, TheFirstGatheringIsSilentAndInTheBackground) {
    write("F/a.mov");
    watch(scope_);
    EXPECT_THAT(watchedFolders_, IsEmpty());
    run();
    EXPECT_THAT(watchedFolders_, ElementsAre(folder_));
    EXPECT_THAT(listener_->reports, IsEmpty());
}

TEST_F(LiveQueriesTest, EachChangeOfTheResultIsReported) {
    const std::string a = write("F/a.mov");
    watchF();
    write("F/b.mov");
    report({folder_});
    report({a});
    home().remove("F/a.mov");
    report({folder_});
    EXPECT_THAT(listener_->reports, ElementsAre("+b.mov", "~a.mov", "-a.mov"));
    EXPECT_EQ(listener_->scopes.back(), scope_);
}

TEST_F(LiveQueriesTest, WhatDoesNotChangeTheResultIsNotReported) {
    watchF();
    write("F/b.txt");
    report({folder_, home().path("F/b.txt"), "/elsewhere"});
    EXPECT_THAT(listener_->reports, IsEmpty());
}

TEST_F(LiveQueriesTest, TheQueriesOfThePluginReportProjectsAndEventMovies) {
    watch(pathList({home().path("Reelix Projects")}), projectQuery);
    watch(pathList({home().path("Reelix Events")}), eventQuery);
    run();
    home().makeFolder("Reelix Projects/Beach.qnproject");
    report({home().path("Reelix Projects")});
    write("Reelix Events/Party/clip.fcmov");
    write("Reelix Events/Party/clip.mov");
    report({home().path("Reelix Events")});
    report({home().path("Reelix Projects/Beach.qnproject")});
    EXPECT_THAT(listener_->reports, ElementsAre("+Beach.qnproject", "+clip.fcmov", "~Beach.qnproject"));
}

TEST_F(LiveQueriesTest, AChangeDuringTheGatheringIsNotLost) {
    write("F/a.mov");
    watch(scope_);
    atNextWork_ = [&] {
        atNextWork_ = [&] { write("F/b.mov"); };  // which the second round then finds
        queries_.changed({folder_});
    };
    run();
    EXPECT_THAT(listener_->reports, ElementsAre("+b.mov"));
}

TEST_F(LiveQueriesTest, ChangesThatArriveMeanwhileArePutTogether) {
    home().makeFolder("F/G");
    watchF();
    write("F/a.mov");
    queries_.changed({folder_});
    write("F/G/b.mov");
    queries_.changed({home().path("F/G")});
    EXPECT_EQ(host_.dispatcher.pendingCount(), 1u);
    run();
    EXPECT_THAT(listener_->reports, ElementsAre("+b.mov+a.mov"));
}

TEST_F(LiveQueriesTest, ChangesThatArriveDuringAReportAreLookedAtByTheSameBlock) {
    watchF();
    write("F/a.mov");
    listener_->atNextReport = [&] {
        write("F/b.mov");
        queries_.changed({folder_});
        EXPECT_EQ(host_.dispatcher.pendingCount(), 0u);
    };
    report({folder_});
    EXPECT_THAT(listener_->reports, ElementsAre("+a.mov", "+b.mov"));
}

TEST_F(LiveQueriesTest, AFloodOfChangesMeansEverything) {
    watchF();
    write("F/a.mov");
    write("F/G/b.mov");
    std::vector<std::string> flood;
    for (int i = 0; i < 1001; ++i)
        flood.push_back(home().path("elsewhere/" + std::to_string(i)));
    report({flood.begin(), flood.end() - 1});
    EXPECT_THAT(listener_->reports, IsEmpty());
    report(flood);
    EXPECT_THAT(listener_->reports, ElementsAre("+b.mov+a.mov"));
}

TEST_F(LiveQueriesTest, ARepeatedRegistrationIsOneWithTheNewestScope) {
    watchF();
    const VXPathListRef scope = pathList({home().path("G"), folder_});
    watch(scope);
    run();
    write("G/a.mov");
    report({home().path("G")});
    EXPECT_THAT(listener_->reports, ElementsAre("+a.mov"));
    EXPECT_EQ(listener_->scopes.back(), scope);
    EXPECT_THAT(watchedFolders_, ElementsAre(folder_, home().path("G")));
}

TEST_F(LiveQueriesTest, ARegistrationOfTheSameFoldersReportsNothing) {
    write("F/a.mov");
    watchF();
    watch(pathList({folder_}));
    run();
    EXPECT_THAT(listener_->reports, IsEmpty());
}

TEST_F(LiveQueriesTest, OtherQueriesAndOtherObserversAreRegistrationsOfTheirOwn) {
    const auto other = std::make_shared<Listener>();
    const std::string query = "kMDItemFSName = 'a*'";
    watch(scope_);
    queries_.watchQuery(movieQuery, other, scope_, gatherThenReport);
    queries_.watchQuery(query, other, scope_, gatherThenReport);
    watch(scope_, query);
    run();
    write("F/a.mov");
    report({folder_});
    EXPECT_THAT(listener_->reports, ElementsAre("+a.mov", "+a.mov"));
    EXPECT_THAT(other->reports, ElementsAre("+a.mov", "+a.mov"));
}

TEST_F(LiveQueriesTest, AFolderThatIsAddedToTheScopeIsWatchedAndGathered) {
    watchF();
    write("G/a.mov");
    scope_->append(home().path("G"));
    report({});
    EXPECT_THAT(watchedFolders_, ElementsAre(folder_, home().path("G")));
    EXPECT_THAT(listener_->reports, ElementsAre("+a.mov"));
}

TEST_F(LiveQueriesTest, AFolderIsWatchedBeforeItIsLookedAt) {
    LiveQueries queries({.watchFolder = [&](const std::string&) { write("F/a.mov"); }, .now = systemTime});
    queries.watchQuery(movieQuery, listener_, scope_, gatherThenReport);
    run();
    queries.changed({folder_});
    run();
    EXPECT_THAT(listener_->reports, IsEmpty());  // it was there when the folder was gathered
}

TEST_F(LiveQueriesTest, ARegistrationEndsWithItsObserver) {
    watchF();
    std::weak_ptr<Listener> gone = listener_;
    listener_.reset();
    EXPECT_TRUE(gone.expired());
    write("F/a.mov");
    const std::size_t requests = host_.dispatcher.requests().size();
    report({folder_});
    EXPECT_EQ(host_.dispatcher.requests().size(), requests);
}

TEST_F(LiveQueriesTest, AnObserverThatGoesDuringTheWorkIsNotCalled) {
    watchF();
    write("F/a.mov");
    atNextWork_ = [&] { listener_.reset(); };
    report({folder_});
    EXPECT_THAT(host_.diagnostics.warnings(), IsEmpty());
}

TEST_F(LiveQueriesTest, WorkForAnObserverThatIsGoneEndsAtTheNextChange) {
    const WatchedMetadata metadata(metadata_, [&] {
        listener_.reset();
        queries_.changed({});
    });
    const HostServicesScope services({hostServices().pathWatcher, hostServices().imageManager, metadata,
                                      hostServices().thumbnails, hostServices().diagnostics});
    for (const char* name : {"F/a.mov", "F/b.mov", "F/c.mov"})
        write(name);
    watchF();
    EXPECT_EQ(metadata.questions, 1);
}

TEST_F(LiveQueriesTest, AfterClosingNothingIsReported) {
    watchF();
    write("F/a.mov");
    queries_.changed({folder_});
    queries_.close();
    watch(scope_);
    run();
    write("F/b.mov");
    report({folder_});
    EXPECT_THAT(listener_->reports, IsEmpty());
}

TEST_F(LiveQueriesTest, TheWorkMayOutliveTheObject) {
    auto queries = std::make_unique<LiveQueries>(
        LiveQuerySurroundings{.watchFolder = [](const std::string&) {}, .now = systemTime});
    queries->watchQuery(movieQuery, listener_, scope_, gatherThenReport);
    run();
    write("F/a.mov");
    queries->changed({folder_});
    queries.reset();
    run();
    EXPECT_THAT(listener_->reports, IsEmpty());
}

TEST_F(LiveQueriesTest, AQueryThatMakesNoSenseIsAWarningAndNothingElse) {
    for (int i = 0; i < 2; ++i)
        watch(scope_, "kMDItemFSName = ");
    EXPECT_THAT(
        host_.diagnostics.warnings(),
        ElementsAre("a query makes no sense: expected a value after '=' at position 16: kMDItemFSName = "));
    EXPECT_EQ(host_.dispatcher.pendingCount(), 0u);
}

TEST_F(LiveQueriesTest, WhatAnObserverRaisesIsAWarningAndLaterReportsGoOn) {
    watchF();
    listener_->atNextReport = [] { throw std::runtime_error("no memory"); };
    write("F/a.mov");
    report({folder_});
    write("F/b.mov");
    report({folder_});
    EXPECT_THAT(listener_->reports, ElementsAre("+a.mov", "+b.mov"));
    EXPECT_THAT(host_.diagnostics.warnings(), ElementsAre(HasSubstr("no memory")));
    EXPECT_EQ(host_.dispatcher.unhandledFailures(), 0u);
}

TEST_F(LiveQueriesTest, AFailureOfTheWorkIsAWarningAndTheNextChangeIsLookedAt) {
    atNextWork_ = [] { throw std::runtime_error("no memory"); };
    write("F/a.mov");
    watchF();
    report({});  // gathers after all
    write("F/b.mov");
    report({folder_});
    EXPECT_THAT(listener_->reports, ElementsAre("+b.mov"));
    EXPECT_THAT(host_.diagnostics.warnings(), ElementsAre(HasSubstr("no memory")));
}

TEST_F(LiveQueriesTest, TheClockIsTheSystems) {
    const double before =
        std::chrono::duration<double>(std::chrono::system_clock::now().time_since_epoch()).count();
    EXPECT_GE(systemTime()->secondsSince1970(), before);
}

// --- Many threads ------------------------------------------------------------------------------------------

// Keeps what is a result by the reports alone, and lets a test wait for it.
class Follower final : public VXPathObserver {
  public:
    void watchedPathChanged(const std::string&, std::uint64_t) override { ADD_FAILURE(); }
    void watchedQueryChanged(const platform::Notification& notification, const VXPathListRef&) override {
        Locked lock(mutex_);
        for (const auto& path : *platform::find(notification.userInfo, kMDQueryUpdateAddedItems)->array())
            EXPECT_TRUE(results_.insert(*path.string()).second);
        for (const auto& path : *platform::find(notification.userInfo, kMDQueryUpdateRemovedItems)->array())
            EXPECT_EQ(results_.erase(*path.string()), 1u);
        changed_.notify_all();
    }
    // Answers whether these were the results before a deadline that only a failure reaches.
    bool waitFor(const std::set<std::string>& results) {
        Locked lock(mutex_);
        return changed_.wait_for(mutex_, std::chrono::seconds(60), [&] { return results_ == results; });
    }

  private:
    platform::Mutex mutex_;
    std::condition_variable_any changed_;
    std::set<std::string> results_;
};

TEST_F(LiveQueriesTest, ChangesAndFoldersFromManyThreadsAllArrive) {
    constexpr int threadCount = 4, filesEach = 25;
    const auto follower = std::make_shared<Follower>();
    LiveQueries queries({.watchFolder = [](const std::string&) {}, .now = systemTime});
    const VXPathListRef scope = pathList({});
    queries.watchQuery(movieQuery, follower, scope, gatherThenReport);
    run();  // what is gathered in silence would be missing among the reports

    auto dispatcher = std::make_unique<platform::LinuxDispatcher>(host_.log);
    const platform::ServicesScope services(
        {host_.files(), host_.workspace, host_.userDefaults, *dispatcher, host_.notifications, host_.log});
    std::set<std::string> expected;
    std::vector<std::thread> threads;
    for (int thread = 0; thread < threadCount; ++thread) {
        const std::string folder = home().makeFolder("T" + std::to_string(thread));
        for (int i = 1; i < filesEach; i += 2)
            expected.insert(folder + "/" + std::to_string(i) + ".mov");
        threads.emplace_back([&, folder] {
            scope->append(folder);
            for (int i = 0; i < filesEach; ++i) {
                const std::string file = folder + "/" + std::to_string(i) + ".mov";
                std::ofstream(file) << "movie";
                queries.changed({file});
                if (i % 2 == 0)
                    std::remove(file.c_str());
                queries.changed({folder});
                queries.watchQuery(movieQuery, follower, scope, gatherThenReport);
            }
        });
    }
    for (std::thread& thread : threads)
        thread.join();
    EXPECT_TRUE(follower->waitFor(expected));
    queries.close();
    dispatcher.reset();
}

}  // namespace
