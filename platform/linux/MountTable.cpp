#include "platform/linux/MountTable.h"

#include <fcntl.h>
#include <gio/gunixmounts.h>
#include <poll.h>

#include "platform/linux/VolumeProperties.h"

namespace platform {

namespace {

std::string textOrEmpty(const char* text) {
    return text ? text : "";
}

std::vector<Mount> volumesOf(const std::vector<MountEntry>& entries) {
    std::vector<Mount> mounts;
    for (const Volume& volume : volumesAmong(entries, isFolderOrUnknown)) {
        const MountEntry& entry = volume.entry;
        mounts.push_back(
            {entry.path, entry.device, entry.fileSystem, displayNameOfVolume(volume), isRemovable(entry)});
    }
    return mounts;
}

}  // namespace

std::vector<MountEntry> mountEntries() {
    std::vector<MountEntry> entries;
    GList* const list = g_unix_mounts_get(nullptr);
    for (GList* link = list; link; link = link->next) {
        auto* const mount = static_cast<GUnixMountEntry*>(link->data);
        entries.push_back({textOrEmpty(g_unix_mount_get_mount_path(mount)),
                           textOrEmpty(g_unix_mount_get_device_path(mount)),
                           textOrEmpty(g_unix_mount_get_fs_type(mount)),
                           textOrEmpty(g_unix_mount_get_root_path(mount))});
    }
    g_list_free_full(list, [](gpointer mount) { g_unix_mount_free(static_cast<GUnixMountEntry*>(mount)); });
    return entries;
}

SystemMountTable::SystemMountTable() : changes_(open("/proc/self/mountinfo", O_RDONLY | O_CLOEXEC)) {}

// The table with what was made of it. Volumes are looked at for their names, and disks may sleep; so only
// whoever asks for volumes waits for that.
class SystemMountTable::Snapshot {
  public:
    explicit Snapshot(std::vector<MountEntry> entries)
        : entries_(std::move(entries)), servedMountPoints_(platform::servedMountPoints(entries_)) {}

    const std::vector<Mount>& volumes() const {
        std::call_once(volumesMade_, [this] { volumes_ = volumesOf(entries_); });
        return volumes_;
    }
    const std::set<std::string, std::less<>>& servedMountPoints() const { return servedMountPoints_; }

  private:
    const std::vector<MountEntry> entries_;
    const std::set<std::string, std::less<>> servedMountPoints_;
    mutable std::once_flag volumesMade_;
    mutable std::vector<Mount> volumes_;
};

std::vector<Mount> SystemMountTable::mounts() const {
    return snapshot()->volumes();
}

MountTable::MountPoints SystemMountTable::servedMountPoints() const {
    const auto current = snapshot();
    return {current, &current->servedMountPoints()};
}

// Whoever needs the table while another thread reads it waits for that thread instead of reading it as well.
std::shared_ptr<const SystemMountTable::Snapshot> SystemMountTable::snapshot() const {
    Locked lock(mutex_);
    if (hasChanged() || !current_)
        current_ = std::make_shared<const Snapshot>(mountEntries());
    return current_;
}

bool SystemMountTable::hasChanged() const {
    pollfd request{changes_.number(), POLLPRI, 0};
    return !changes_ || (poll(&request, 1, 0) > 0 && (request.revents & (POLLPRI | POLLERR)));
}

}  // namespace platform
