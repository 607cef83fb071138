// The icons of files, drawn after their kind: "folder", "movie", "package", "document" and "volume", 32 x 32
// points each. Callable from any thread.
#pragma once

#include <functional>
#include <string>
#include <string_view>

#include "host/VXMediaBrowserImageManager.h"

namespace vexo {

class ImageManager final : public VXMediaBrowserImageManager {
  public:
    // `isMovie` tells by a file's path whether it is a movie; called from any thread.
    explicit ImageManager(std::function<bool(const std::string& path)> isMovie);

    // The same image for each file of a kind; nil when there is nothing at `path`.
    platform::ImageRef iconForFile(const std::string& path) override;

  private:
    const std::function<bool(const std::string& path)> isMovie_;
    const platform::ImageRef folder_;
    const platform::ImageRef movie_;
    const platform::ImageRef package_;
    const platform::ImageRef document_;
    const platform::ImageRef volume_;
};

}  // namespace vexo
