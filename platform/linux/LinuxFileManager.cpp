#include "platform/linux/LinuxFileManager.h"

#include <dirent.h>
#include <fcntl.h>
#include <gio/gunixmounts.h>
#include <linux/magic.h>
#include <pwd.h>
#include <sys/stat.h>
#include <sys/vfs.h>
#include <sys/xattr.h>

#include <cerrno>
#include <cstdlib>
#include <cstring>

#include "platform/Path.h"
#include "platform/linux/AppleDouble.h"
#include "platform/linux/FileSystemTypes.h"
#include "platform/linux/HiddenFlag.h"
#include "platform/linux/LogText.h"
#include "platform/linux/PlainFile.h"

namespace platform {

namespace {

class FileByteSource final : public ByteSource {
  public:
    FileByteSource(PlainFile file, std::string path) : file_(std::move(file)), path_(std::move(path)) {}

    std::uint64_t size() const override { return file_.size; }
    std::string name() const override { return path_; }
    bool read(std::uint64_t offset, std::span<std::byte> buffer) override {
        if (offset > file_.size || buffer.size() > file_.size - offset)
            return false;
        return readAt(file_.descriptor, offset, buffer.data(), buffer.size()) ==
               static_cast<std::ptrdiff_t>(buffer.size());
    }

  private:
    const PlainFile file_;
    const std::string path_;
};

bool meansMissing(int error) {
    return error == ENOENT || error == ENOTDIR;
}

DateRef dateFromTimestamp(const statx_timestamp& time) {
    return Date::since1970(static_cast<double>(time.tv_sec) + time.tv_nsec * 1e-9);
}

FileAttributes attributesFromStatus(const struct statx& status) {
    FileAttributes attributes;
    attributes.size = status.stx_size;
    if (status.stx_mask & STATX_MTIME)
        attributes.modificationDate = dateFromTimestamp(status.stx_mtime);
    attributes.creationDate =
        status.stx_mask & STATX_BTIME ? dateFromTimestamp(status.stx_btime) : attributes.modificationDate;
    return attributes;
}

bool isDotOrDotDot(const char* name) {
    return std::strcmp(name, ".") == 0 || std::strcmp(name, "..") == 0;
}

struct FolderCloser {
    void operator()(DIR* folder) const { closedir(folder); }
};
using OpenFolder = std::unique_ptr<DIR, FolderCloser>;

// The names in the order of the file system; nil, and errno set, when reading fails.
std::optional<std::vector<std::string>> readNames(DIR* folder) {
    std::vector<std::string> names;
    for (;;) {
        errno = 0;
        const dirent* const entry = readdir(folder);
        if (!entry)
            break;
        if (!isDotOrDotDot(entry->d_name))
            names.emplace_back(entry->d_name);
    }
    return errno == 0 ? std::optional(std::move(names)) : std::nullopt;
}

// Whether something is mounted right at the item; true as well where the kernel does not say.
bool mayBeMountPoint(const struct statx& status) {
    return !(status.stx_attributes_mask & STATX_ATTR_MOUNT_ROOT) ||
           status.stx_attributes & STATX_ATTR_MOUNT_ROOT;
}

// File systems with Unix's flag for backups, all the usual ones, have no hidden flag; neither have links.
// Knowing so without another call to the kernel is what keeps scans fast.
bool mayHaveHiddenFlag(const struct statx& status) {
    return !(status.stx_attributes_mask & STATX_ATTR_NODUMP) &&
           (S_ISDIR(status.stx_mode) || S_ISREG(status.stx_mode));
}

std::optional<std::string> canonicalPath(const std::string& path) {
    const std::unique_ptr<char, decltype(&free)> resolved(realpath(path.c_str(), nullptr), &free);
    return resolved ? std::optional<std::string>(resolved.get()) : std::nullopt;
}

// The size of the value, or the negative errno.
std::ptrdiff_t attributeOfFile(const std::string& path, const std::string& name, std::span<char> buffer) {
    const auto size = getxattr(path.c_str(), name.c_str(), buffer.data(), buffer.size());
    return size >= 0 ? size : -errno;
}

// As getxattr answers, with the negative errno for a failure. The file belongs beside the one that holds the
// content, which is elsewhere where `path` is a link.
std::ptrdiff_t attributeOfSidecar(const std::string& path, std::string_view name, std::span<char> buffer) {
    const auto target = canonicalPath(path);
    if (!target)
        return -errno;
    const std::string sidecarPath = appleDoublePath(*target);
    auto file = PlainFile::open(sidecarPath);
    if (!file)
        return -ENODATA;
    FileByteSource sidecar(std::move(file), sidecarPath);
    const auto value = attributeInAppleDouble(sidecar, name);
    if (!value)
        return -ENODATA;
    if (!buffer.empty() && value->size() > buffer.size())
        return -ERANGE;
    value->copy(buffer.data(), buffer.size());
    return static_cast<std::ptrdiff_t>(value->size());
}

// Anything but these is a trouble that someone should hear of.
bool isUsualForAttributes(int error) {
    return meansMissing(error) || error == ENODATA || error == ENOTSUP || error == ERANGE;
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
                                   std::string volumesFolder)
    : homeDirectory_(std::move(homeDirectory)),
      mountTable_(mountTable),
      systemLog_(systemLog),
      isPackageExtension_(std::move(isPackageExtension)),
      volumesPrefix_(std::move(volumesFolder) + "/") {}

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
    const OpenFolder folder(opendir(real->c_str()));
    auto names = folder ? readNames(folder.get()) : std::nullopt;
    if (!names && errno != ENOENT)
        logFailure("list", *real, errno);
    return names;
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
    std::uint32_t flags = 0;
    if (S_ISDIR(status->stx_mode)) {
        flags |= itemIsContainer;
        if (isPackageExtension_(path::extension(*real)))
            flags |= itemIsPackage;
    }
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
    auto size = attributeOfFile(*real, "user." + std::string(name), buffer);
    const bool keepsAttributes = size != -ENOTSUP;
    if (size == -ENODATA || size == -ENOTSUP)
        size = attributeOfFile(*real, "osx." + std::string(name), buffer);
    if (!keepsAttributes && (size == -ENODATA || size == -ENOTSUP))
        size = attributeOfSidecar(*real, name, buffer);
    if (size < 0 && !isUsualForAttributes(static_cast<int>(-size)))
        logFailure("read an attribute of", *real, static_cast<int>(-size));
    return size;
}

std::optional<std::string> LinuxFileManager::fileSystemTypeNameAtPath(const std::string& path) const {
    const auto real = kernelPath(path);
    struct statfs fileSystem {};
    if (!real)
        return std::nullopt;
    if (statfs(real->c_str(), &fileSystem) != 0) {
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
    if (name.empty() || name == "." || name == ".." || lstat((volumesPrefix_ + name).c_str(), &status) == 0)
        return path;
    const auto mountPoint = mountPointOfVolume(name);
    if (!mountPoint)
        return std::nullopt;
    const std::string rest = path.substr(nameEnd);
    return *mountPoint == "/" && !rest.empty() ? rest : *mountPoint + rest;
}

std::optional<std::string> LinuxFileManager::kernelPath(const std::string& path) const {
    auto real = resolvedPath(path);
    if (!real || real->empty() || real->find('\0') != std::string::npos)
        return std::nullopt;
    while (real->size() > 1 && real->back() == '/')
        real->pop_back();
    return real;
}

std::optional<std::string> LinuxFileManager::mountPointOfVolume(std::string_view displayName) const {
    for (const Mount& mount : mountTable_.mounts())
        if (mount.displayName == displayName)
            return mount.path;
    return std::nullopt;
}

std::optional<struct statx> LinuxFileManager::statusOfItem(const std::string& path, Links links) const {
    const int flags = AT_NO_AUTOMOUNT | (links == Links::lookAt ? AT_SYMLINK_NOFOLLOW : 0);
    struct statx status {};
    if (statx(AT_FDCWD, path.c_str(), flags, STATX_BASIC_STATS | STATX_BTIME, &status) == 0)
        return status;
    if (!meansMissing(errno))
        logFailure("look at", path, errno);
    return std::nullopt;
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

void LinuxFileManager::logFailure(std::string_view operation, const std::string& path, int error) const {
    systemLog_.log(failureLine(operation, path, error));
}

}  // namespace platform
