// Blocks on the main run loop, which is GLib's default main context, so that any program that runs one hosts
// us. One event source waits for the block that is due first; between two blocks the loop does its other
// work.
#pragma once

#include <glib.h>

#include <functional>

#include "platform/Dispatcher.h"
#include "platform/ThreadSafety.h"
#include "platform/linux/BlockQueue.h"

namespace platform {

// Made and closed on the main thread.
class MainLoopQueue {
  public:
    // What runs a block; it lets no exception out.
    using Run = std::function<void(const Dispatcher::Block& block)>;

    explicit MainLoopQueue(Run run);

    // Callable from any thread. After close the block is dropped.
    void add(Dispatcher::Delay delay, Dispatcher::Block block) VX_EXCLUDES(mutex_);
    // Drops the waiting blocks. Called once, before the destruction.
    void close() VX_EXCLUDES(mutex_);

  private:
    void runNext() VX_EXCLUDES(mutex_);
    void waitForNext() VX_REQUIRES(mutex_);

    const Run run_;
    GSource* const source_;

    Mutex mutex_;
    BlockQueue blocks_ VX_GUARDED_BY(mutex_);
    bool closed_ VX_GUARDED_BY(mutex_) = false;
};

}  // namespace platform
