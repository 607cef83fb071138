// What the kernel lets this user watch.
#pragma once

#include <cstdint>
#include <optional>

namespace vexo {

// From /proc/sys/fs/inotify; nil where the kernel doesn't tell.
struct WatchLimits {
    std::optional<std::int64_t> maxUserWatches;    // folders that all programs of a user may watch together
    std::optional<std::int64_t> maxUserInstances;  // watchers
    std::optional<std::int64_t> maxQueuedEvents;   // changes that may wait for one watcher
};

WatchLimits readWatchLimits();

}  // namespace vexo
