#include "framework/thumbnails/ThumbnailPicture.h"

#include <algorithm>

#include "framework/thumbnails/ThumbnailQueue.h"

namespace vexo {

using platform::Bitmap;
using platform::Locked;
using platform::Size;

namespace {

constexpr double naturalSide = 128;

}  // namespace

ThumbnailPicture::ThumbnailPicture(std::string path, std::shared_ptr<const platform::Picture> standIn,
                                   std::weak_ptr<ThumbnailQueue> queue)
    : path_(std::move(path)), standIn_(std::move(standIn)), queue_(std::move(queue)) {}

Size ThumbnailPicture::naturalSize() const {
    Locked lock(mutex_);
    if (!state_.thumbnail)
        return {naturalSide, naturalSide};
    const Size pixels = state_.thumbnail->naturalSize();
    const double scale = naturalSide / std::max(pixels.width, pixels.height);
    return {pixels.width * scale, pixels.height * scale};
}

std::optional<Bitmap> ThumbnailPicture::draw(int width, int height) const {
    const auto thumbnail = thumbnailFor(std::max(width, height));
    return thumbnail ? thumbnail->draw(width, height) : drawStandIn(width, height);
}

// A thumbnail that is too small is still better than the stand-in while a larger one is on its way.
std::shared_ptr<const platform::Picture> ThumbnailPicture::thumbnailFor(int side) const {
    std::shared_ptr<const platform::Picture> thumbnail;
    {
        Locked lock(mutex_);
        state_.wish.side = std::max(state_.wish.side, side);
        const bool isMissing = side > state_.side && !state_.waiting;
        thumbnail = state_.thumbnail;
        if (!isMissing)
            return thumbnail;
        state_.waiting = true;
    }
    if (const auto queue = queue_.lock())
        queue->add(weak_from_this());
    return thumbnail;
}

std::optional<Bitmap> ThumbnailPicture::drawStandIn(int width, int height) const {
    const int side = std::min(width, height);
    const std::optional<Bitmap> icon = standIn_->draw(side, side);
    if (!icon || width == height)
        return icon;
    Bitmap whole{width, height, std::vector<std::uint32_t>(std::size_t(width) * std::size_t(height))};
    const int left = (width - side) / 2;
    const int top = (height - side) / 2;
    for (int y = 0; y < side; ++y)
        std::copy_n(icon->pixels.begin() + std::ptrdiff_t(y) * side, side,
                    whole.pixels.begin() + std::ptrdiff_t(top + y) * width + left);
    return whole;
}

void ThumbnailPicture::addObserver(std::weak_ptr<const void> owner, Observer observer) const {
    observers_.add(std::move(owner), std::move(observer));
}

// What was shown stays in sight until it is known better.
void ThumbnailPicture::refresh() const {
    {
        Locked lock(mutex_);
        state_.side = 0;
        ++state_.wish.refreshes;
    }
    observers_.notify();
}

ThumbnailPicture::Wish ThumbnailPicture::wish() const {
    Locked lock(mutex_);
    return state_.wish;
}

// What was made before the last refresh is shown, but does not count as known.
void ThumbnailPicture::show(std::optional<Bitmap> thumbnail, const Wish& wish) const {
    {
        Locked lock(mutex_);
        state_.thumbnail = thumbnail ? platform::pictureWithBitmap(*std::move(thumbnail)) : nullptr;
        state_.side = wish.refreshes == state_.wish.refreshes ? wish.side : 0;
        state_.waiting = false;
    }
    observers_.notify();
}

void ThumbnailPicture::forget() const {
    Locked lock(mutex_);
    state_.thumbnail = nullptr;
    state_.side = 0;
    state_.wish.side = 0;
}

}  // namespace vexo
