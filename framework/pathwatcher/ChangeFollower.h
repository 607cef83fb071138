// Follows the changes of all registered paths and hands them to those who registered them.
//
// Its thread's work is a step, done again and again; tests do the steps themselves. Paths may be added from
// any thread meanwhile.
#pragma once

#include <atomic>
#include <chrono>
#include <functional>
#include <memory>
#include <string>
#include <vector>

#include "framework/pathwatcher/ChangeDelivery.h"
#include "framework/pathwatcher/WakeSignal.h"
#include "framework/pathwatcher/WatchRegistrations.h"
#include "framework/pathwatcher/WatchedPaths.h"
#include "platform/ThreadSafety.h"

namespace vexo {

class ChangeFollower {
  public:
    using WarningHandler = std::function<void(const std::string& warning)>;

    static constexpr std::chrono::milliseconds forever = std::chrono::milliseconds::max();

    // `wake` is what the seams raise when they have something to tell.
    ChangeFollower(WatchSeams seams, std::shared_ptr<const WakeSignal> wake,
                   std::shared_ptr<const WatchRegistrations> registrations,
                   std::shared_ptr<ChangeDelivery> delivery, WarningHandler warn);

    // Watches a registered path. When the call returns, no change goes unnoticed any more, except where
    // changes have to be polled. Paths that are not absolute are left alone.
    void watch(const std::string& path) VX_EXCLUDES(mutex_);

    // Waits until there is something to do, `atMost` as long, and does it. Answers false once it is closed.
    bool step(std::chrono::milliseconds atMost) VX_EXCLUDES(mutex_);
    // Whether there are changes that are kept for the rest of their burst.
    bool keepsChanges() const VX_EXCLUDES(mutex_);
    // Ends the current and every later step, and what other threads have begun to watch.
    void close() VX_EXCLUDES(mutex_);

    // Requires: `watchedPath` is registered, and `path` is it or below it.
    WatchState stateOf(const std::string& watchedPath, const std::string& path) const VX_EXCLUDES(mutex_);
    // The paths, as reported, of all folders that are watched through events.
    std::vector<std::string> watchedFolders() const VX_EXCLUDES(mutex_);

  private:
    using Clock = std::chrono::steady_clock;

    struct News {
        bool events = false;
        bool mounts = false;
    };
    News wait(std::chrono::milliseconds atMost) VX_EXCLUDES(mutex_);
    std::chrono::milliseconds untilDue() const VX_EXCLUDES(mutex_);
    void letEventsGather() const;
    ChangeBurst::Changes takeIn(const News& news) VX_EXCLUDES(mutex_);
    void handOut(ChangeBurst::Changes changes) VX_EXCLUDES(mutex_);
    std::vector<std::string> takeWarnings() VX_EXCLUDES(mutex_);
    void forgetUnwanted(const std::string& path) VX_EXCLUDES(mutex_);

    const std::shared_ptr<const WakeSignal> wake_;
    const std::shared_ptr<const WatchRegistrations> registrations_;
    const std::shared_ptr<ChangeDelivery> delivery_;
    const WarningHandler warn_;
    std::atomic<bool> closed_ = false;

    // Held while folders are listed, but not while anybody is told of anything.
    mutable platform::Mutex mutex_;
    WatchedPaths paths_ VX_GUARDED_BY(mutex_);
};

}  // namespace vexo
