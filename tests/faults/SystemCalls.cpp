#include "tests/faults/SystemCalls.h"

#include <dirent.h>
#include <dlfcn.h>
#include <fcntl.h>
#include <sys/inotify.h>
#include <sys/stat.h>
#include <sys/syscall.h>
#include <sys/vfs.h>
#include <sys/xattr.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <climits>
#include <cstdarg>
#include <utility>

#include "tests/faults/SmallLibrary.h"

namespace testing_support {
namespace {

thread_local SystemCalls* followed = nullptr;

std::string pathOfDescriptor(int descriptor) {
    std::array<char, PATH_MAX> path{};
    const std::string link = "/proc/self/fd/" + std::to_string(descriptor);
    const long length = ::syscall(SYS_readlink, link.c_str(), path.data(), path.size());
    return {path.data(), static_cast<std::size_t>(length > 0 ? length : 0)};
}

std::string absolutePath(int folder, const char* path) {
    if (path && *path == '/')
        return path;
    const std::string base = folder == AT_FDCWD ? std::string() : pathOfDescriptor(folder);
    return path && *path ? base + "/" + path : base;
}

// The function that a call would reach without this file.
template <typename Function>
Function* original(Function* /*replacement*/, const char* name) {
    return reinterpret_cast<Function*>(dlsym(RTLD_NEXT, name));
}

// Whether the call is to fail; sets errno.
bool fails(const char* function, int folder, const char* path) {
    if (!followed)
        return false;
    const int previous = errno;
    const int error = SystemCalls::errorFor(function, folder, path);
    errno = error != 0 ? error : previous;
    return error != 0;
}
bool fails(const char* function, const char* path) {
    return fails(function, AT_FDCWD, path);
}
bool fails(const char* function, int descriptor) {
    return fails(function, descriptor, nullptr);
}

// The mode that follows the flags of a call, where they ask for one.
mode_t modeAfter(int flags, std::va_list arguments) {
    const bool takesMode = (flags & O_CREAT) || (flags & O_TMPFILE) == O_TMPFILE;
    return takesMode ? va_arg(arguments, mode_t) : 0;
}

}  // namespace

SystemCalls::SystemCalls(std::string folder) : folder_(std::move(folder)) {
    followed = this;
}

SystemCalls::~SystemCalls() {
    followed = nullptr;
}

void SystemCalls::failAt(std::size_t index, int error) {
    calls_.clear();
    failingIndex_ = index;
    error_ = error;
}

int SystemCalls::errorFor(const char* function, int folder, const char* path) {
    SystemCalls& calls = *followed;
    if (calls.isBusy_)
        return 0;
    SystemCall call{function, absolutePath(folder, path)};
    return isAtOrBelow(call.path, calls.folder_) ? calls.errorFor(std::move(call)) : 0;
}

int SystemCalls::errorFor(SystemCall call) {
    isBusy_ = true;
    if (beforeCall)
        beforeCall(call);
    isBusy_ = false;
    calls_.push_back(std::move(call));
    return calls_.size() == failingIndex_ + 1 ? error_ : 0;
}

}  // namespace testing_support

using testing_support::fails;
using testing_support::original;

