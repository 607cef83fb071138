#include "framework/pathwatcher/MountChanges.h"

#include <fcntl.h>
#include <gio/gunixmounts.h>
#include <poll.h>

namespace vexo {

namespace {

std::string textOrEmpty(const char* text) {
    return text ? text : "";
}

platform::MountEntry entryOf(GUnixMountEntry* mount) {
    return {textOrEmpty(g_unix_mount_get_mount_path(mount)), textOrEmpty(g_unix_mount_get_device_path(mount)),
            textOrEmpty(g_unix_mount_get_fs_type(mount)), textOrEmpty(g_unix_mount_get_root_path(mount))};
}

}  // namespace

SystemMountChanges::SystemMountChanges() : changes_(open("/proc/self/mountinfo", O_RDONLY | O_CLOEXEC)) {}

bool SystemMountChanges::happened() {
    pollfd request{changes_.number(), POLLPRI, 0};
    return changes_ && poll(&request, 1, 0) > 0 && (request.revents & (POLLPRI | POLLERR));
}

MountKinds SystemMountChanges::table() const {
    std::vector<platform::MountEntry> table;
    GList* const mounts = g_unix_mounts_get(nullptr);
    for (const GList* link = mounts; link; link = link->next)
        table.push_back(entryOf(static_cast<GUnixMountEntry*>(link->data)));
    g_list_free_full(mounts, [](gpointer mount) { g_unix_mount_free(static_cast<GUnixMountEntry*>(mount)); });
    return MountKinds(table);
}

}  // namespace vexo
