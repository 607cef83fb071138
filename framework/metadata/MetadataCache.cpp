#include "framework/metadata/MetadataCache.h"

#include <fcntl.h>
#include <sys/stat.h>

#include "platform/linux/FileDescriptor.h"

namespace vexo {

namespace {

FileKey keyOf(const struct stat& status) {
    const auto seconds = static_cast<std::int64_t>(status.st_mtim.tv_sec);
    std::int64_t nanoseconds;
    // Years beyond 2262 exist on some file systems; there the whole seconds have to do.
    if (__builtin_mul_overflow(seconds, std::int64_t{1'000'000'000}, &nanoseconds) ||
        __builtin_add_overflow(nanoseconds, std::int64_t{status.st_mtim.tv_nsec}, &nanoseconds))
        nanoseconds = seconds;
    return {status.st_dev, status.st_ino, static_cast<std::uint64_t>(status.st_size), nanoseconds};
}

// The key of a plain file that has a content; nil for all else.
std::optional<FileKey> keyOfMedia(const struct stat& status) {
    if (!S_ISREG(status.st_mode) || status.st_size == 0)
        return std::nullopt;
    return keyOf(status);
}

std::optional<FileKey> keyOfFile(const std::string& path) {
    struct stat status;
    return stat(path.c_str(), &status) == 0 ? keyOfMedia(status) : std::nullopt;
}

std::optional<FileKey> keyOfFile(const platform::FileDescriptor& file) {
    struct stat status;
    return fstat(file.number(), &status) == 0 ? keyOfMedia(status) : std::nullopt;
}

const MediaFailure notReadable{"not a readable file with a content", FailureCause::elsewhere};

}  // namespace

MetadataCache::MetadataCache(const std::optional<std::string>& indexPath, std::shared_ptr<MediaReader> reader)
    : reader_(std::move(reader)), index_(indexPath) {}

MediaReaderAnswer MetadataCache::answerForFile(const std::string& path) {
    if (const auto key = keyOfFile(path); !key)
        return notReadable;
    else if (const auto known = index_.find(*key))
        return *known;

    // What lies at the path now may be another thing than what was just looked at: the flags keep a FIFO or a
    // terminal from doing harm, and the key is taken anew.
    const platform::FileDescriptor file(open(path.c_str(), O_RDONLY | O_NONBLOCK | O_NOCTTY | O_CLOEXEC));
    const auto key = file ? keyOfFile(file) : std::nullopt;
    if (!key)
        return notReadable;

    platform::Locked lock(reading_);
    if (const auto known = index_.find(*key))
        return *known;
    const MediaReaderAnswer answer = reader_->read(file.number());
    index_.store(*key, answer);
    return answer;
}

}  // namespace vexo
