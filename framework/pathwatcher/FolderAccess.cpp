#include "framework/pathwatcher/FolderAccess.h"

#include <dirent.h>
#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <climits>
#include <cstring>
#include <memory>

namespace vexo {

namespace {

struct FolderCloser {
    void operator()(DIR* folder) const { closedir(folder); }
};
using OpenFolder = std::unique_ptr<DIR, FolderCloser>;

PathEntry::Kind kindOf(mode_t mode) {
    if (S_ISDIR(mode))
        return PathEntry::Kind::folder;
    return S_ISLNK(mode) ? PathEntry::Kind::link : PathEntry::Kind::other;
}

std::string targetOfLink(const std::string& path) {
    char target[PATH_MAX];
    const ssize_t length = readlink(path.c_str(), target, sizeof target);
    return length > 0 ? std::string(target, static_cast<std::size_t>(length)) : std::string();
}

bool isDotOrDotDot(const char* name) {
    return std::strcmp(name, ".") == 0 || std::strcmp(name, "..") == 0;
}

}  // namespace

PathEntry DiskAccess::look(const std::string& path) const {
    struct stat status {};
    if (fstatat(AT_FDCWD, path.c_str(), &status, AT_SYMLINK_NOFOLLOW | AT_NO_AUTOMOUNT) != 0)
        return {};
    const PathEntry::Kind kind = kindOf(status.st_mode);
    return {kind, kind == PathEntry::Kind::link ? targetOfLink(path) : "", status.st_dev, status.st_ino};
}

FolderListing DiskAccess::list(const std::string& path) const {
    FolderListing listing;
    const OpenFolder folder(opendir(path.c_str()));
    if (!folder)
        return {errno, true, {}};
    errno = 0;
    while (const dirent* const entry = readdir(folder.get())) {
        if (isDotOrDotDot(entry->d_name))
            continue;
        listing.isEmpty = false;
        if (entry->d_type == DT_DIR || entry->d_type == DT_UNKNOWN)
            listing.folders.emplace_back(entry->d_name);
    }
    listing.error = errno;
    return listing;
}

}  // namespace vexo
