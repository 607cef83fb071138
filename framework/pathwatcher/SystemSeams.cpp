#include "framework/pathwatcher/SystemSeams.h"

#include "framework/pathwatcher/InotifyEvents.h"
#include "framework/pathwatcher/PollingThreads.h"
#include "platform/FileManager.h"
#include "platform/Services.h"

namespace vexo {

WatchSeams systemSeams(const std::shared_ptr<const WakeSignal>& wake,
                       std::chrono::milliseconds pollInterval) {
    return {std::make_unique<InotifyEvents>(), std::make_unique<DiskAccess>(),
            std::make_unique<SystemMountChanges>(), std::make_unique<PollingThreads>(wake, pollInterval),
            [](const std::string& path) { return platform::services().fileManager.resolvedPath(path); }};
}

}  // namespace vexo
