#include "platform/linux/HiddenFlag.h"

#include <endian.h>
#include <fcntl.h>
#include <linux/magic.h>
#include <linux/msdos_fs.h>
#include <sys/ioctl.h>
#include <sys/vfs.h>
#include <sys/xattr.h>

#include <cstdint>
#include <optional>

#include "platform/linux/FileDescriptor.h"
#include "platform/linux/Uninterrupted.h"

namespace platform {

namespace {

constexpr std::uint32_t fatMagic = MSDOS_SUPER_MAGIC;
constexpr std::uint32_t exfatMagic = 0x2011BAB0;
constexpr std::uint32_t ntfsMagic = 0x7366746E;
constexpr std::uint32_t fuseMagic = FUSE_SUPER_MAGIC;

bool hasFATHiddenFlag(const std::string& path) {
    const FileDescriptor file(open(path.c_str(), O_RDONLY | O_NONBLOCK | O_NOFOLLOW | O_NOCTTY | O_CLOEXEC));
    std::uint32_t attributes = 0;
    return file && ioctl(file.number(), FAT_IOCTL_GET_ATTRIBUTES, &attributes) == 0 &&
           (attributes & ATTR_HIDDEN);
}

// The drivers show the attribute word in either byte order; the kernel's older ones know only the second.
std::optional<std::uint32_t> ntfsAttributes(const std::string& path) {
    std::uint32_t word = 0;
    if (lgetxattr(path.c_str(), "system.ntfs_attrib_be", &word, sizeof word) == sizeof word)
        return be32toh(word);
    if (lgetxattr(path.c_str(), "system.ntfs_attrib", &word, sizeof word) == sizeof word)
        return le32toh(word);
    return std::nullopt;
}

}  // namespace

bool hasHiddenFlag(const std::string& path) {
    struct statfs fileSystem {};
    if (uninterrupted([&] { return statfs(path.c_str(), &fileSystem); }) != 0)
        return false;
    switch (static_cast<std::uint32_t>(fileSystem.f_type)) {
        case fatMagic:
        case exfatMagic:
            return hasFATHiddenFlag(path);
        case ntfsMagic:
        case fuseMagic:
            return ntfsAttributes(path).value_or(0) & ATTR_HIDDEN;
        default:
            return false;
    }
}

bool hasNTFSAttributes(const std::string& path) {
    return ntfsAttributes(path).has_value();
}

}  // namespace platform
