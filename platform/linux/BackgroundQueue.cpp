#include "platform/linux/BackgroundQueue.h"

#include "platform/linux/ThreadPriority.h"

namespace platform {

namespace {

// Two, so that one slow disk does not hold up what concerns another.
constexpr int workerCount = 2;

}  // namespace

BackgroundQueue::BackgroundQueue(Run run) : run_(std::move(run)) {
    for (int i = 0; i < workerCount; ++i)
        workers_.emplace_back([this] { work(); });
}

void BackgroundQueue::add(Dispatcher::Delay delay, Dispatcher::Block block) {
    Locked lock(mutex_);
    if (closed_)
        return;
    blocks_.add(BlockQueue::dueAfter(delay), std::move(block));
    changed_.notify_one();
}

// The dropped blocks go outside the lock: what they hold may call back when it goes.
void BackgroundQueue::close() {
    BlockQueue dropped;
    {
        Locked lock(mutex_);
        closed_ = true;
        std::swap(dropped, blocks_);
        changed_.notify_all();
    }
    for (auto& worker : workers_)
        worker.join();
}

void BackgroundQueue::work() {
    nameThisThread("background");
    lowerThisThreadToBackground();
    while (const auto block = nextBlock())
        run_(*block);
}

std::optional<Dispatcher::Block> BackgroundQueue::nextBlock() {
    Locked lock(mutex_);
    while (!closed_) {
        if (auto block = blocks_.takeDue(BlockQueue::Clock::now()))
            return block;
        waitForWork();
    }
    return std::nullopt;
}

void BackgroundQueue::waitForWork() {
    if (blocks_.empty())
        changed_.wait(mutex_);
    else
        changed_.wait_until(mutex_, blocks_.nextDue());
}

}  // namespace platform
