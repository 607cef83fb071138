// The volumes that are mounted and hold users' files.
//
// What counts as one is decided in MountRules.h, what it is called in VolumeProperties.h, and which mounts
// answer in MountReach.h. Callable from any thread.
#pragma once

#include <memory>
#include <set>
#include <string>
#include <vector>

#include "platform/ThreadSafety.h"
#include "platform/linux/FileDescriptor.h"
#include "platform/linux/MountRules.h"

namespace platform {

struct Mount {
    std::string path;         // of the mount point
    std::string device;       // "/dev/sdb1"; what the file system was mounted from
    std::string fileSystem;   // Linux's name of its type, "ext4", "fuse.encfs"
    std::string displayName;  // never empty, holds no "/"
    bool removable = false;

    bool operator==(const Mount&) const = default;
};

class MountTable {
  public:
    using MountPoints = std::shared_ptr<const std::set<std::string, std::less<>>>;

    virtual ~MountTable() = default;

    // In mount order, "/" first.
    virtual std::vector<Mount> mounts() const = 0;
    // Of all mounts that may not answer, volumes or not; another object after each change of the table.
    virtual MountPoints servedMountPoints() const = 0;
};

// The kernel's table as it is now.
std::vector<MountEntry> mountEntries();

// The kernel's mount table. Read again only after the kernel reports a change of it, so asking often is
// cheap; a label that is changed while its volume is mounted shows after the next change of the table.
//
// Network and FUSE file systems are never touched: their server may be gone, and then every look at them
// waits.
class SystemMountTable final : public MountTable {
  public:
    SystemMountTable();

    std::vector<Mount> mounts() const override VX_EXCLUDES(mutex_);
    MountPoints servedMountPoints() const override VX_EXCLUDES(mutex_);

  private:
    class Snapshot;

    std::shared_ptr<const Snapshot> snapshot() const VX_EXCLUDES(mutex_);
    bool hasChanged() const VX_REQUIRES(mutex_);

    const FileDescriptor changes_;  // the kernel tells each open file of the table once of every change

    mutable Mutex mutex_;
    mutable std::shared_ptr<const Snapshot> current_
        VX_GUARDED_BY(mutex_);  // nil until it is first asked for
};

}  // namespace platform
