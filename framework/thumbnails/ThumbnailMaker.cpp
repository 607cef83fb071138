#include "framework/thumbnails/ThumbnailMaker.h"

#include <sys/stat.h>

#include "platform/FileManager.h"
#include "platform/Services.h"
#include "platform/URL.h"
#include "platform/linux/PlainFile.h"
#include "platform/linux/Uninterrupted.h"

namespace vexo {

namespace {

ThumbnailSubject subjectOf(const std::string& path, const struct stat& status) {
    return {platform::URL::fileURLWithPath(path).absoluteString(), status.st_mtim.tv_sec,
            static_cast<std::uint64_t>(status.st_size)};
}

// nil for what has no content to show.
std::optional<ThumbnailSubject> subjectAt(const std::string& path) {
    struct stat status;
    if (platform::uninterrupted([&] { return stat(path.c_str(), &status); }) != 0 ||
        !S_ISREG(status.st_mode) || status.st_size == 0)
        return std::nullopt;
    return subjectOf(path, status);
}

bool isStill(const ThumbnailSubject& subject, const platform::FileDescriptor& file) {
    struct stat status;
    const int result = platform::uninterrupted([&] { return fstat(file.number(), &status); });
    return result == 0 && status.st_mtim.tv_sec == subject.modificationTime &&
           static_cast<std::uint64_t>(status.st_size) == subject.size;
}

}  // namespace

ThumbnailMaker::ThumbnailMaker(ThumbnailCache cache, std::shared_ptr<MediaReader> reader)
    : cache_(std::move(cache)), reader_(std::move(reader)) {}

std::optional<platform::Bitmap> ThumbnailMaker::thumbnailOf(const std::string& path, int side) const {
    // Other programs know the file by its real path.
    const platform::FileManager& files = platform::services().fileManager;
    const auto realPath = files.resolvedPath(path);
    const auto subject = realPath && files.isInReach(*realPath) ? subjectAt(*realPath) : std::nullopt;
    if (!subject)
        return std::nullopt;
    const ThumbnailSize size = thumbnailSizeFor(side);
    if (auto found = cache_.find(*subject, size))
        return found;
    if (cache_.isKnownToFail(*subject))
        return std::nullopt;
    return make(*realPath, *subject, size);
}

std::optional<platform::Bitmap> ThumbnailMaker::make(const std::string& path, const ThumbnailSubject& subject,
                                                     ThumbnailSize size) const {
    const auto file = platform::PlainFile::open(path);
    if (!file)
        return std::nullopt;
    MediaFrameAnswer answer = reader_->frame(file.descriptor.number(), static_cast<int>(size));
    const bool isShareable = isStill(subject, file.descriptor);
    if (auto* picture = std::get_if<platform::Bitmap>(&answer)) {
        if (isShareable)
            cache_.store(subject, size, *picture);
        return std::move(*picture);
    }
    if (isShareable && std::get<MediaFailure>(answer).cause == FailureCause::file)
        cache_.storeFailure(subject);
    return std::nullopt;
}

}  // namespace vexo
