#include "platform/linux/PlainFile.h"

#include <fcntl.h>
#include <sys/stat.h>

#include <algorithm>
#include <cerrno>

#include "platform/linux/Uninterrupted.h"

namespace platform {

namespace {

PlainFile failure(int error) {
    PlainFile file;
    file.error = error;
    return file;
}

// 0 for a plain file.
int reasonNotToOpen(const struct stat& status) {
    if (S_ISREG(status.st_mode))
        return 0;
    return S_ISDIR(status.st_mode) ? EISDIR : ENODEV;
}

}  // namespace

// The look before the open keeps devices from noticing; the one after it is for what was swapped in between,
// which O_NONBLOCK keeps from blocking.
PlainFile PlainFile::open(const std::string& path) {
    struct stat status {};
    if (uninterrupted([&] { return stat(path.c_str(), &status); }) != 0)
        return failure(errno);
    if (const int reason = reasonNotToOpen(status))
        return failure(reason);

    PlainFile file;
    file.descriptor = FileDescriptor(
        uninterrupted([&] { return ::open(path.c_str(), O_RDONLY | O_NONBLOCK | O_NOCTTY | O_CLOEXEC); }));
    if (!file || uninterrupted([&] { return fstat(file.descriptor.number(), &status); }) != 0)
        return failure(errno);
    if (const int reason = reasonNotToOpen(status))
        return failure(reason);
    file.size = static_cast<std::uint64_t>(status.st_size);
    return file;
}

std::ptrdiff_t readAt(const FileDescriptor& file, std::uint64_t offset, std::byte* buffer,
                      std::size_t length) {
    std::size_t done = 0;
    while (done < length) {
        const auto count = uninterrupted([&] {
            return pread(file.number(), buffer + done, length - done, static_cast<off_t>(offset + done));
        });
        if (count < 0)
            return -1;
        if (count == 0)
            break;
        done += static_cast<std::size_t>(count);
    }
    return static_cast<std::ptrdiff_t>(done);
}

std::optional<std::string> beginningOfPlainFile(const std::string& path, std::size_t limit) {
    const auto file = PlainFile::open(path);
    if (!file)
        return std::nullopt;
    std::string content(std::min<std::uint64_t>(file.size, limit), '\0');
    const auto count =
        readAt(file.descriptor, 0, reinterpret_cast<std::byte*>(content.data()), content.size());
    if (count < 0)
        return std::nullopt;
    content.resize(static_cast<std::size_t>(count));
    return content;
}

std::optional<std::string> contentsOfPlainFile(const std::string& path, std::size_t limit) {
    auto content = beginningOfPlainFile(path, limit + 1);
    if (content && content->size() > limit)
        return std::nullopt;
    return content;
}

}  // namespace platform
