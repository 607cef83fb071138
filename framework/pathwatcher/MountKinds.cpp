#include "framework/pathwatcher/MountKinds.h"

#include <algorithm>
#include <array>

#include "platform/Path.h"
#include "platform/linux/FileSystemTypes.h"

namespace vexo {

namespace {

using platform::MountEntry;

constexpr std::array<std::string_view, 20> kernelTypes = {
    "autofs", "binfmt_misc", "bpf",        "cgroup",     "cgroup2",   "configfs", "debugfs",
    "devpts", "devtmpfs",    "efivarfs",   "fusectl",    "hugetlbfs", "mqueue",   "nsfs",
    "proc",   "pstore",      "rpc_pipefs", "securityfs", "sysfs",     "tracefs"};

ChangeSource sourceOfChanges(const MountEntry& entry) {
    if (std::find(kernelTypes.begin(), kernelTypes.end(), entry.fileSystem) != kernelTypes.end())
        return ChangeSource::nothing;
    // Programs that serve a local disk are alone with it: all its changes pass through the kernel.
    if (entry.fileSystem == "fuseblk")
        return ChangeSource::events;
    const bool isSilent =
        platform::isNetworkFileSystem(entry.fileSystem, entry.device) || platform::isFuse(entry.fileSystem);
    return isSilent ? ChangeSource::polling : ChangeSource::events;
}

std::string descriptionOf(const MountEntry& entry) {
    return entry.device + '\n' + entry.fileSystem + '\n' + entry.root;
}

}  // namespace

// What is mounted last at a place hides what was mounted there before.
MountKinds::MountKinds(const std::vector<MountEntry>& table) {
    for (const MountEntry& entry : table) {
        descriptions_.insert_or_assign(entry.path, descriptionOf(entry));
        silent_.erase(entry.path);
        const ChangeSource source = sourceOfChanges(entry);
        if (source != ChangeSource::events)
            silent_[entry.path] = {entry.path, source, entry.fileSystem,
                                   platform::isNetworkFileSystem(entry.fileSystem, entry.device)};
    }
}

const SilentMount* MountKinds::silentMountAt(std::string_view path) const {
    const auto found = silent_.find(path);
    return found == silent_.end() ? nullptr : &found->second;
}

std::vector<const SilentMount*> MountKinds::silentMountsBelow(std::string_view path) const {
    std::vector<const SilentMount*> mounts;
    for (const auto& [mountPoint, mount] : silent_)
        if (mountPoint != path && platform::isInside(mountPoint, path))
            mounts.push_back(&mount);
    return mounts;
}

std::string MountKinds::mountPointOf(std::string_view path) const {
    std::string folder(path);
    while (folder.size() > 1 && !descriptions_.contains(folder))
        folder = platform::path::withoutLastComponent(folder);
    return folder;
}

std::vector<std::string> MountKinds::differences(const MountKinds& other) const {
    std::vector<std::string> paths;
    for (const auto& [path, description] : descriptions_) {
        const auto found = other.descriptions_.find(path);
        if (found == other.descriptions_.end() || found->second != description)
            paths.push_back(path);
    }
    for (const auto& [path, description] : other.descriptions_)
        if (!descriptions_.contains(path))
            paths.push_back(path);
    return paths;
}

}  // namespace vexo
