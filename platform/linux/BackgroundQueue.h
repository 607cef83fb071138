// The worker threads for background blocks, at the lowest processor and input/output priority. An idle queue
// sleeps until a block comes or is due.
#pragma once

#include <condition_variable>
#include <functional>
#include <optional>
#include <thread>
#include <vector>

#include "platform/Dispatcher.h"
#include "platform/ThreadSafety.h"
#include "platform/linux/BlockQueue.h"

namespace platform {

class BackgroundQueue {
  public:
    // What runs a block; it lets no exception out.
    using Run = std::function<void(const Dispatcher::Block& block)>;

    explicit BackgroundQueue(Run run);

    // After close the block is dropped.
    void add(Dispatcher::Delay delay, Dispatcher::Block block) VX_EXCLUDES(mutex_);
    // Waits for the running blocks and drops the others. Called once, before the destruction.
    void close() VX_EXCLUDES(mutex_);

  private:
    void work();
    std::optional<Dispatcher::Block> nextBlock() VX_EXCLUDES(mutex_);
    void waitForWork() VX_REQUIRES(mutex_);

    const Run run_;
    std::vector<std::thread> workers_;

    Mutex mutex_;
    std::condition_variable_any changed_;
    BlockQueue blocks_ VX_GUARDED_BY(mutex_);
    bool closed_ VX_GUARDED_BY(mutex_) = false;
};

}  // namespace platform
