// The thumbnails that the desktop's programs share, in the user's cache folder: one folder a size, one file a
// thumbnail, named after the checksum of what it shows. Which movies cannot be shown is kept there as well.
// (The layout, keys and permissions are those of the freedesktop.org thumbnail convention, version 0.9.)
//
// A thumbnail counts only while its movie keeps the modification time it had. Nothing here fails: what cannot
// be kept is made again. Callable from any thread.
#pragma once

#include <optional>
#include <string>

#include "framework/thumbnails/ThumbnailFile.h"

namespace vexo {

// The most pixels a side; the sizes that programs share.
enum class ThumbnailSize { normal = 128, large = 256, xLarge = 512, xxLarge = 1024 };

// The smallest size that has `side` pixels, else the largest.
ThumbnailSize thumbnailSizeFor(int side);

class ThumbnailCache {
  public:
    // `folder`: need not exist; nil keeps nothing.
    explicit ThumbnailCache(std::optional<std::string> folder);

    // "thumbnails" in the user's cache folder; nil where there is none.
    static std::optional<std::string> defaultFolder();

    // The thumbnail of that size or of the next larger one there is.
    std::optional<platform::Bitmap> find(const ThumbnailSubject& subject, ThumbnailSize size) const;
    // Keeps a picture of at most that size. One that was made in the second in which its movie was last
    // changed is not kept: the movie may change once more without its time telling.
    void store(const ThumbnailSubject& subject, ThumbnailSize size, const platform::Bitmap& picture) const;

    // Whether this program has found before that the movie, in its present state, has no picture.
    bool isKnownToFail(const ThumbnailSubject& subject) const;
    void storeFailure(const ThumbnailSubject& subject) const;

  private:
    std::string pathFor(const ThumbnailSubject& subject, const std::string& sizeFolder) const;
    void write(const ThumbnailSubject& subject, const std::string& sizeFolder,
               const platform::Bitmap& picture) const;

    const std::optional<std::string> folder_;
};

}  // namespace vexo
