// Facts that hold on the machine's dispatcher and on the tests' own, and the ones that only the machine's
// has.
#include "platform/Dispatcher.h"

#include <glib.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <pthread.h>
#include <sched.h>
#include <sys/resource.h>
#include <sys/syscall.h>
#include <unistd.h>

#include <future>
#include <map>
#include <stdexcept>

#include "platform/linux/LinuxDispatcher.h"
#include "platform/linux/ThreadPriority.h"
#include "tests/platform/CollectedLog.h"
#include "tests/support/VirtualDispatcher.h"

using namespace std::chrono_literals;
using platform::Dispatcher;
using platform::LinuxDispatcher;
using platform::Locked;
using platform::RunLoopMode;
using testing::ElementsAre;
using testing_support::VirtualDispatcher;

namespace {

const std::vector<RunLoopMode> commonModes = {RunLoopMode::kCFRunLoopCommonModes};

// What blocks did, in order. Every entry wakes the main loop, where tests wait for it.
class Record {
  public:
    void add(const std::string& entry) {
        {
            Locked lock(mutex_);
            entries_.push_back(entry);
        }
        g_main_context_wakeup(nullptr);
    }
    std::vector<std::string> entries() const {
        Locked lock(mutex_);
        return entries_;
    }

  private:
    mutable platform::Mutex mutex_;
    std::vector<std::string> entries_ VX_GUARDED_BY(mutex_);
};

// A dispatcher and how its time passes.
class World {
  public:
    virtual ~World() = default;
    virtual Dispatcher& dispatcher() = 0;
    virtual void destroyDispatcher() = 0;
    // Lets time pass until the record holds `count` entries.
    virtual void waitFor(const Record& record, std::size_t count) = 0;
};

class VirtualWorld final : public World {
  public:
    Dispatcher& dispatcher() override { return *dispatcher_; }
    void destroyDispatcher() override { dispatcher_.reset(); }
    void waitFor(const Record& record, std::size_t count) override {
        dispatcher_->advance(1s);
        ASSERT_GE(record.entries().size(), count);
    }

  private:
    std::unique_ptr<VirtualDispatcher> dispatcher_ = std::make_unique<VirtualDispatcher>();
};

class MachineWorld final : public World {
  public:
    Dispatcher& dispatcher() override { return *dispatcher_; }
    void destroyDispatcher() override { dispatcher_.reset(); }
    void waitFor(const Record& record, std::size_t count) override {
        bool late = false;
        const auto stop = [](gpointer flag) -> gboolean { return *static_cast<bool*>(flag) = true; };
        const guint deadline = g_timeout_add_seconds(30, stop, &late);
        while (record.entries().size() < count && !late)
            g_main_context_iteration(nullptr, TRUE);
        g_source_remove(deadline);
        ASSERT_FALSE(late) << "blocks did not run";
    }
    std::vector<std::string> logLines() const { return log_.lines(); }

  private:
    CollectedLog log_;
    std::unique_ptr<LinuxDispatcher> dispatcher_ = std::make_unique<LinuxDispatcher>(log_);
};

using WorldMaker = std::unique_ptr<World> (*)();

template <typename W>
std::unique_ptr<World> make() {
    return std::make_unique<W>();
}

class DispatcherContract : public testing::TestWithParam<WorldMaker> {
  protected:
    Dispatcher& dispatcher() { return world_->dispatcher(); }
    std::string threadName() { return dispatcher().isMainThread() ? "main" : "other"; }
    Dispatcher::Block recorded(const std::string& entry) {
        return [this, entry] { record_.add(entry); };
    }
    Dispatcher::Block recordedThread() {
        return [this] { record_.add(threadName()); };
    }
    void recordFailures() {
        dispatcher().setFailureHandler([this](const Dispatcher::Block&, std::exception_ptr failure) {
            try {
                std::rethrow_exception(failure);
            } catch (const std::exception& exception) {
                record_.add(exception.what());
            }
        });
    }

    Record record_;
    std::unique_ptr<World> world_ = GetParam()();
};

INSTANTIATE_TEST_SUITE_P(Dispatchers, DispatcherContract,
                         testing::Values(make<VirtualWorld>, make<MachineWorld>),
                         [](const auto& test) { return test.index == 0 ? "Virtual" : "Machine"; });

void fail(const char* reason) {
    throw std::runtime_error(reason);
}

}  // namespace

TEST_P(DispatcherContract, TheThreadThatMadeItIsTheMainThread) {
    EXPECT_TRUE(dispatcher().isMainThread());
    EXPECT_FALSE(std::async(std::launch::async, [&] { return dispatcher().isMainThread(); }).get());
}

