// Threads that each run one block at a time.
//
// One thread starts all others. A thread inherits its priority from the one that starts it and may not raise
// it by itself, so one started from a background worker would stay at the bottom.
//
// One whose block has run stays for a moment and takes the next of its priority: during a storm of changes a
// thread is wanted twenty times a second, and starting it costs more than most of them have to do.
#pragma once

#include <condition_variable>
#include <cstdint>
#include <deque>
#include <functional>
#include <map>
#include <optional>
#include <string>
#include <thread>
#include <vector>

#include "platform/Dispatcher.h"
#include "platform/ThreadSafety.h"

namespace platform {

class DetachedThreads {
  public:
    // What runs a block; it lets no exception out.
    using Run = std::function<void(const Dispatcher::Block& block)>;

    // `runWithoutThread` takes the blocks for which the machine has no thread left.
    DetachedThreads(Run run, std::function<void(Dispatcher::Block block)> runWithoutThread);

    // After close the block is dropped.
    void start(std::string name, double priority, Dispatcher::Block block) VX_EXCLUDES(mutex_);
    // Waits for the threads that run and drops the blocks that wait for theirs. Called once, before the
    // destruction.
    void close() VX_EXCLUDES(mutex_);

  private:
    using ThreadNumber = std::uint64_t;
    struct Request {
        std::string name;
        double priority;
        Dispatcher::Block block;
    };
    // A thread without a block, in its own hands.
    struct Idle {
        const double priority;
        std::optional<Request> next;
    };

    // The starter's work.
    void startAndJoin();
    bool waitForWork() VX_EXCLUDES(mutex_);
    void joinFinished() VX_EXCLUDES(mutex_);
    void startRequested() VX_EXCLUDES(mutex_);
    void startThread(Request request);

    // A thread's work.
    void runThread(ThreadNumber number, Request request) VX_EXCLUDES(mutex_);
    // nil when the thread is to end.
    std::optional<Request> nextRequest(ThreadNumber number, double priority) VX_EXCLUDES(mutex_);
    // nil when there is none.
    Idle* idleThread(double priority) VX_REQUIRES(mutex_);

    const Run run_;
    const std::function<void(Dispatcher::Block block)> runWithoutThread_;

    Mutex mutex_;
    std::condition_variable_any changed_;  // for the starter
    std::condition_variable_any handedOver_;
    std::deque<Request> requests_ VX_GUARDED_BY(mutex_);
    std::vector<Idle*> idle_ VX_GUARDED_BY(mutex_);
    std::vector<ThreadNumber> finished_ VX_GUARDED_BY(mutex_);
    bool closed_ VX_GUARDED_BY(mutex_) = false;

    // The starter's own.
    std::map<ThreadNumber, std::thread> running_;
    ThreadNumber lastNumber_ = 0;

    std::thread starter_;  // last, so that it finds everything else made
};

}  // namespace platform
