// Which paths can be looked at without waiting for ever.
//
// Whoever asks a server that is gone waits in the kernel until it comes back. So a process of its own looks
// at a network or FUSE mount first, and what lies on one that doesn't answer in time is out of reach until it
// does. An answer counts for a second: a server that goes within it still holds up who looks at its files
// then, and so does one that answers for the mount from what it remembers.
//
// Callable from any thread.
#pragma once

#include <chrono>
#include <map>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "platform/SystemLog.h"
#include "platform/ThreadSafety.h"
#include "platform/linux/MountTable.h"
#include "platform/linux/ServedWays.h"

namespace platform {

class MountReach {
  public:
    // A server that was idle takes some seconds to answer.
    static constexpr std::chrono::seconds usualPatience{10};

    // The table and the log must outlive it. What was found out counts as long as it is fresh.
    MountReach(const MountTable& table, SystemLog& log, std::chrono::milliseconds patience = usualPatience,
               std::chrono::milliseconds freshness = std::chrono::seconds(1));
    ~MountReach();

    // Waits for a mount that is looked at, until the patience is over that began with the look. The log gets
    // a line about one that is out of reach.
    bool isInReach(const std::string& path) const VX_EXCLUDES(mutex_);

  private:
    class Server;
    using ServerRef = std::shared_ptr<Server>;
    using Clock = std::chrono::steady_clock;

    std::vector<ServerRef> serversOnTheWayTo(const std::string& path) const VX_EXCLUDES(mutex_);
    void keepUpToDate() const VX_REQUIRES(mutex_);
    void forgetServers() const VX_REQUIRES(mutex_);

    const MountTable& table_;
    SystemLog& log_;
    const std::chrono::milliseconds patience_;
    const std::chrono::milliseconds freshness_;

    mutable Mutex mutex_;
    mutable std::optional<Clock::time_point> upToDateUntil_ VX_GUARDED_BY(mutex_);
    mutable MountTable::MountPoints served_ VX_GUARDED_BY(mutex_);
    mutable std::optional<ServedWays> ways_ VX_GUARDED_BY(mutex_);
    mutable std::map<std::string, ServerRef> servers_ VX_GUARDED_BY(mutex_);  // by mount point
};

}  // namespace platform
