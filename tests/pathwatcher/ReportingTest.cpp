// Who hears of changes, how, and what becomes of the thread.
#include <condition_variable>
#include <filesystem>
#include <mutex>
#include <stdexcept>
#include <thread>

#include "platform/linux/LinuxDispatcher.h"
#include "tests/pathwatcher/WatcherTest.h"

using namespace testing_support;
using testing::ElementsAre;

namespace fs = std::filesystem;

namespace {

using Reporting = WatcherTest;

// Waits for reports that come on other threads.
class AwaitedObserver final : public vexo::VXPathObserver {
  public:
    void watchedPathChanged(const std::string& path, std::uint64_t) override {
        const std::lock_guard lock(mutex_);
        paths_.insert(path);
        changed_.notify_all();
    }
    void watchedQueryChanged(const platform::Notification&, const vexo::VXPathListRef&) override {}

    bool hears(const std::string& path) {
        std::unique_lock lock(mutex_);
        return changed_.wait_for(lock, std::chrono::seconds(30), [&] { return paths_.contains(path); });
    }

  private:
    std::mutex mutex_;
    std::condition_variable changed_;
    Paths paths_;
};

// How many queues of inotify this process has open.
int openQueues() {
    int count = 0;
    std::error_code gone;
    for (const auto& entry : fs::directory_iterator("/proc/self/fd"))
        count += fs::read_symlink(entry.path(), gone) == "anon_inode:inotify";
    return count;
}

// The watcher on a thread of the real dispatcher.
class ReportingThread : public testing::Test {
  protected:
    ReportingThread() : scope_(services()) {}
    ~ReportingThread() override {
        watcher_.close();
        dispatcher_.reset();
    }

    HostEnvironment environment_;
    TemporaryFolder folder_;
    const std::shared_ptr<AwaitedObserver> observer_ = std::make_shared<AwaitedObserver>();
    vexo::PathWatcher watcher_;
    std::unique_ptr<platform::LinuxDispatcher> dispatcher_ =
        std::make_unique<platform::LinuxDispatcher>(environment_.log);

  private:
    platform::Services services() {
        return {environment_.files(), environment_.workspace,     environment_.userDefaults,
                *dispatcher_,         environment_.notifications, environment_.log};
    }

    platform::ServicesScope scope_;
};

}  // namespace

TEST_F(Reporting, AnObserverThatRaisesHarmsNobody) {
    const auto other = std::make_shared<RecordingObserver>();
    folder.makeFolder("a");
    folder.makeFolder("b");
    watch(folder.path());
    watcher().watchPath(folder.path(), other);
    observer->whenCalled = [](const std::string&) { throw std::runtime_error("no memory"); };
    const Paths both{folder.path("a"), folder.path("b")};
    EXPECT_EQ(reportsOf([&] {
                  folder.makeFolder("a/x");
                  folder.makeFolder("b/x");
              }),
              both);
    EXPECT_EQ(other->paths(), both);
    EXPECT_THAT(environment.diagnostics.warnings(), ElementsAre("a plug-in failed: no memory"));
}

TEST_F(Reporting, AnObserverMayWatchMoreWhileItIsTold) {
    const std::string other = folder.makeFolder("other"), first = folder.makeFolder("first");
    watch(first);
    observer->whenCalled = [&](const std::string&) { watcher().watchPath(other, observer); };
    reportsOf([&] { folder.makeFolder("first/x"); });
    EXPECT_EQ(reportsOf([&] { folder.makeFolder("other/x"); }), Paths{other});
}

TEST_F(Reporting, AListenerHearsOfAWholeBurstInOrderAtOnce) {
    std::vector<std::vector<std::string>> bursts;
    const auto listener = std::make_shared<const vexo::ChangeListener>(
        [&](const std::vector<std::string>& changedPaths) { bursts.push_back(changedPaths); });
    const std::string a = folder.makeFolder("a"), b = folder.makeFolder("b");
    watcher().listen(a, listener);
    watcher().listen(folder.path("b"), listener);
    folder.makeFolder("b/x");
    folder.makeFolder("a/x");
    settle();
    EXPECT_THAT(bursts, ElementsAre(ElementsAre(a, b)));
}

