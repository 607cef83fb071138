// The thumbnails of a host: images that show a stand-in until their movie's thumbnail is there. Callable from
// any thread.
#pragma once

#include <memory>
#include <string>

#include "framework/ThumbnailProvider.h"
#include "framework/thumbnails/ThumbnailMaker.h"
#include "framework/thumbnails/ThumbnailQueue.h"

namespace vexo {

class Thumbnailer final : public ThumbnailProvider {
  public:
    explicit Thumbnailer(ThumbnailMaker maker);

    platform::ImageRef thumbnailOfFile(const std::string& path) override;
    // Makes no more thumbnails. Images that are still around keep what they show.
    void close();

  private:
    const std::shared_ptr<const platform::Picture> standIn_;
    const std::shared_ptr<ThumbnailQueue> queue_;  // held by its thread as well, while that runs
};

}  // namespace vexo