TEST_P(DispatcherContract, BackgroundBlocksRunOffTheMainThread) {
    dispatcher().asyncInBackground(recordedThread());
    dispatcher().afterInBackground(1ms, recordedThread());
    world_->waitFor(record_, 2);
    EXPECT_THAT(record_.entries(), ElementsAre("other", "other"));
}

TEST_P(DispatcherContract, RunLoopBlocksRunOnTheMainThread) {
    dispatcher().performOnMainRunLoop(1ms, commonModes, recordedThread());
    world_->waitFor(record_, 1);
    EXPECT_THAT(record_.entries(), ElementsAre("main"));
}

TEST_P(DispatcherContract, DetachedThreadsAreNotTheMainThread) {
    dispatcher().detachThread("watcher", 0.5, recordedThread());
    world_->waitFor(record_, 1);
    EXPECT_THAT(record_.entries(), ElementsAre("other"));
}

TEST_P(DispatcherContract, RunLoopBlocksRunInTheOrderInWhichTheyAreDue) {
    dispatcher().performOnMainRunLoop(20ms, commonModes, recorded("third"));
    dispatcher().performOnMainRunLoop(2ms, commonModes, recorded("second"));
    dispatcher().performOnMainRunLoop(0ms, commonModes, recorded("first"));
    world_->waitFor(record_, 3);
    EXPECT_THAT(record_.entries(), ElementsAre("first", "second", "third"));
}

TEST_P(DispatcherContract, RunLoopBlocksThatAreDueAtOnceRunInTheOrderInWhichTheyCame) {
    for (const char* const entry : {"a", "b", "c", "d"})
        dispatcher().performOnMainRunLoop(-1ms, commonModes, recorded(entry));
    world_->waitFor(record_, 4);
    EXPECT_THAT(record_.entries(), ElementsAre("a", "b", "c", "d"));
}

TEST_P(DispatcherContract, ABlockMayHandOverOthers) {
    dispatcher().asyncInBackground([this] {
        record_.add("background");
        dispatcher().performOnMainRunLoop(1ms, commonModes, [this] {
            record_.add("main");
            dispatcher().detachThread("last", 0.5, recorded("thread"));
        });
    });
    world_->waitFor(record_, 3);
    EXPECT_THAT(record_.entries(), ElementsAre("background", "main", "thread"));
}

TEST_P(DispatcherContract, AFailureGoesToTheHandler) {
    recordFailures();
    dispatcher().asyncInBackground([] { fail("background"); });
    world_->waitFor(record_, 1);
    dispatcher().performOnMainRunLoop(0ms, commonModes, [] { fail("main"); });
    world_->waitFor(record_, 2);
    dispatcher().detachThread("failing", 0.5, [] { fail("thread"); });
    world_->waitFor(record_, 3);
    EXPECT_THAT(record_.entries(), ElementsAre("background", "main", "thread"));
}

TEST_P(DispatcherContract, TheHandlerReceivesTheBlockAndMayRunItAgain) {
    int runs = 0;
    dispatcher().setFailureHandler([](const Dispatcher::Block& block, std::exception_ptr) { block(); });
    dispatcher().asyncInBackground([this, &runs] {
        if (++runs == 1)
            fail("the first time");
        record_.add("ran again");
    });
    world_->waitFor(record_, 1);
    EXPECT_THAT(record_.entries(), ElementsAre("ran again"));
}

TEST_P(DispatcherContract, AFailureThatNobodyHandlesHarmsNoOtherBlock) {
    dispatcher().performOnMainRunLoop(0ms, commonModes, [] { throw 42; });
    dispatcher().performOnMainRunLoop(0ms, commonModes, recorded("next"));
    world_->waitFor(record_, 1);
    EXPECT_THAT(record_.entries(), ElementsAre("next"));
}

TEST_P(DispatcherContract, WhatABlockHoldsGoesAfterItsRun) {
    auto held = std::make_shared<int>(1);
    const std::weak_ptr<int> watched = held;
    dispatcher().performOnMainRunLoop(0ms, commonModes,
                                      [this, held = std::move(held)] { record_.add(std::to_string(*held)); });
    world_->waitFor(record_, 1);
    EXPECT_TRUE(watched.expired());
}

TEST_P(DispatcherContract, WaitingBlocksAreDroppedWithTheDispatcher) {
    auto held = std::make_shared<int>(1);
    const std::weak_ptr<int> watched = held;
    dispatcher().afterInBackground(24h, [this, held] { record_.add("background"); });
    dispatcher().performOnMainRunLoop(24h, commonModes, [this, held] { record_.add("main"); });
    held.reset();
    EXPECT_FALSE(watched.expired());
    world_->destroyDispatcher();
    EXPECT_TRUE(watched.expired());
    EXPECT_THAT(record_.entries(), ElementsAre());
}