TEST_F(Reporting, AListenerThatIsGoneHearsNothing) {
    int calls = 0;
    auto listener = std::make_shared<const vexo::ChangeListener>([&](const auto&) { ++calls; });
    watcher().listen(folder.path(), listener);
    listener.reset();
    folder.makeFolder("x");
    settle();
    EXPECT_EQ(calls, 0);
}

TEST_F(Reporting, WhatComesWhileAnObserverIsToldIsToldInOneGo) {
    watch(folder.path());
    folder.makeFolder("a");
    observer->whenCalled = [&](const std::string&) {
        observer->whenCalled = nullptr;
        for (const char* name : {"b", "c"}) {
            folder.makeFolder(name);
            do
                follower().step(vexo::ChangeBurst::length);
            while (follower().keepsChanges());
        }
    };
    settle();
    EXPECT_THAT(observer->calls, ElementsAre(folder.path(), folder.path()));
    EXPECT_EQ(environment.dispatcher.requests().size(), 1u);
}

TEST_F(Reporting, FilesThatAreWrittenToInTurnsAreToldOnceEach) {
    const std::string a = folder.writeFile("a.mov"), b = folder.writeFile("b.mov");
    watch(folder.path());
    for (int i = 0; i < 10; ++i) {
        folder.writeFile("a.mov", "content");
        folder.writeFile("b.mov", "content");
    }
    settle();
    EXPECT_THAT(observer->calls, ElementsAre(a, b));
}

TEST_F(Reporting, WhatChangesInSeveralBurstsBeforeAnObserverIsToldIsToldOnce) {
    watcher();
    const auto delivery = std::make_shared<vexo::ChangeDelivery>();
    for (const char* path : {"/0", "/1", "/2", "/1"})
        delivery->add(vexo::Subscriber(observer), {"/b", "/a", path, "/a"});
    delivery->begin();
    environment.dispatcher.runDueBlocks();
    EXPECT_THAT(observer->calls, ElementsAre("/0", "/1", "/2", "/a", "/b"));
}

TEST_F(Reporting, AfterClosingWhatWaitsIsDropped) {
    watch(folder.path());
    folder.makeFolder("x");
    do
        follower().step(vexo::ChangeBurst::length);
    while (follower().keepsChanges());
    EXPECT_EQ(environment.dispatcher.pendingCount(), 1u);
    watcher().close();
    environment.dispatcher.runDueBlocks();
    EXPECT_THAT(observer->calls, ElementsAre());
}

TEST_F(Reporting, AStepThatWaitsSeesAPathThatIsAddedMeanwhile) {
    std::thread waiting([&follows = follower()] { follows.step(vexo::ChangeFollower::forever); });
    watcher().watchPath(folder.path(), observer);
    waiting.join();
    EXPECT_EQ(reportsOf([&] { folder.makeFolder("x"); }), Paths{folder.path()});
}

TEST_F(Reporting, AfterClosingNobodyIsTold) {
    watch(folder.path());
    folder.makeFolder("x");
    follower().step(std::chrono::milliseconds(0));
    EXPECT_TRUE(follower().keepsChanges());
    watcher().close();
    EXPECT_FALSE(follower().step(vexo::ChangeFollower::forever));
    environment.dispatcher.runDueBlocks();
    EXPECT_THAT(observer->calls, ElementsAre());
}

TEST_F(ReportingThread, ChangesAreHeardOfWithoutHelp) {
    watcher_.watchPath(folder_.path(), observer_);
    watcher_.start();
    folder_.makeFolder("sub");
    EXPECT_TRUE(observer_->hears(folder_.path()));
    const std::string later = folder_.path("later/Movies");
    watcher_.watchPath(later, observer_);
    folder_.makeFolder("later/Movies/x");
    EXPECT_TRUE(observer_->hears(later));
}

TEST_F(ReportingThread, NoQueueIsOpenedBeforeThereIsSomethingToFollow) {
    const int before = openQueues();
    vexo::PathWatcher watcher;
    watcher.watchPath(folder_.path(), observer_);
    EXPECT_EQ(openQueues(), before);
    watcher.start();
    EXPECT_EQ(openQueues(), before + 1);
    watcher.watchPath(folder_.path("other"), observer_);
    vexo::PathWatcher idle;
    idle.start();
    EXPECT_EQ(openQueues(), before + 1);

    watcher.close();
    dispatcher_.reset();  // waits for the thread
    EXPECT_EQ(openQueues(), before);
}
