#include "framework/pathwatcher/WatchLimits.h"

#include <fstream>
#include <string>

namespace vexo {
namespace {

std::optional<std::int64_t> readLimit(const char* name) {
    std::ifstream file(std::string("/proc/sys/fs/inotify/") + name);
    std::int64_t limit = 0;
    return file >> limit ? std::optional(limit) : std::nullopt;
}

}  // namespace

WatchLimits readWatchLimits() {
    return {readLimit("max_user_watches"), readLimit("max_user_instances"), readLimit("max_queued_events")};
}

}  // namespace vexo