// In the order of the C library's headers. What has a path first, then what has a descriptor.
extern "C" {

int open(const char* path, int flags, ...) {
    static const auto real = original(&::open, "open");
    std::va_list arguments;
    va_start(arguments, flags);
    const mode_t mode = testing_support::modeAfter(flags, arguments);
    va_end(arguments);
    return fails("open", path) ? -1 : real(path, flags, mode);
}

int openat(int folder, const char* path, int flags, ...) {
    static const auto real = original(&::openat, "openat");
    std::va_list arguments;
    va_start(arguments, flags);
    const mode_t mode = testing_support::modeAfter(flags, arguments);
    va_end(arguments);
    return fails("openat", folder, path) ? -1 : real(folder, path, flags, mode);
}

DIR* opendir(const char* path) {
    static const auto real = original(&::opendir, "opendir");
    return fails("opendir", path) ? nullptr : real(path);
}

int stat(const char* path, struct stat* status) noexcept {
    using Function = int(const char*, struct stat*) noexcept;
    static const auto real = reinterpret_cast<Function*>(dlsym(RTLD_NEXT, "stat"));
    return fails("stat", path) ? -1 : real(path, status);
}

int lstat(const char* path, struct stat* status) noexcept {
    static const auto real = original(&::lstat, "lstat");
    return fails("lstat", path) ? -1 : real(path, status);
}

int fstatat(int folder, const char* path, struct stat* status, int flags) noexcept {
    static const auto real = original(&::fstatat, "fstatat");
    return fails("fstatat", folder, path) ? -1 : real(folder, path, status, flags);
}

int statx(int folder, const char* path, int flags, unsigned mask, struct statx* status) noexcept {
    using Function = int(int, const char*, int, unsigned, struct statx*) noexcept;
    static const auto real = reinterpret_cast<Function*>(dlsym(RTLD_NEXT, "statx"));
    return fails("statx", folder, path) ? -1 : real(folder, path, flags, mask, status);
}

int statfs(const char* path, struct statfs* fileSystem) noexcept {
    using Function = int(const char*, struct statfs*) noexcept;
    static const auto real = reinterpret_cast<Function*>(dlsym(RTLD_NEXT, "statfs"));
    return fails("statfs", path) ? -1 : real(path, fileSystem);
}

// What the C library has no name for. It can't be told how many words were given, and takes six.
__attribute__((no_sanitize("address"))) long syscall(long number, ...) noexcept {
    constexpr long getxattrat = 464;
    using Function = long(long, ...) noexcept;
    static const auto real = reinterpret_cast<Function*>(dlsym(RTLD_NEXT, "syscall"));
    std::array<long, 6> given{};
    std::va_list arguments;
    va_start(arguments, number);
    for (long& argument : given)
        argument = va_arg(arguments, long);
    va_end(arguments);
    if (number == getxattrat &&
        fails("getxattrat", static_cast<int>(given[0]), reinterpret_cast<const char*>(given[1])))
        return -1;
    return real(number, given[0], given[1], given[2], given[3], given[4], given[5]);
}

ssize_t getxattr(const char* path, const char* name, void* value, size_t size) noexcept {
    static const auto real = original(&::getxattr, "getxattr");
    return fails("getxattr", path) ? -1 : real(path, name, value, size);
}

ssize_t lgetxattr(const char* path, const char* name, void* value, size_t size) noexcept {
    static const auto real = original(&::lgetxattr, "lgetxattr");
    return fails("lgetxattr", path) ? -1 : real(path, name, value, size);
}

ssize_t readlink(const char* path, char* target, size_t size) noexcept {
    static const auto real = original(&::readlink, "readlink");
    return fails("readlink", path) ? -1 : real(path, target, size);
}

char* realpath(const char* path, char* resolved) noexcept {
    static const auto real = original(&::realpath, "realpath");
    return fails("realpath", path) ? nullptr : real(path, resolved);
}

int access(const char* path, int mode) noexcept {
    static const auto real = original(&::access, "access");
    return fails("access", path) ? -1 : real(path, mode);
}

int inotify_add_watch(int queue, const char* path, uint32_t kinds) noexcept {
    static const auto real = original(&::inotify_add_watch, "inotify_add_watch");
    return fails("inotify_add_watch", path) ? -1 : real(queue, path, kinds);
}

dirent* readdir(DIR* folder) {
    static const auto real = original(&::readdir, "readdir");
    return fails("readdir", dirfd(folder)) ? nullptr : real(folder);
}

ssize_t getdents64(int folder, void* entries, size_t size) noexcept {
    static const auto real = original(&::getdents64, "getdents64");
    return fails("getdents64", folder) ? -1 : real(folder, entries, size);
}

int fstat(int file, struct stat* status) noexcept {
    static const auto real = original(&::fstat, "fstat");
    return fails("fstat", file) ? -1 : real(file, status);
}

ssize_t fgetxattr(int file, const char* name, void* value, size_t size) noexcept {
    static const auto real = original(&::fgetxattr, "fgetxattr");
    return fails("fgetxattr", file) ? -1 : real(file, name, value, size);
}

ssize_t read(int file, void* buffer, size_t size) {
    static const auto real = original(&::read, "read");
    return fails("read", file) ? -1 : real(file, buffer, size);
}

ssize_t pread(int file, void* buffer, size_t size, off_t offset) {
    static const auto real = original(&::pread, "pread");
    return fails("pread", file) ? -1 : real(file, buffer, size, offset);
}

}  // extern "C"
