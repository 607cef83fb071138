#include "framework/thumbnails/Thumbnailer.h"

#include "framework/FrameworkResources.h"

namespace vexo {

Thumbnailer::Thumbnailer(ThumbnailMaker maker)
    : standIn_(frameworkIcon("movie")->picture()),
      queue_(std::make_shared<ThumbnailQueue>([maker = std::move(maker)](const std::string& path, int side) {
          return maker.thumbnailOf(path, side);
      })) {}

platform::ImageRef Thumbnailer::thumbnailOfFile(const std::string& path) {
    auto image =
        std::make_shared<platform::Image>(std::make_shared<ThumbnailPicture>(path, standIn_, queue_));
    image->setSize(image->size());  // an image's size stays, whatever its picture becomes
    return image;
}

void Thumbnailer::close() {
    queue_->close();
}

}  // namespace vexo
