#include "platform/linux/LinuxFileManager.h"

#include <fcntl.h>
#include <gio/gunixmounts.h>
#include <linux/magic.h>
#include <pwd.h>
#include <sys/stat.h>
#include <sys/vfs.h>

#include <cerrno>
#include <cstdlib>
#include <cstring>

#include "platform/Path.h"
#include "platform/linux/ExtendedAttributes.h"
#include "platform/linux/FileByteSource.h"
#include "platform/linux/FileStatus.h"
#include "platform/linux/FileSystemTypes.h"
#include "platform/linux/HiddenFlag.h"
#include "platform/linux/LogText.h"
#include "platform/linux/Uninterrupted.h"

namespace platform {

namespace {

// Whether something is mounted right at the item; true as well where the kernel does not say.
bool mayBeMountPoint(const struct statx& status) {
    return !(status.stx_attributes_mask & STATX_ATTR_MOUNT_ROOT) ||
           status.stx_attributes & STATX_ATTR_MOUNT_ROOT;
}

// What a FUSE file system is can't be told by its magic number.
std::string fuseTypeName(const std::string& path) {
    if (hasNTFSAttributes(path))
        return "ntfs";
    GUnixMountEntry* const mount = g_unix_mount_for(path.c_str(), nullptr);
    if (!mount)
        return fileSystemNameForMagic(FUSE_SUPER_MAGIC);
    const char* const device = g_unix_mount_get_device_path(mount);
    auto name = fileSystemNameForType(g_unix_mount_get_fs_type(mount), device ? device : "");
    g_unix_mount_free(mount);
    return name;
}

std::vector<std::string> namesOf(const std::vector<FolderItem>& items) {
    std::vector<std::string> names;
    names.reserve(items.size());
    for (const FolderItem& item : items)
        names.emplace_back(item.name);
    return names;
}

std::optional<std::string> homeDirectoryInPasswordDatabase() {
    std::vector<char> storage(16 * 1024);
    passwd entry{};
    passwd* found = nullptr;
    if (getpwuid_r(getuid(), &entry, storage.data(), storage.size(), &found) != 0 || !found || !found->pw_dir)
        return std::nullopt;
    return *found->pw_dir == '/' ? std::optional<std::string>(found->pw_dir) : std::nullopt;
}

}  // namespace

LinuxFileManager::LinuxFileManager(std::optional<std::string> homeDirectory, const MountTable& mountTable,
                                   SystemLog& systemLog, PackageTest isPackageExtension,
                                   std::string volumesFolder, std::chrono::milliseconds patience)
    : homeDirectory_(std::move(homeDirectory)),
      mountTable_(mountTable),
      reach_(mountTable, systemLog, patience),
      systemLog_(systemLog),
      isPackageExtension_(std::move(isPackageExtension)),
      volumesPrefix_(std::move(volumesFolder) + "/"),
      folderServices_{hiddenNames_, reach_, isPackageExtension_, systemLog_} {}

std::optional<std::string> LinuxFileManager::userHomeDirectory() {
    const char* const home = std::getenv("HOME");
    if (!home || *home != '/')
        return homeDirectoryInPasswordDatabase();
    std::string path = home;
    while (path.size() > 1 && path.back() == '/')
        path.pop_back();
    return path;
}

std::optional<FileKind> LinuxFileManager::kindOfItemAtPath(const std::string& path) const {
    const auto real = kernelPath(path);
    const auto status = real ? statusOfItem(*real, Links::follow) : std::nullopt;
    if (!status)
        return std::nullopt;
    return S_ISDIR(status->stx_mode) ? FileKind::directory : FileKind::file;
}

std::optional<std::vector<std::string>> LinuxFileManager::contentsOfDirectoryAtPath(
    const std::string& path) const {
    const auto real = kernelPath(path);
    if (!real)
        return std::nullopt;
    auto listing = listingOfFolder(*real);
    if (listing && !listing->readToTheEnd()) {
        logFailure("list", *real, errno);
        return std::nullopt;
    }
    return listing ? std::optional(namesOf(listing->items)) : std::nullopt;
}

std::unique_ptr<Folder> LinuxFileManager::openFolderAtPath(const std::string& path) const {
    const auto real = kernelPath(path);
    if (!real)
        return nullptr;
    auto listing = listingOfFolder(*real);
    return listing ? std::make_unique<LinuxFolder>(std::move(*listing), *real, folderServices_) : nullptr;
}

std::optional<FileAttributes> LinuxFileManager::attributesOfItemAtPath(const std::string& path) const {
    const auto real = kernelPath(path);
    const auto status = real ? statusOfItem(*real, Links::follow) : std::nullopt;
    return status ? std::optional(attributesFromStatus(*status)) : std::nullopt;
}

std::optional<std::uint32_t> LinuxFileManager::itemFlagsAtPath(const std::string& path) const {
    const auto real = kernelPath(path);
    const auto status = real ? statusOfItem(*real, Links::lookAt) : std::nullopt;
    if (!status)
        return std::nullopt;
    std::uint32_t flags =
        S_ISDIR(status->stx_mode) ? flagsOfFolder(path::lastComponent(*real), isPackageExtension_) : 0;
    if (isInvisible(*real, *status))
        flags |= itemIsInvisible;
    return flags;
}

std::optional<std::string> LinuxFileManager::displayNameAtPath(const std::string& path) const {
    const auto real = kernelPath(path);
    const auto status = real ? statusOfItem(*real, Links::lookAt) : std::nullopt;
    if (!status)
        return std::nullopt;
    if (S_ISDIR(status->stx_mode) && mayBeMountPoint(*status))
        if (auto name = volumeNameAt(*real))
            return name;
    return path::lastComponent(*real);
}

std::ptrdiff_t LinuxFileManager::extendedAttribute(const std::string& path, std::string_view name,
                                                   std::span<char> buffer) const {
    constexpr std::ptrdiff_t missing = -1;
    const auto real = kernelPath(path);
    if (!real)
        return missing;
    const auto size = platform::extendedAttribute({*real}, name, buffer, ForeignNames::asked).size;
    if (size < 0 && !isUsualForAttributes(static_cast<int>(-size)))
        logFailure("read an attribute of", *real, static_cast<int>(-size));
    return size;
}

std::optional<std::string> LinuxFileManager::fileSystemTypeNameAtPath(const std::string& path) const {
    const auto real = kernelPath(path);
    struct statfs fileSystem {};
    if (!real)
        return std::nullopt;
    if (uninterrupted([&] { return statfs(real->c_str(), &fileSystem); }) != 0) {
        if (!meansMissing(errno))
            logFailure("tell the file system of", *real, errno);
        return std::nullopt;
    }
    const auto magic = static_cast<std::uint32_t>(fileSystem.f_type);
    return magic == FUSE_SUPER_MAGIC ? fuseTypeName(*real) : fileSystemNameForMagic(magic);
}

std::unique_ptr<ByteSource> LinuxFileManager::openFileAtPath(const std::string& path) const {
    const auto real = kernelPath(path);
    if (!real)
        return nullptr;
    auto file = PlainFile::open(*real);
    if (file)
        return std::make_unique<FileByteSource>(std::move(file), path);
    if (!meansMissing(file.error))
        logFailure("open", *real, file.error);
    return nullptr;
}

std::optional<std::string> LinuxFileManager::resolvedPath(const std::string& path) const {
    if (!path.starts_with(volumesPrefix_))
        return path;
    const auto nameEnd = std::min(path.find('/', volumesPrefix_.size()), path.size());
    const std::string name = path.substr(volumesPrefix_.size(), nameEnd - volumesPrefix_.size());
    struct stat status {};
    if (name.empty() || name == "." || name == ".." ||
        mountTable_.servedMountPoints()->contains(volumesPrefix_ + name) ||
        uninterrupted([&] { return lstat((volumesPrefix_ + name).c_str(), &status); }) == 0)
        return path;
    const auto mountPoint = mountPointOfVolume(name);
    if (!mountPoint)
        return std::nullopt;
    const std::string rest = path.substr(nameEnd);
    return *mountPoint == "/" && !rest.empty() ? rest : *mountPoint + rest;
}

bool LinuxFileManager::isInReach(const std::string& path) const {
    const auto real = resolvedPath(path);
    return real && reach_.isInReach(*real);
}

std::optional<std::string> LinuxFileManager::kernelPath(const std::string& path) const {
    auto real = resolvedPath(path);
    if (!real || real->empty() || real->find('\0') != std::string::npos)
        return std::nullopt;
    while (real->size() > 1 && real->back() == '/')
        real->pop_back();
    if (!reach_.isInReach(*real))
        return std::nullopt;
    return real;
}

std::optional<std::string> LinuxFileManager::mountPointOfVolume(std::string_view displayName) const {
    for (const Mount& mount : mountTable_.mounts())
        if (mount.displayName == displayName)
            return mount.path;
    return std::nullopt;
}

std::optional<struct statx> LinuxFileManager::statusOfItem(const std::string& path, Links links) const {
    const auto status =
        statusOfFile(AT_FDCWD, path.c_str(), links == Links::lookAt ? AT_SYMLINK_NOFOLLOW : 0);
    if (!status && !meansMissing(errno))
        logFailure("look at", path, errno);
    return status;
}

bool LinuxFileManager::isInvisible(const std::string& path, const struct statx& status) const {
    const std::string name = path::lastComponent(path);
    return name.starts_with(".") || hiddenNames_.contains(path::withoutLastComponent(path), name) ||
           (mayHaveHiddenFlag(status) && hasHiddenFlag(path));
}

std::optional<std::string> LinuxFileManager::volumeNameAt(const std::string& mountPoint) const {
    const auto canonical = canonicalPath(mountPoint);
    for (const Mount& mount : mountTable_.mounts())
        if (mount.path == canonical)
            return mount.displayName;
    return std::nullopt;
}

std::optional<FolderListing> LinuxFileManager::listingOfFolder(const std::string& path) const {
    return FolderListing::openOrLog(AT_FDCWD, path.c_str(), path, systemLog_);
}

void LinuxFileManager::logFailure(std::string_view operation, const std::string& path, int error) const {
    systemLog_.log(failureLine(operation, path, error));
}

}  // namespace platform
