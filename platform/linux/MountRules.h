// Which entries of the mount table are volumes that hold users' files.
//
// A volume is "/", or a local disk or FUSE file system
// - anywhere under /media, /run/media, /mnt or /Volumes, bind mounts of folders included, or
// - elsewhere, outside the system's places (/boot, /usr, /var, …), when it is mounted for the first time and
//   as a whole: a bind mount elsewhere repeats files that are seen already. The subvolumes of one Btrfs disk
//   are disks of their own.
// What lies below a hidden folder belongs to some program. File systems of the kernel's own (tmpfs included),
// overlays and network file systems are none.
//
// GIO has an opinion of its own, g_unix_mount_is_system_internal. It asks which mounts to show as drives, and
// therefore leaves out "/" and a /home of its own, where most libraries are; only its lists of file-system
// types and devices are used.
//
// Pure functions of the table.
#pragma once

#include <functional>
#include <set>
#include <string>
#include <string_view>
#include <vector>

namespace platform {

// One line of the mount table.
struct MountEntry {
    std::string path;
    std::string device;
    std::string fileSystem;
    std::string root;  // the part of the file system that is mounted; "/" for all of it
};

struct Volume {
    MountEntry entry;
    // Whether its files may be looked at without waiting for a server or a program.
    bool answersAtOnce = false;
    // Whether it stands for its whole disk, so that the disk's label is its name.
    bool isWholeDisk = false;
};

// The volumes in mount order, "/" first. `isFolder` is asked only about mount points that answer at once.
std::vector<Volume> volumesAmong(const std::vector<MountEntry>& entries,
                                 const std::function<bool(const std::string& path)>& isFolder);

// The mount points of network and FUSE file systems, whose server or program may be gone, and of what is
// mounted when it is looked at, which may be one. Local disks are none, whoever drives them.
std::set<std::string, std::less<>> servedMountPoints(const std::vector<MountEntry>& entries);

// Whether `path` is `folder` or lies below it.
bool isInside(std::string_view path, std::string_view folder);

}  // namespace platform
