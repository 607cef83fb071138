#include "platform/linux/FileStatus.h"

#include <fcntl.h>
#include <unistd.h>

#include <cerrno>
#include <climits>

#include "platform/Path.h"
#include "platform/linux/Uninterrupted.h"

namespace platform {

namespace {

double seconds(const statx_timestamp& time) {
    return static_cast<double>(time.tv_sec) + time.tv_nsec * 1e-9;
}

DateRef dateAt(const std::optional<double>& secondsSince1970) {
    return secondsSince1970 ? Date::since1970(*secondsSince1970) : nullptr;
}

}  // namespace

std::optional<struct statx> statusOfFile(int folder, const char* path, int flags) {
    struct statx status {};
    const int result = uninterrupted([&] {
        return statx(folder, path, flags | AT_NO_AUTOMOUNT, STATX_BASIC_STATS | STATX_BTIME, &status);
    });
    if (result != 0)
        return std::nullopt;
    return status;
}

std::optional<std::string> targetOfLink(const std::string& path) {
    char target[PATH_MAX];
    const ssize_t length = uninterrupted([&] { return readlink(path.c_str(), target, sizeof target); });
    if (length < 0)
        return std::nullopt;
    return std::string(target, static_cast<std::size_t>(length));
}

bool meansMissing(int error) {
    return error == ENOENT || error == ENOTDIR;
}

std::optional<double> modificationTime(const struct statx& status) {
    return status.stx_mask & STATX_MTIME ? std::optional(seconds(status.stx_mtime)) : std::nullopt;
}

std::optional<double> creationTime(const struct statx& status) {
    return status.stx_mask & STATX_BTIME ? std::optional(seconds(status.stx_btime))
                                         : modificationTime(status);
}

std::uint32_t flagsOfFolder(std::string_view name,
                            const std::function<bool(std::string_view extension)>& isPackageExtension) {
    return isPackageExtension(path::extension(name)) ? itemIsContainer | itemIsPackage : itemIsContainer;
}

FileAttributes attributesFromStatus(const struct statx& status) {
    return {status.stx_size, dateAt(modificationTime(status)), dateAt(creationTime(status))};
}

// File systems with Unix's flag for backups, all the usual ones, have no hidden flag; neither have links.
// Knowing so without another call to the kernel is what keeps scans fast.
bool mayHaveHiddenFlag(const struct statx& status) {
    return !(status.stx_attributes_mask & STATX_ATTR_NODUMP) &&
           (S_ISDIR(status.stx_mode) || S_ISREG(status.stx_mode));
}

}  // namespace platform
