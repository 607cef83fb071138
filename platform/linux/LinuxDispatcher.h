// The machine's threads and GLib's main loop.
#pragma once

#include <thread>

#include "platform/Dispatcher.h"
#include "platform/SystemLog.h"
#include "platform/ThreadSafety.h"
#include "platform/linux/BackgroundQueue.h"
#include "platform/linux/DetachedThreads.h"
#include "platform/linux/MainLoopQueue.h"

namespace platform {

// The main thread is the one that makes the dispatcher. It destroys it too, outside every block: that waits
// for the blocks that run in the background and on threads of their own, and drops all others.
//
// A failure that no handler takes is a line in the system log.
class LinuxDispatcher final : public Dispatcher {
  public:
    // `systemLog` must outlive the dispatcher.
    explicit LinuxDispatcher(SystemLog& systemLog);
    ~LinuxDispatcher() override;
    LinuxDispatcher(const LinuxDispatcher&) = delete;
    LinuxDispatcher& operator=(const LinuxDispatcher&) = delete;

    bool isMainThread() const override { return std::this_thread::get_id() == mainThread_; }
    void asyncInBackground(Block block) override;
    void afterInBackground(Delay delay, Block block) override;
    void performOnMainRunLoop(Delay delay, std::vector<RunLoopMode> modes, Block block) override;
    void detachThread(std::string_view name, double priority, Block block) override;
    void setFailureHandler(FailureHandler handler) override VX_EXCLUDES(mutex_);

  private:
    void run(const Block& block) noexcept;
    void handle(const Block& block, std::exception_ptr failure) VX_EXCLUDES(mutex_);
    void logFailure(const std::exception_ptr& failure) const;

    const std::thread::id mainThread_;
    SystemLog& systemLog_;

    Mutex mutex_;
    FailureHandler failureHandler_ VX_GUARDED_BY(mutex_);

    BackgroundQueue background_;
    MainLoopQueue mainLoop_;
    DetachedThreads threads_;
};

}  // namespace platform
