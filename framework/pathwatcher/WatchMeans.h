// What a watched path is watched with; shared by all of them.
#pragma once

#include <functional>
#include <optional>
#include <string>

#include "framework/pathwatcher/ChangeBurst.h"
#include "framework/pathwatcher/FolderAccess.h"
#include "framework/pathwatcher/FolderPolling.h"
#include "framework/pathwatcher/MountKinds.h"
#include "framework/pathwatcher/Watches.h"

namespace vexo {

struct WatchMeans {
    Watches& watches;
    const FolderAccess& folders;
    FolderPolling& polling;
    ChangeBurst& burst;
    // "/Volumes/<display name>/…" as the path of that volume; nil while there is none.
    std::function<std::optional<std::string>(const std::string& path)> resolvedPath;
    std::function<void(const std::string& warning)> warn;
    // To be told of what is polled because it could not be watched, with errno.
    std::function<void(const std::string& folder, int error)> warnOfFailure;
    MountKinds mounts = {};
};

}  // namespace vexo
