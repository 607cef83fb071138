#include "platform/Image.h"

#include <mutex>
#include <utility>

#include "platform/FileManager.h"
#include "platform/Renderer.h"
#include "platform/Services.h"

namespace platform {

namespace {

class UndrawablePicture final : public Picture {
  public:
    Size naturalSize() const override { return {}; }
    bool isDrawable() const override { return false; }
    std::optional<Bitmap> draw(int, int) const override { return std::nullopt; }
};

class BitmapPicture final : public Picture {
  public:
    explicit BitmapPicture(Bitmap bitmap) : bitmap_(std::move(bitmap)) {}

    Size naturalSize() const override { return {double(bitmap_.width), double(bitmap_.height)}; }
    bool isDrawable() const override { return true; }
    std::optional<Bitmap> draw(int width, int height) const override {
        return renderer().draw(bitmap_, width, height);
    }

  private:
    const Bitmap bitmap_;
};

// What bytes show, read when it is first needed: programs that only print names have icons and draw none.
class DataPicture final : public Picture {
  public:
    explicit DataPicture(std::span<const std::byte> data) : data_(data.begin(), data.end()) {}

    Size naturalSize() const override { return picture().naturalSize(); }
    bool isDrawable() const override { return picture().isDrawable(); }
    std::optional<Bitmap> draw(int width, int height) const override { return picture().draw(width, height); }
    bool drawOver(Bitmap& bitmap) const override { return picture().drawOver(bitmap); }

  private:
    const Picture& picture() const {
        std::call_once(isRead_, [this] {
            picture_ = renderer().pictureOfData(data_);
            if (!picture_)
                picture_ = std::make_shared<UndrawablePicture>();
            std::exchange(data_, {});  // assigning {} would keep its memory
        });
        return *picture_;
    }

    mutable std::once_flag isRead_;
    mutable std::vector<std::byte> data_;  // until it is read
    mutable std::shared_ptr<const Picture> picture_;
};

}  // namespace

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

bool Picture::drawOver(Bitmap& bitmap) const {
    const auto drawn = isWhole(bitmap) ? draw(bitmap.width, bitmap.height) : std::nullopt;
    return drawn && isWhole(*drawn) && renderer().drawOver(bitmap, *drawn);
}

bool isDrawableSize(double width, double height) {
    constexpr double longestSide = 16384;
    constexpr double largestArea = 64.0 * 1024 * 1024;
    return width >= 1 && height >= 1 && width <= longestSide && height <= longestSide &&
           width * height <= largestArea;
}

bool isWhole(const Bitmap& bitmap) {
    return isDrawableSize(bitmap.width, bitmap.height) &&
           bitmap.pixels.size() == std::size_t(bitmap.width) * std::size_t(bitmap.height);
}

std::shared_ptr<const Picture> pictureWithData(std::span<const std::byte> data) {
    return std::make_shared<DataPicture>(data);
}

std::shared_ptr<const Picture> pictureWithBitmap(Bitmap bitmap) {
    if (!isWhole(bitmap))
        return std::make_shared<UndrawablePicture>();
    return std::make_shared<BitmapPicture>(std::move(bitmap));
}

std::shared_ptr<const Picture> pictureWithContentsOfFile(const std::string& path) {
    constexpr std::uint64_t mostBytes = 8 * 1024 * 1024;
    const auto data = services().fileManager.contentsAtPath(path, mostBytes);
    return data ? pictureWithData(*data) : nullptr;
}

std::vector<std::byte> pngData(const Bitmap& bitmap) {
    return isWhole(bitmap) ? renderer().pngData(bitmap) : std::vector<std::byte>();
}

}  // namespace platform
