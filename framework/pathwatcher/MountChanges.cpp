#include "framework/pathwatcher/MountChanges.h"

#include <fcntl.h>
#include <poll.h>

#include "platform/linux/MountTable.h"

namespace vexo {

SystemMountChanges::SystemMountChanges() : changes_(open("/proc/self/mountinfo", O_RDONLY | O_CLOEXEC)) {}

bool SystemMountChanges::happened() {
    pollfd request{changes_.number(), POLLPRI, 0};
    return changes_ && poll(&request, 1, 0) > 0 && (request.revents & (POLLPRI | POLLERR));
}

MountKinds SystemMountChanges::table() const {
    return MountKinds(platform::mountEntries());
}

}  // namespace vexo
