#include "platform/Image.h"

#include "platform/FileManager.h"
#include "platform/Services.h"

namespace platform {

Image::Image(std::shared_ptr<const Picture> picture, std::string name)
    : picture_(std::move(picture)), name_(std::move(name)) {}

ImageRef Image::copy() const {
    return std::make_shared<Image>(*this);
}

Size Image::size() const {
    if (size_)
        return *size_;
    return picture_ ? picture_->naturalSize() : Size{};
}

bool Image::isValid() const {
    return picture_ && picture_->isDrawable();
}

std::shared_ptr<const Picture> pictureWithContentsOfFile(const std::string& path) {
    constexpr std::uint64_t mostBytes = 8 * 1024 * 1024;
    const auto data = services().fileManager.contentsAtPath(path, mostBytes);
    return data ? pictureWithData(*data) : nullptr;
}

}  // namespace platform
