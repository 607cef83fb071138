// Finds the thumbnail of a movie among those that the desktop's programs share, or makes and shares it.
// Callable from any thread; waits for the file and the media reader.
#pragma once

#include <memory>
#include <optional>
#include <string>

#include "framework/metadata/MediaReader.h"
#include "framework/thumbnails/ThumbnailCache.h"

namespace vexo {

class ThumbnailMaker {
  public:
    ThumbnailMaker(ThumbnailCache cache, std::shared_ptr<MediaReader> reader);

    // A picture of the movie at `path` with about `side` pixels a side, as many as there is a shared size
    // for; nil for what is no movie.
    std::optional<platform::Bitmap> thumbnailOf(const std::string& path, int side) const;

  private:
    std::optional<platform::Bitmap> make(const std::string& path, const ThumbnailSubject& subject,
                                         ThumbnailSize size) const;

    const ThumbnailCache cache_;
    const std::shared_ptr<MediaReader> reader_;
};

}  // namespace vexo
