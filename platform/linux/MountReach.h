// Which paths can be looked at without waiting for ever.
//
// The kernel lets nobody out who waits for a server that is gone. So a thread of its own looks at a network
// or FUSE mount first, and what lies on one that doesn't answer in time is out of reach until it does. An
// answer counts for a second: a server that goes within it still holds up who looks at its files then.
//
// Callable from any thread.
#pragma once

#include <chrono>
#include <map>
#include <memory>
#include <optional>
#include <string>

#include "platform/SystemLog.h"
#include "platform/ThreadSafety.h"
#include "platform/linux/MountTable.h"
#include "platform/linux/ServedWays.h"

namespace platform {

class MountReach {
  public:
    // A disk that sleeps takes some seconds to answer.
    static constexpr std::chrono::seconds usualPatience{10};

    // The table and the log must outlive it.
    MountReach(const MountTable& table, SystemLog& log, std::chrono::milliseconds patience = usualPatience);
    ~MountReach();

    // Waits for a mount that is looked at, until the patience is over that began with the look. The log gets
    // a line about one that is out of reach.
    bool isInReach(const std::string& path) const VX_EXCLUDES(mutex_);

  private:
    class Server;
    using Clock = std::chrono::steady_clock;

    // nil for a path that leads to none.
    std::shared_ptr<Server> serverOnTheWayTo(const std::string& path) const VX_EXCLUDES(mutex_);
    void keepUpToDate() const VX_REQUIRES(mutex_);

    const MountTable& table_;
    SystemLog& log_;
    const std::chrono::milliseconds patience_;

    mutable Mutex mutex_;
    mutable std::optional<Clock::time_point> upToDateUntil_ VX_GUARDED_BY(mutex_);
    mutable MountTable::MountPoints served_ VX_GUARDED_BY(mutex_);
    mutable std::optional<ServedWays> ways_ VX_GUARDED_BY(mutex_);
    mutable std::map<std::string, std::shared_ptr<Server>> servers_ VX_GUARDED_BY(mutex_);  // by mount point
};

}  // namespace platform
