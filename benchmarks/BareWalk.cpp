#include "benchmarks/BareWalk.h"

#include <dirent.h>
#include <fcntl.h>
#include <sys/stat.h>
#include <sys/xattr.h>
#include <unistd.h>

#include <array>
#include <stdexcept>
#include <string_view>

#include "benchmarks/BareDocument.h"
#include "benchmarks/SampleLibrary.h"
#include "platform/linux/FileDescriptor.h"

namespace bench {

namespace {

using platform::FileDescriptor;

FileDescriptor enter(int parent, const char* name) {
    FileDescriptor folder(openat(parent, name, O_RDONLY | O_DIRECTORY | O_CLOEXEC));
    if (!folder || fchdir(folder.number()) != 0)
        throw std::runtime_error(std::string("cannot enter ") + name);
    return folder;
}

// The entries of the working folder, with their modes.
template <typename Visit>
void visitEntries(const FileDescriptor& folder, const Visit& visit) {
    std::array<char, 32 * 1024> buffer;
    for (;;) {
        const ssize_t size = getdents64(folder.number(), buffer.data(), buffer.size());
        if (size <= 0)
            return;
        for (ssize_t at = 0; at < size;) {
            const auto* entry = reinterpret_cast<const dirent64*>(buffer.data() + at);
            at += entry->d_reclen;
            struct statx status {};
            if (*entry->d_name != '.' && statx(AT_FDCWD, entry->d_name, AT_SYMLINK_NOFOLLOW,
                                               STATX_BASIC_STATS | STATX_BTIME, &status) == 0)
                visit(entry->d_name, status.stx_mode);
        }
    }
}

void visitClip(const char* name, BareWalk& walk) {
    getxattr(name, "user.date", nullptr, 0);
    ++walk.clips;
}

void walkEvents(const FileDescriptor& library, BareWalk& walk) {
    visitEntries(library, [&](const char* name, unsigned mode) {
        if (!S_ISDIR(mode))
            return;
        const FileDescriptor event = enter(library.number(), name);
        ++walk.folders;
        visitEntries(event, [&](const char* clip, unsigned) { visitClip(clip, walk); });
        if (fchdir(library.number()) != 0)
            throw std::runtime_error("cannot go back");
    });
}

void visitProject(int folder, const char* name, BareWalk& walk) {
    const FileDescriptor package(openat(folder, name, O_RDONLY | O_DIRECTORY | O_CLOEXEC));
    struct statx movies {};
    if (statx(package.number(), "Movies", 0, STATX_BASIC_STATS, &movies) == 0)
        throw std::runtime_error("the projects of the sample have no movies");
    walk.trailers += isTrailerBarely(package.number(), "Project");
    ++walk.projects;
}

void walkProjects(const FileDescriptor& folder, BareWalk& walk) {
    visitEntries(folder, [&](const char* name, unsigned mode) {
        if (std::string_view(name).ends_with(".qnproject"))
            return visitProject(folder.number(), name, walk);
        if (!S_ISDIR(mode))
            return;
        ++walk.folders;
        walkProjects(enter(folder.number(), name), walk);
        if (fchdir(folder.number()) != 0)
            throw std::runtime_error("cannot go back");
    });
}

}  // namespace

BareWalk walkLibraries(const std::string& home) {
    BareWalk walk;
    if (access(projectsFolder(home).c_str(), F_OK) == 0)
        walkProjects(enter(AT_FDCWD, projectsFolder(home).c_str()), walk);
    walkEvents(enter(AT_FDCWD, eventsFolder(home).c_str()), walk);
    return walk;
}

}  // namespace bench
