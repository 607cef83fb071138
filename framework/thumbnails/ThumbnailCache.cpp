#include "framework/thumbnails/ThumbnailCache.h"

#include <fcntl.h>
#include <glib.h>
#include <sys/stat.h>

#include <array>
#include <cstdio>
#include <cstdlib>
#include <filesystem>

#include "platform/Path.h"
#include "platform/linux/FileDescriptor.h"
#include "platform/linux/PlainFile.h"
#include "platform/linux/UserFolders.h"

namespace vexo {

namespace {

constexpr std::array sizes{ThumbnailSize::normal, ThumbnailSize::large, ThumbnailSize::xLarge,
                           ThumbnailSize::xxLarge};
// Failures belong to the program, because another one may be able to show the movie.
const std::string failureFolder = "fail/vexo-" VEXO_VERSION;
constexpr std::size_t largestFile = 16u << 20;

std::string folderOf(ThumbnailSize size) {
    switch (size) {
        case ThumbnailSize::normal:
            return "normal";
        case ThumbnailSize::large:
            return "large";
        case ThumbnailSize::xLarge:
            return "x-large";
        case ThumbnailSize::xxLarge:
            break;
    }
    return "xx-large";
}

std::string checksum(const std::string& text) {
    const std::unique_ptr<gchar, void (*)(gpointer)> sum(
        g_compute_checksum_for_string(G_CHECKSUM_MD5, text.c_str(), -1), g_free);
    return sum.get();
}

std::optional<platform::Bitmap> thumbnailAt(const std::string& path, const ThumbnailSubject& subject,
                                            int longestSide) {
    const auto bytes = platform::contentsOfPlainFile(path, largestFile);
    return bytes ? decodedThumbnail(std::as_bytes(std::span(*bytes)), subject, longestSide) : std::nullopt;
}

void makeFoldersForUserAlone(const std::string& folder) {
    const std::string parent = platform::path::withoutLastComponent(folder);
    std::error_code ignored;
    if (!std::filesystem::exists(parent, ignored))
        makeFoldersForUserAlone(parent);
    mkdir(folder.c_str(), 0700);
}

// A file of its own beside the one that it is to become; gone again unless it was taken.
class NewFile {
  public:
    explicit NewFile(const std::string& path)
        : path_(path), temporary_(path + ".XXXXXX"), file_(mkostemp(temporary_.data(), O_CLOEXEC)) {}
    ~NewFile() {
        if (file_ && !taken_)
            std::remove(temporary_.c_str());
    }
    NewFile(const NewFile&) = delete;
    NewFile& operator=(const NewFile&) = delete;

    bool write(const std::vector<std::byte>& bytes) {
        return file_ && ::write(file_.number(), bytes.data(), bytes.size()) == std::ssize(bytes);
    }
    // Seconds from 1970, by the clock of the file system.
    std::int64_t modificationTime() const {
        struct stat status {};
        fstat(file_.number(), &status);
        return status.st_mtim.tv_sec;
    }
    void take() { taken_ = std::rename(temporary_.c_str(), path_.c_str()) == 0; }

  private:
    const std::string path_;
    std::string temporary_;
    const platform::FileDescriptor file_;  // for the user alone, as mkostemp makes them
    bool taken_ = false;
};

}  // namespace

ThumbnailSize thumbnailSizeFor(int side) {
    for (const ThumbnailSize size : sizes)
        if (side <= static_cast<int>(size))
            return size;
    return sizes.back();
}

ThumbnailCache::ThumbnailCache(std::optional<std::string> folder) : folder_(std::move(folder)) {}

std::optional<std::string> ThumbnailCache::defaultFolder() {
    const auto cache = platform::userCacheFolder();
    return cache ? std::optional(platform::path::appending(*cache, "thumbnails")) : std::nullopt;
}

std::string ThumbnailCache::pathFor(const ThumbnailSubject& subject, const std::string& sizeFolder) const {
    return *folder_ + "/" + sizeFolder + "/" + checksum(subject.uri) + ".png";
}

std::optional<platform::Bitmap> ThumbnailCache::find(const ThumbnailSubject& subject,
                                                     ThumbnailSize size) const {
    if (!folder_)
        return std::nullopt;
    for (const ThumbnailSize candidate : sizes) {
        if (candidate < size)
            continue;
        if (auto found = thumbnailAt(pathFor(subject, folderOf(candidate)), subject, int(candidate)))
            return found;
    }
    return std::nullopt;
}

void ThumbnailCache::store(const ThumbnailSubject& subject, ThumbnailSize size,
                           const platform::Bitmap& picture) const {
    write(subject, folderOf(size), picture);
}

bool ThumbnailCache::isKnownToFail(const ThumbnailSubject& subject) const {
    return folder_ && thumbnailAt(pathFor(subject, failureFolder), subject, 1);
}

void ThumbnailCache::storeFailure(const ThumbnailSubject& subject) const {
    const platform::Bitmap emptyPixel{1, 1, {0}};
    write(subject, failureFolder, emptyPixel);
}

void ThumbnailCache::write(const ThumbnailSubject& subject, const std::string& sizeFolder,
                           const platform::Bitmap& picture) const {
    const std::vector<std::byte> png =
        folder_ ? encodedThumbnail(subject, picture) : std::vector<std::byte>();
    if (png.empty())
        return;
    const std::string path = pathFor(subject, sizeFolder);
    makeFoldersForUserAlone(platform::path::withoutLastComponent(path));
    NewFile file(path);
    if (file.write(png) && file.modificationTime() != subject.modificationTime)
        file.take();
}

}  // namespace vexo