TEST_P(DispatcherContract, TheLongestDelayIsNotDueAtOnce) {
    dispatcher().afterInBackground(Dispatcher::Delay::max() / 4, recorded("far away"));
    dispatcher().performOnMainRunLoop(Dispatcher::Delay::max() / 4, commonModes, recorded("far away"));
    dispatcher().performOnMainRunLoop(5ms, commonModes, recorded("now"));
    world_->waitFor(record_, 1);
    EXPECT_THAT(record_.entries(), ElementsAre("now"));
}

// --- The tests' own dispatcher

TEST(VirtualDispatcher, RunsNothingBeforeItsTime) {
    VirtualDispatcher dispatcher;
    std::vector<Dispatcher::Delay> times;
    dispatcher.afterInBackground(10s, [&] { times.push_back(dispatcher.now()); });
    dispatcher.advance(9999ms);
    EXPECT_THAT(times, ElementsAre());
    EXPECT_EQ(dispatcher.pendingCount(), 1u);
    dispatcher.advance(5s);
    EXPECT_THAT(times, ElementsAre(10s));
    EXPECT_EQ(dispatcher.now(), 14999ms);
}

TEST(VirtualDispatcher, BlocksHandedOverOnTheWayRunWithinTheSameAdvance) {
    VirtualDispatcher dispatcher;
    std::vector<Dispatcher::Delay> times;
    dispatcher.afterInBackground(1s, [&] {
        dispatcher.afterInBackground(1s, [&] { times.push_back(dispatcher.now()); });
        dispatcher.afterInBackground(3s, [&] { times.push_back(dispatcher.now()); });
    });
    dispatcher.advance(3s);
    EXPECT_THAT(times, ElementsAre(2s));
}

TEST(VirtualDispatcher, RemembersEveryRequest) {
    using Place = VirtualDispatcher::Place;
    VirtualDispatcher dispatcher;
    dispatcher.asyncInBackground([] {});
    dispatcher.afterInBackground(2s, [] {});
    dispatcher.performOnMainRunLoop(3s, {RunLoopMode::NSModalPanelRunLoopMode}, [] {});
    dispatcher.detachThread("mounts", 0.1, [] {});
    EXPECT_THAT(
        dispatcher.requests(),
        ElementsAre(
            VirtualDispatcher::Request{.place = Place::background},
            VirtualDispatcher::Request{.place = Place::background, .delay = 2s},
            VirtualDispatcher::Request{
                .place = Place::mainRunLoop, .delay = 3s, .modes = {RunLoopMode::NSModalPanelRunLoopMode}},
            VirtualDispatcher::Request{.place = Place::ownThread, .name = "mounts", .priority = 0.1}));
}

TEST(VirtualDispatcher, CountsFailuresThatNobodyTook) {
    VirtualDispatcher dispatcher;
    dispatcher.asyncInBackground([] { fail("no handler"); });
    dispatcher.runDueBlocks();
    EXPECT_EQ(dispatcher.unhandledFailures(), 1u);
    EXPECT_TRUE(dispatcher.isMainThread());
}

// --- The machine's

TEST(LinuxDispatcher, TwoBackgroundBlocksRunAtTheSameTime) {
    CollectedLog log;
    LinuxDispatcher dispatcher(log);
    std::promise<void> first, second;
    std::promise<bool> met;
    dispatcher.asyncInBackground([&] {
        first.set_value();
        met.set_value(second.get_future().wait_for(30s) == std::future_status::ready);
    });
    dispatcher.asyncInBackground([&] {
        first.get_future().wait();
        second.set_value();
    });
    EXPECT_TRUE(met.get_future().get());
}

TEST(LinuxDispatcher, BackgroundBlocksHaveTheLowestPriorities) {
    CollectedLog log;
    LinuxDispatcher dispatcher(log);
    struct Priorities {
        int nice, policy;
        long inputOutput;
    };
    std::promise<Priorities> promise;
    dispatcher.asyncInBackground([&] {
        promise.set_value({getpriority(PRIO_PROCESS, static_cast<id_t>(gettid())), sched_getscheduler(0),
                           syscall(SYS_ioprio_get, /*IOPRIO_WHO_PROCESS*/ 1, gettid())});
    });
    const auto priorities = promise.get_future().get();
    EXPECT_EQ(priorities.nice, 19);
    EXPECT_EQ(priorities.policy, SCHED_BATCH);
    EXPECT_EQ(priorities.inputOutput >> 13, 3);  // the idle class, as ioprio_set(2) has it
}

