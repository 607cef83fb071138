#include "platform/linux/VolumeProperties.h"

#include <dirent.h>
#include <fcntl.h>
#include <fmt/format.h>
#include <linux/fs.h>
#include <sys/ioctl.h>
#include <sys/stat.h>
#include <sys/sysmacros.h>

#include <algorithm>
#include <charconv>
#include <cstring>
#include <filesystem>

#include "platform/Path.h"
#include "platform/linux/FileDescriptor.h"
#include "platform/linux/PlainFile.h"

namespace platform {

namespace {

constexpr const char* deviceLabels = "/dev/disk/by-label";

std::optional<std::string> labelOfMountedFileSystem(const std::string& path) {
    const FileDescriptor folder(open(path.c_str(), O_RDONLY | O_DIRECTORY | O_NONBLOCK | O_CLOEXEC));
    char label[FSLABEL_MAX + 1] = {};
    if (!folder || ioctl(folder.number(), FS_IOC_GETFSLABEL, label) != 0 || label[0] == '\0')
        return std::nullopt;
    return label;
}

std::optional<std::string> labelOfVolume(const Volume& volume) {
    if (!volume.isWholeDisk)
        return std::nullopt;
    if (volume.answersAtOnce)
        if (auto label = labelOfMountedFileSystem(volume.entry.path))
            return label;
    return labelOfDevice(volume.entry.device, deviceLabels);
}

std::optional<dev_t> numberOfDevice(const std::string& path) {
    struct stat status {};
    if (!path.starts_with("/dev/") || stat(path.c_str(), &status) != 0 || !S_ISBLK(status.st_mode))
        return std::nullopt;
    return status.st_rdev;
}

// A partition's folder lies in that of its drive, and the drive has the file.
bool saysRemovable(const std::filesystem::path& device) {
    for (const auto& folder : {device, device.parent_path()})
        if (const auto text = beginningOfPlainFile(folder / "removable", 1))
            return *text == "1";
    return false;
}

// Encrypted disks and joined ones name the disks that they are made of.
bool isOnRemovableDrive(const std::filesystem::path& device, int layersLeft) {
    if (saysRemovable(device))
        return true;
    if (layersLeft == 0)
        return false;
    std::error_code ignored;
    std::filesystem::directory_iterator parts(device / "slaves", ignored), end;
    for (; parts != end; parts.increment(ignored))
        if (isOnRemovableDrive(std::filesystem::canonical(parts->path(), ignored), layersLeft - 1))
            return true;
    return false;
}

}  // namespace

std::string displayNameOfVolume(const Volume& volume) {
    if (const auto label = labelOfVolume(volume))
        if (auto name = nameFromLabel(*label))
            return *name;
    return volume.entry.path == "/" ? "File System" : path::lastComponent(volume.entry.path);
}

bool isRemovable(const MountEntry& entry) {
    if (isInside(entry.path, "/media") || isInside(entry.path, "/run/media"))
        return true;
    const auto number = numberOfDevice(entry.device);
    if (!number)
        return false;
    std::error_code unresolved;
    const auto device = std::filesystem::canonical(
        fmt::format("/sys/dev/block/{}:{}", major(*number), minor(*number)), unresolved);
    constexpr int deepestStack = 4;
    return !unresolved && isOnRemovableDrive(device, deepestStack);
}

bool isFolderOrUnknown(const std::string& path) {
    struct stat status {};
    return stat(path.c_str(), &status) != 0 || S_ISDIR(status.st_mode);
}

std::optional<std::string> nameFromLabel(std::string_view label) {
    if (label.empty() || label == "." || label == "..")
        return std::nullopt;
    std::string name(label);
    std::replace(name.begin(), name.end(), '/', ':');
    return name;
}

std::string decodedLabel(std::string_view encoded) {
    std::string label;
    for (std::size_t i = 0; i < encoded.size(); ++i) {
        unsigned char byte = 0;
        const char* const digits = encoded.data() + i + 2;
        if (encoded.substr(i, 2) == "\\x" && i + 4 <= encoded.size() &&
            std::from_chars(digits, digits + 2, byte, 16).ptr == digits + 2) {
            label += static_cast<char>(byte);
            i += 3;
        } else {
            label += encoded[i];
        }
    }
    return label;
}

std::optional<std::string> labelOfDevice(const std::string& device, const std::string& labelsFolder) {
    const auto number = numberOfDevice(device);
    if (!number)
        return std::nullopt;
    std::error_code ignored;
    std::filesystem::directory_iterator links(labelsFolder, ignored), end;
    for (; links != end; links.increment(ignored)) {
        struct stat status {};
        if (stat(links->path().c_str(), &status) == 0 && status.st_rdev == *number)
            return decodedLabel(links->path().filename().string());
    }
    return std::nullopt;
}

}  // namespace platform
