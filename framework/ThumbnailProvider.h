// Shows what movies look like. Callable from any thread.
#pragma once

#include <string>

#include "platform/Image.h"

namespace vexo {

class ThumbnailProvider {
  public:
    virtual ~ThumbnailProvider() = default;

    // A new image of the movie at `path`; never nil. Nothing is read before the image is drawn, and drawing
    // it never waits: it shows a stand-in until the thumbnail is there, and then tells its observers.
    virtual platform::ImageRef thumbnailOfFile(const std::string& path) = 0;
};

}  // namespace vexo
