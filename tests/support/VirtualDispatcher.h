// A dispatcher whose clock stands still until a test moves it. Blocks run on the thread that advances the
// clock, one after another, so what a test sees never depends on luck.
//
// Blocks may be handed over, and run, on any thread; everything else belongs to the thread that made the
// dispatcher, which counts as the main thread except while it runs a background block or a thread's block.
#pragma once

#include <cstddef>
#include <map>
#include <string>
#include <thread>
#include <vector>

#include "platform/Dispatcher.h"
#include "platform/ThreadSafety.h"

namespace testing_support {

class VirtualDispatcher final : public platform::Dispatcher {
  public:
    enum class Place { background, mainRunLoop, ownThread };

    // What was asked for. Modes belong to the main run loop, name and priority to threads.
    struct Request {
        Place place = Place::background;
        Delay delay = Delay::zero();
        std::vector<platform::RunLoopMode> modes = {};
        std::string name = {};
        double priority = 0;

        bool operator==(const Request&) const = default;
    };

    // Moves the clock on and runs every block that becomes due on the way, also those that blocks hand over,
    // in the order in which they are due. While a block runs, the clock shows when it was due.
    void advance(Delay duration) VX_EXCLUDES(mutex_);
    // Runs what is due now.
    void runDueBlocks() { advance(Delay::zero()); }

    Delay now() const VX_EXCLUDES(mutex_);                                // since the dispatcher was made
    std::vector<Request> requests() const VX_EXCLUDES(mutex_);            // all that were ever made, in order
    std::size_t pendingCount() const VX_EXCLUDES(mutex_);                 // blocks that have not run
    std::size_t unhandledFailures() const { return unhandledFailures_; }  // those that no handler took

    bool isMainThread() const override;
    void asyncInBackground(Block block) override;
    void afterInBackground(Delay delay, Block block) override;
    void performOnMainRunLoop(Delay delay, std::vector<platform::RunLoopMode> modes, Block block) override;
    void detachThread(std::string_view name, double priority, Block block) override;
    void setFailureHandler(FailureHandler handler) override { failureHandler_ = std::move(handler); }

  private:
    struct Pending {
        Place place;
        Block block;
    };

    void add(Request request, Block block) VX_EXCLUDES(mutex_);
    bool runNextUntil(Delay end) VX_EXCLUDES(mutex_);
    void run(const Pending& pending);
    void handle(const Block& block, std::exception_ptr failure);

    const std::thread::id mainThread_ = std::this_thread::get_id();

    mutable platform::Mutex mutex_;
    Delay now_ VX_GUARDED_BY(mutex_) = Delay::zero();
    std::multimap<Delay, Pending> pending_ VX_GUARDED_BY(mutex_);  // by the time they are due
    std::vector<Request> requests_ VX_GUARDED_BY(mutex_);

    static inline thread_local bool isOffMainThread_ = false;  // runs a block that is not the main thread's

    // The main thread's own.
    FailureHandler failureHandler_;
    std::size_t unhandledFailures_ = 0;
};

}  // namespace testing_support
