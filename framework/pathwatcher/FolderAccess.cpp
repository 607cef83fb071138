#include "framework/pathwatcher/FolderAccess.h"

#include <dirent.h>
#include <fcntl.h>
#include <sys/stat.h>

#include <cerrno>
#include <cstring>
#include <memory>
#include <utility>

#include "platform/linux/FileStatus.h"
#include "platform/linux/Uninterrupted.h"

namespace vexo {

namespace {

using platform::uninterrupted;

struct FolderCloser {
    void operator()(DIR* folder) const { closedir(folder); }
};
using OpenFolder = std::unique_ptr<DIR, FolderCloser>;

PathEntry::Kind kindOf(mode_t mode) {
    if (S_ISDIR(mode))
        return PathEntry::Kind::folder;
    return S_ISLNK(mode) ? PathEntry::Kind::link : PathEntry::Kind::other;
}

PathEntry missingForError(int error) {
    PathEntry entry;
    entry.error = error;
    return entry;
}

bool isDotOrDotDot(const char* name) {
    return std::strcmp(name, ".") == 0 || std::strcmp(name, "..") == 0;
}

}  // namespace

PathEntry DiskAccess::look(const std::string& path) const {
    struct stat status {};
    constexpr int flags = AT_SYMLINK_NOFOLLOW | AT_NO_AUTOMOUNT;
    if (uninterrupted([&] { return fstatat(AT_FDCWD, path.c_str(), &status, flags); }) != 0)
        return missingForError(errno);
    PathEntry entry{kindOf(status.st_mode), "", status.st_dev, status.st_ino};
    if (entry.kind != PathEntry::Kind::link)
        return entry;
    auto target = platform::targetOfLink(path);
    if (!target)
        return missingForError(errno);
    entry.target = std::move(*target);
    return entry;
}

FolderListing DiskAccess::list(const std::string& path) const {
    FolderListing listing;
    const OpenFolder folder(uninterrupted([&] { return opendir(path.c_str()); }));
    if (!folder)
        return {errno, true, {}};
    while (const dirent* const entry = uninterrupted([&] { return readdir(folder.get()); })) {
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