TEST(LinuxDispatcher, AThreadDetachedFromTheBackgroundHasItsOwnPriority) {
    CollectedLog log;
    LinuxDispatcher dispatcher(log);
    std::promise<std::pair<int, int>> promise;
    dispatcher.asyncInBackground([&] {
        dispatcher.detachThread("normal", 0.5, [&] {
            promise.set_value(
                {getpriority(PRIO_PROCESS, static_cast<id_t>(gettid())), sched_getscheduler(0)});
        });
    });
    const int normal = getpriority(PRIO_PROCESS, static_cast<id_t>(gettid()));
    EXPECT_EQ(promise.get_future().get(), std::pair(normal, sched_getscheduler(0)));
}

TEST(LinuxDispatcher, ALowThreadPriorityLowersTheNiceValue) {
    CollectedLog log;
    LinuxDispatcher dispatcher(log);
    std::promise<int> promise;
    dispatcher.detachThread(
        "low", 0.0, [&] { promise.set_value(getpriority(PRIO_PROCESS, static_cast<id_t>(gettid()))); });
    constexpr int lowest = 19;
    EXPECT_EQ(promise.get_future().get(), std::min(getpriority(PRIO_PROCESS, 0) + 19, lowest));
}

TEST(ThreadPriority, MapsToStepsOfTheNiceValue) {
    using platform::niceStepForPriority;
    EXPECT_EQ(niceStepForPriority(0.0), 19);
    EXPECT_EQ(niceStepForPriority(0.25), 10);
    EXPECT_EQ(niceStepForPriority(0.5), 0);
    EXPECT_EQ(niceStepForPriority(0.75), -10);
    EXPECT_EQ(niceStepForPriority(1.0), -20);
    EXPECT_EQ(niceStepForPriority(7.0), -20);
}

std::string nameOfThisThread() {
    char name[32] = {};
    pthread_getname_np(pthread_self(), name, sizeof name);
    return name;
}

TEST(LinuxDispatcher, AThreadThatIsDoneLetsGoOfItsBlockAndTakesTheNext) {
    CollectedLog log;
    LinuxDispatcher dispatcher(log);
    constexpr int blocks = 200;
    std::map<pid_t, std::weak_ptr<int>> heldByLatestBlock;
    for (int i = 0; i < blocks; ++i) {
        auto held = std::make_shared<int>(i);
        const std::weak_ptr<int> watched = held;
        const std::string name = "block " + std::to_string(i);
        std::promise<pid_t> thread;
        dispatcher.detachThread(name, 0.5, [&thread, &heldByLatestBlock, name, held = std::move(held)] {
            EXPECT_TRUE(heldByLatestBlock[gettid()].expired());
            EXPECT_EQ(nameOfThisThread(), name);
            thread.set_value(gettid());
        });
        heldByLatestBlock[thread.get_future().get()] = watched;
    }
    EXPECT_LT(heldByLatestBlock.size(), blocks / 2);
}

TEST(LinuxDispatcher, BlocksOfSeveralPrioritiesHaveTheirOwn) {
    CollectedLog log;
    LinuxDispatcher dispatcher(log);
    const int normal = getpriority(PRIO_PROCESS, static_cast<id_t>(gettid()));
    constexpr int lowest = 19;
    for (int i = 0; i < 50; ++i) {
        for (const auto& [priority, expected] : {std::pair(0.5, normal), std::pair(0.0, lowest)}) {
            std::promise<int> promise;
            dispatcher.detachThread("any", priority, [&] {
                promise.set_value(getpriority(PRIO_PROCESS, static_cast<id_t>(gettid())));
            });
            ASSERT_EQ(promise.get_future().get(), expected);
        }
    }
}

TEST(LinuxDispatcher, ThreadsCarryTheBeginningOfTheirName) {
    CollectedLog log;
    LinuxDispatcher dispatcher(log);
    std::promise<std::string> promise;
    dispatcher.detachThread("mount notification", 0.5, [&] { promise.set_value(nameOfThisThread()); });
    EXPECT_EQ(promise.get_future().get(), "mount notificat");
}

TEST(LinuxDispatcher, ADelayIsNeverCutShort) {
    MachineWorld world;
    Record record;
    const auto start = std::chrono::steady_clock::now();
    std::atomic<std::chrono::nanoseconds> background{}, main{};
    world.dispatcher().afterInBackground(15ms, [&] {
        background = std::chrono::steady_clock::now() - start;
        record.add("background");
    });
    world.dispatcher().performOnMainRunLoop(15ms, commonModes, [&] {
        main = std::chrono::steady_clock::now() - start;
        record.add("main");
    });
    world.waitFor(record, 2);
    EXPECT_GE(background.load(), 15ms);
    EXPECT_GE(main.load(), 15ms);
}

