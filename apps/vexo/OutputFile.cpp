#include "apps/vexo/OutputFile.h"

#include <fcntl.h>
#include <fmt/format.h>
#include <linux/magic.h>
#include <sys/stat.h>
#include <sys/statfs.h>
#include <unistd.h>

#include <cerrno>
#include <cstdio>
#include <cstring>
#include <filesystem>
#include <random>

#include "apps/vexo/Interruption.h"

namespace vexo {
namespace {

namespace fs = std::filesystem;

// An error number of the system; 0 for none.
using Error = int;

constexpr int mostLinks = 40;  // the kernel gives up there as well

Error writeAll(int descriptor, std::span<const std::byte> bytes) {
    while (!bytes.empty()) {
        const ssize_t count = write(descriptor, bytes.data(), bytes.size());
        if (count < 0 && errno == EINTR)
            continue;
        if (count < 0)
            return errno;
        bytes = bytes.subspan(static_cast<std::size_t>(count));
    }
    return 0;
}

std::string folderOf(const std::string& path) {
    const std::string folder = fs::path(path).parent_path().string();
    return folder.empty() ? "." : folder;
}

bool isLink(const std::string& path) {
    struct stat status {};
    return lstat(path.c_str(), &status) == 0 && S_ISLNK(status.st_mode);
}

// Links there lead to what is open, whatever name it had.
bool isOnProc(const std::string& path) {
    struct statfs status {};
    return statfs(folderOf(path).c_str(), &status) == 0 && status.f_type == PROC_SUPER_MAGIC;
}

// What is to be written: a name that is no link, or one of an open file.
std::string withLinksFollowed(std::string path) {
    for (int links = 0; links < mostLinks && isLink(path) && !isOnProc(path); ++links) {
        std::error_code error;
        const fs::path target = fs::read_symlink(path, error);
        path = (fs::path(folderOf(path)) / target).string();
    }
    return path;
}

bool isStandardOutput(const struct stat& file) {
    struct stat output {};
    return fstat(STDOUT_FILENO, &output) == 0 && output.st_dev == file.st_dev && output.st_ino == file.st_ino;
}

// Standard output keeps its place between what was written to it before and what comes after.
Error writeInPlace(const std::string& path, const struct stat& status, std::span<const std::byte> bytes) {
    if (isStandardOutput(status))
        return writeAll(STDOUT_FILENO, bytes);
    const int descriptor = open(path.c_str(), O_WRONLY | O_APPEND | O_NOCTTY | O_CLOEXEC);
    if (descriptor < 0)
        return errno;
    const Error error = writeAll(descriptor, bytes);
    return close(descriptor) == 0 || error ? error : errno;
}

std::string randomName() {
    std::random_device random;
    return fmt::format("{:08x}{:08x}", random(), random());
}

// A file that is gone again unless it was given its name.
class HiddenFile {
  public:
    explicit HiddenFile(const std::string& folder) : path_(folder + "/.vexo-" + randomName()) {
        descriptor_ = open(path_.c_str(), O_WRONLY | O_CREAT | O_EXCL | O_CLOEXEC, 0666);
        error_ = descriptor_ < 0 ? errno : 0;
    }
    ~HiddenFile() {
        if (descriptor_ < 0)
            return;
        close(descriptor_);
        unlink(path_.c_str());
    }
    HiddenFile(const HiddenFile&) = delete;
    HiddenFile& operator=(const HiddenFile&) = delete;

    Error error() const { return error_; }
    void writeBytes(std::span<const std::byte> bytes) { keep(writeAll(descriptor_, bytes)); }
    void setAccess(const struct stat& model);
    // Some file systems notice only now that there is no room.
    void sync() { attempt(fsync(descriptor_)); }
    void rename(const std::string& name);

  private:
    void attempt(int result) { keep(result == 0 ? 0 : errno); }
    void keep(Error error) { error_ = error_ ? error_ : error; }

    std::string path_;
    int descriptor_ = -1;
    Error error_ = 0;  // the first
};

// Where the owner cannot be the same, it is whoever writes.
void HiddenFile::setAccess(const struct stat& model) {
    [[maybe_unused]] const int ignored = fchown(descriptor_, model.st_uid, model.st_gid);
    attempt(fchmod(descriptor_, model.st_mode & 0777));
}

void HiddenFile::rename(const std::string& name) {
    if (Interruption::requested())
        keep(EINTR);
    if (error_)
        return;
    attempt(std::rename(path_.c_str(), name.c_str()));
    if (error_)
        return;
    close(descriptor_);
    descriptor_ = -1;
}

// `previous` is what lies there; nil for nothing.
Error replace(const std::string& path, const struct stat* previous, std::span<const std::byte> bytes) {
    // A file that may not be written may not be replaced either, even where its folder would allow it.
    if (previous && faccessat(AT_FDCWD, path.c_str(), W_OK, AT_EACCESS) != 0)
        return errno;
    const Interruption interruption;
    HiddenFile file(folderOf(path));
    if (file.error())
        return file.error();
    if (previous)
        file.setAccess(*previous);
    file.writeBytes(bytes);
    file.sync();
    file.rename(path);
    return file.error();
}

Error writeTo(const std::string& name, std::span<const std::byte> bytes) {
    if (name == "-")
        return writeAll(STDOUT_FILENO, bytes);
    const std::string path = withLinksFollowed(name);
    struct stat status {};
    const bool exists = stat(path.c_str(), &status) == 0;
    if (!exists)
        return errno == ENOENT ? replace(path, nullptr, bytes) : errno;
    return S_ISREG(status.st_mode) && !isLink(path) ? replace(path, &status, bytes)
                                                    : writeInPlace(path, status, bytes);
}

}  // namespace

std::optional<std::string> writeFile(const std::string& path, std::span<const std::byte> bytes) {
    if (path.empty())
        return "the file to write has no name";
    if (const Error error = writeTo(path, bytes))
        return "cannot write '" + path + "': " + std::strerror(error);
    return std::nullopt;
}

}  // namespace vexo
