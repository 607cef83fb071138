#include "framework/metadata/MetadataCache.h"

#include <fcntl.h>
#include <sys/stat.h>

#include <cerrno>
#include <system_error>

#include "platform/linux/FileDescriptor.h"
#include "platform/linux/Uninterrupted.h"

namespace vexo {

namespace {

using platform::uninterrupted;

// The key of a file that can be read, or why it can't be.
using FileLook = std::variant<FileKey, MediaFailure>;

MediaFailure notReadable(std::string reason) {
    return {std::move(reason), FailureCause::elsewhere};
}

MediaFailure systemFailure(int error) {
    return notReadable(std::generic_category().message(error));
}

FileKey keyOf(const struct stat& status) {
    const auto seconds = static_cast<std::int64_t>(status.st_mtim.tv_sec);
    std::int64_t nanoseconds;
    // Years beyond 2262 exist on some file systems; there the whole seconds have to do.
    if (__builtin_mul_overflow(seconds, std::int64_t{1'000'000'000}, &nanoseconds) ||
        __builtin_add_overflow(nanoseconds, std::int64_t{status.st_mtim.tv_nsec}, &nanoseconds))
        nanoseconds = seconds;
    return {status.st_dev, status.st_ino, static_cast<std::uint64_t>(status.st_size), nanoseconds};
}

FileLook lookOf(const struct stat& status) {
    if (S_ISDIR(status.st_mode))
        return notReadable("it is a folder");
    if (!S_ISREG(status.st_mode))
        return notReadable("it is no plain file");
    if (status.st_size == 0)
        return notReadable("it is empty");
    return keyOf(status);
}

FileLook lookAt(const std::string& path) {
    struct stat status;
    const int result = uninterrupted([&] { return stat(path.c_str(), &status); });
    return result == 0 ? lookOf(status) : systemFailure(errno);
}

FileLook lookAt(int descriptor) {
    struct stat status;
    const int result = uninterrupted([&] { return fstat(descriptor, &status); });
    return result == 0 ? lookOf(status) : systemFailure(errno);
}

}  // namespace

MetadataCache::MetadataCache(const std::optional<std::string>& indexPath, std::shared_ptr<MediaReader> reader)
    : reader_(std::move(reader)), indexPath_(indexPath) {}

MetadataIndex& MetadataCache::index() {
    std::call_once(indexOpened_, [this] { index_.emplace(indexPath_); });
    return *index_;
}

MediaReaderAnswer MetadataCache::answerForFile(const std::string& path) {
    const FileLook look = lookAt(path);
    if (const auto* failure = std::get_if<MediaFailure>(&look))
        return *failure;
    if (const auto known = index().find(std::get<FileKey>(look)))
        return *known;

    // What lies at the path now may be another thing than what was just looked at: the flags keep a FIFO or a
    // terminal from doing harm, and what was opened is looked at anew.
    const platform::FileDescriptor file(
        uninterrupted([&] { return open(path.c_str(), O_RDONLY | O_NONBLOCK | O_NOCTTY | O_CLOEXEC); }));
    if (!file)
        return systemFailure(errno);
    return read(file.number());
}

MediaReaderAnswer MetadataCache::read(int descriptor) {
    platform::Locked lock(reading_);
    // Only now: the file may have changed while this thread waited.
    const FileLook before = lookAt(descriptor);
    if (const auto* failure = std::get_if<MediaFailure>(&before))
        return *failure;
    const FileKey key = std::get<FileKey>(before);
    if (const auto known = index().find(key))
        return *known;
    const MediaReaderAnswer answer = reader_->read(descriptor);
    if (lookAt(descriptor) == before)
        index().store(key, answer);
    return answer;
}

}  // namespace vexo