TEST(LinuxDispatcher, ADelayedBlockDoesNotHoldUpLaterOnes) {
    CollectedLog log;
    LinuxDispatcher dispatcher(log);
    std::promise<void> ran;
    dispatcher.afterInBackground(24h, [] {});
    dispatcher.afterInBackground(24h, [] {});
    dispatcher.asyncInBackground([&] { ran.set_value(); });
    EXPECT_EQ(ran.get_future().wait_for(30s), std::future_status::ready);
}

TEST(LinuxDispatcher, DestructionWaitsForTheBlocksThatRun) {
    CollectedLog log;
    std::atomic<int> finished = 0;
    std::promise<void> inBackground, onThread;
    const auto slow = [&](std::promise<void>& started) {
        started.set_value();
        for (int i = 0; i < 1000; ++i)
            std::this_thread::yield();
        ++finished;
    };
    {
        LinuxDispatcher dispatcher(log);
        dispatcher.asyncInBackground([&] { slow(inBackground); });
        dispatcher.detachThread("slow", 0.5, [&] { slow(onThread); });
        inBackground.get_future().wait();
        onThread.get_future().wait();
    }
    EXPECT_EQ(finished, 2);
}

TEST(LinuxDispatcher, ABlockThatRunsDuringDestructionMayHandOverOthers) {
    CollectedLog log;
    auto held = std::make_shared<int>(1);
    const std::weak_ptr<int> watched = held;
    std::promise<void> started;
    {
        LinuxDispatcher dispatcher(log);
        dispatcher.detachThread("handing over", 0.5, [&dispatcher, &started, held = std::move(held)] {
            started.set_value();
            for (int i = 0; i < 1000; ++i) {
                dispatcher.afterInBackground(24h, [held] {});
                dispatcher.performOnMainRunLoop(24h, commonModes, [held] {});
            }
        });
        started.get_future().wait();
    }
    EXPECT_TRUE(watched.expired());
}

TEST(LinuxDispatcher, ABlockMayRunAMainLoopOfItsOwn) {
    MachineWorld world;
    Record record;
    world.dispatcher().performOnMainRunLoop(0ms, commonModes, [&] {
        world.dispatcher().performOnMainRunLoop(0ms, {RunLoopMode::NSModalPanelRunLoopMode},
                                                [&] { record.add("inside"); });
        world.waitFor(record, 1);
        record.add("outside");
    });
    world.waitFor(record, 2);
    EXPECT_THAT(record.entries(), ElementsAre("inside", "outside"));
}

TEST(LinuxDispatcher, FailuresThatNobodyTakesAreLogged) {
    MachineWorld world;
    Record record;
    world.dispatcher().performOnMainRunLoop(0ms, commonModes, [] { fail("two\nlines"); });
    world.dispatcher().performOnMainRunLoop(0ms, commonModes, [] { throw 42; });
    world.dispatcher().performOnMainRunLoop(0ms, commonModes, [&] {
        world.dispatcher().setFailureHandler([](const auto&, auto) { fail("the handler itself"); });
    });
    world.dispatcher().performOnMainRunLoop(0ms, commonModes, [] { fail("handled"); });
    world.dispatcher().performOnMainRunLoop(0ms, commonModes, [&] { record.add("end"); });
    world.waitFor(record, 1);
    EXPECT_THAT(world.logLines(),
                ElementsAre("a block failed: two\\x0alines", "a block failed for an unknown reason",
                            "a block failed: the handler itself"));
}

TEST(LinuxDispatcher, ManyThreadsMayHandOverBlocksAtOnce) {
    CollectedLog log;
    std::atomic<int> runs = 0;
    constexpr int threads = 8, blocks = 200;
    {
        LinuxDispatcher dispatcher(log);
        std::promise<void> all;
        std::vector<std::thread> callers;
        for (int i = 0; i < threads; ++i)
            callers.emplace_back([&] {
                for (int k = 0; k < blocks; ++k)
                    dispatcher.afterInBackground(std::chrono::microseconds(k % 7), [&] {
                        if (++runs == threads * blocks)
                            all.set_value();
                    });
            });
        for (auto& caller : callers)
            caller.join();
        EXPECT_EQ(all.get_future().wait_for(30s), std::future_status::ready);
    }
    EXPECT_EQ(runs, threads * blocks);
}
