// Where and when work runs. Nothing else in the system sleeps, asks for the time or starts threads.
//
// Callable from any thread. An exception that leaves a block never leaves the dispatcher: it goes to the
// failure handler, together with the block, on the thread that ran it.
#pragma once

#include <chrono>
#include <exception>
#include <functional>
#include <string_view>
#include <vector>

namespace platform {

// Which states of the main run loop a delayed message may be delivered in. GLib's main context knows no
// modes and delivers in all of them; the modes are kept because callers state them.
enum class RunLoopMode { kCFRunLoopCommonModes, NSModalPanelRunLoopMode };

class Dispatcher {
  public:
    using Block = std::function<void()>;
    using Delay = std::chrono::nanoseconds;
    using FailureHandler = std::function<void(const Block& block, std::exception_ptr failure)>;

    virtual ~Dispatcher() = default;

    // isMainThread of the thread class.
    virtual bool isMainThread() const = 0;

    // dispatch_async and dispatch_after on the global concurrent queue of background priority. What a block
    // holds stays alive until it has run. Blocks that are still waiting when the dispatcher goes are dropped.
    virtual void asyncInBackground(Block block) = 0;
    virtual void afterInBackground(Delay delay, Block block) = 0;

    // performSelector:withObject:afterDelay:inModes: on the main run loop.
    virtual void performOnMainRunLoop(Delay delay, std::vector<RunLoopMode> modes, Block block) = 0;

    // detachNewThreadSelector:toTarget:withObject:; a thread of its own for one block, as long as that
    // runs. `priority` is 0.0 (lowest) to 1.0; 0.5 is normal, and what is above may need rights that the
    // process lacks.
    virtual void detachThread(std::string_view name, double priority, Block block) = 0;

    virtual void setFailureHandler(FailureHandler handler) = 0;
};

}  // namespace platform
