#include "platform/linux/MountRules.h"

#include <gio/gunixmounts.h>

#include <algorithm>
#include <array>

#include "platform/linux/FileSystemTypes.h"

namespace platform {

namespace {

constexpr std::array<std::string_view, 4> placesForVolumes = {"/media", "/run/media", "/mnt", "/Volumes"};

constexpr std::array<std::string_view, 19> systemPlaces = {
    "/bin",    "/boot", "/dev", "/efi",  "/etc",  "/gnu", "/lib",     "/lib32", "/lib64", "/nix",
    "/ostree", "/proc", "/run", "/sbin", "/snap", "/sys", "/sysroot", "/usr",   "/var"};

template <typename Places>
bool isInsideAny(std::string_view path, const Places& places) {
    return std::any_of(places.begin(), places.end(),
                       [&](std::string_view place) { return isInside(path, place); });
}

// Some systems keep the homes at /var/home. A /tmp of its own is the system's, a disk mounted below it is
// not.
bool isSystemPlace(std::string_view path) {
    if (path == "/tmp")
        return true;
    return isInsideAny(path, systemPlaces) && !isInside(path, "/var/home");
}

bool isBelowHiddenFolder(std::string_view path) {
    return path.find("/.") != std::string_view::npos;
}

bool isSystemFileSystem(const MountEntry& entry) {
    return g_unix_is_system_fs_type(entry.fileSystem.c_str()) ||
           g_unix_is_system_device_path(entry.device.c_str());
}

// ZFS names its data sets instead of devices. FUSE file systems of no disk often name /dev/fuse.
bool isDisk(const MountEntry& entry) {
    if (isFuse(entry.fileSystem))
        return entry.fileSystem == "fuseblk";
    return entry.device.starts_with("/dev/") || entry.fileSystem == "zfs";
}

bool isDiskOrFuse(const MountEntry& entry) {
    return isDisk(entry) || isFuse(entry.fileSystem);
}

// Every subvolume of a Btrfs disk is mounted with a root of its own.
bool isSubvolume(const MountEntry& entry) {
    return entry.fileSystem == "btrfs";
}

bool showsWholeDisk(const MountEntry& entry) {
    return entry.root == "/" || entry.root.empty() || isSubvolume(entry);
}

bool mayNotAnswer(const MountEntry& entry) {
    return isNetworkFileSystem(entry.fileSystem, entry.device) || isFuse(entry.fileSystem);
}

// Neither by the kernel nor by a program that has the disk to itself, which is as good as its disk.
bool isServedByAnother(const MountEntry& entry) {
    return entry.fileSystem == "autofs" || (mayNotAnswer(entry) && entry.fileSystem != "fuseblk");
}

// One that is mounted over has disappeared.
bool isMountedOver(const std::vector<MountEntry>& entries, std::size_t index) {
    return std::any_of(entries.begin() + static_cast<std::ptrdiff_t>(index) + 1, entries.end(),
                       [&](const MountEntry& later) { return later.path == entries[index].path; });
}

class Selection {
  public:
    Selection(const std::vector<MountEntry>& entries, const std::function<bool(const std::string&)>& isFolder)
        : entries_(entries), isFolder_(isFolder) {}

    std::vector<Volume> volumes() {
        for (std::size_t i = 0; i < entries_.size(); ++i)
            if (!isMountedOver(entries_, i) && isVolume(entries_[i]))
                add(entries_[i]);
        std::stable_partition(volumes_.begin(), volumes_.end(),
                              [](const Volume& volume) { return volume.entry.path == "/"; });
        return std::move(volumes_);
    }

  private:
    void add(const MountEntry& entry) {
        volumes_.push_back({entry, answersAtOnce(entry), showsWholeDisk(entry) && !isListed(entry)});
    }

    bool isVolume(const MountEntry& entry) const {
        if (entry.path == "/")
            return true;
        if (isSystemFileSystem(entry) || isNetworkFileSystem(entry.fileSystem, entry.device) ||
            !isDiskOrFuse(entry) || isBelowHiddenFolder(entry.path))
            return false;
        if (isInsideAny(entry.path, placesForVolumes))
            return !isSingleFile(entry);
        return !isSystemPlace(entry.path) && showsWholeDisk(entry) && !isRepeated(entry);
    }

    // Containers mount single files over their own.
    bool isSingleFile(const MountEntry& entry) const {
        return entry.root != "/" && answersAtOnce(entry) && !isFolder_(entry.path);
    }

    // A disk below a mount that may not answer can't be reached without it.
    bool answersAtOnce(const MountEntry& entry) const {
        return std::none_of(entries_.begin(), entries_.end(), [&](const MountEntry& other) {
            return mayNotAnswer(other) && isInside(entry.path, other.path);
        });
    }

    bool isListed(const MountEntry& entry) const {
        return std::any_of(volumes_.begin(), volumes_.end(), [&](const Volume& volume) {
            return isDisk(entry) && volume.entry.device == entry.device;
        });
    }

    bool isRepeated(const MountEntry& entry) const {
        return std::any_of(volumes_.begin(), volumes_.end(), [&](const Volume& volume) {
            return isDisk(entry) && volume.entry.device == entry.device && volume.entry.root == entry.root;
        });
    }

    const std::vector<MountEntry>& entries_;
    const std::function<bool(const std::string&)>& isFolder_;
    std::vector<Volume> volumes_;
};

}  // namespace

std::vector<Volume> volumesAmong(const std::vector<MountEntry>& entries,
                                 const std::function<bool(const std::string& path)>& isFolder) {
    return Selection(entries, isFolder).volumes();
}

// What is mounted last at a place hides what was mounted there before, as it hides the automounter that did
// it.
std::set<std::string, std::less<>> servedMountPoints(const std::vector<MountEntry>& entries) {
    std::set<std::string, std::less<>> mountPoints;
    for (const MountEntry& entry : entries) {
        if (isServedByAnother(entry))
            mountPoints.insert(entry.path);
        else
            mountPoints.erase(entry.path);
    }
    return mountPoints;
}

bool isInside(std::string_view path, std::string_view folder) {
    if (folder == "/")
        return path.starts_with("/");
    return path.starts_with(folder) && (path.size() == folder.size() || path[folder.size()] == '/');
}

}  // namespace platform
