#include "framework/thumbnails/ThumbnailQueue.h"

#include "framework/GuardedWork.h"
#include "platform/Services.h"

namespace vexo {

using platform::Bitmap;
using platform::Locked;

namespace {

// Behind the host's own work, before what nobody waits for.
constexpr double threadPriority = 0.3;

bool isSamePicture(const ThumbnailQueue::PictureRef& one, const ThumbnailQueue::PictureRef& other) {
    return !one.owner_before(other) && !other.owner_before(one);
}

std::size_t bytesOf(const std::optional<Bitmap>& bitmap) {
    return bitmap ? bitmap->pixels.size() * sizeof(std::uint32_t) : 0;
}

}  // namespace

ThumbnailQueue::ThumbnailQueue(Maker maker, std::size_t mostBytesKept)
    : maker_(std::move(maker)), mostBytesKept_(mostBytesKept) {}

void ThumbnailQueue::add(PictureRef picture) {
    {
        Locked lock(mutex_);
        if (closed_)
            return;
        waiting_.push_back(std::move(picture));
        if (std::exchange(serving_, true))
            return;
    }
    platform::services().dispatcher.detachThread("vexo-thumbnails", threadPriority,
                                                 [self = shared_from_this()] { self->serve(); });
}

void ThumbnailQueue::close() {
    Locked lock(mutex_);
    closed_ = true;
    waiting_.clear();
}

void ThumbnailQueue::serve() {
    while (const auto next = takeNext()) {
        if (const auto picture = next->lock())
            fill(*picture, *next);
    }
}

std::optional<ThumbnailQueue::PictureRef> ThumbnailQueue::takeNext() {
    Locked lock(mutex_);
    if (waiting_.empty()) {
        serving_ = false;
        return std::nullopt;
    }
    PictureRef next = std::move(waiting_.back());
    waiting_.pop_back();
    return next;
}

void ThumbnailQueue::fill(const ThumbnailPicture& picture, const PictureRef& reference) {
    const ThumbnailPicture::Wish wish = picture.wish();
    std::optional<Bitmap> thumbnail;
    runGuarded([&] { thumbnail = maker_(picture.path(), wish.side); });
    const Shown shown{reference, bytesOf(thumbnail)};
    picture.show(std::move(thumbnail), wish);
    for (const PictureRef& old : keepAccountOf(shown))
        if (const auto forgotten = old.lock())
            forgotten->forget();
}

std::vector<ThumbnailQueue::PictureRef> ThumbnailQueue::keepAccountOf(const Shown& shown) {
    Locked lock(mutex_);
    std::erase_if(shown_, [&](const Shown& other) {
        return other.picture.expired() || isSamePicture(other.picture, shown.picture);
    });
    shown_.push_back(shown);
    std::size_t bytes = 0;
    for (const Shown& each : shown_)
        bytes += each.bytes;
    std::vector<PictureRef> tooMany;
    for (; bytes > mostBytesKept_ && shown_.size() > 1; shown_.pop_front()) {
        bytes -= shown_.front().bytes;
        tooMany.push_back(shown_.front().picture);
    }
    return tooMany;
}

}  // namespace vexo
