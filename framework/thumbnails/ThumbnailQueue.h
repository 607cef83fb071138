// The pictures that wait for their thumbnails, and the thread that serves them. The picture that was drawn
// last comes first: it is the one in sight. Callable from any thread.
//
// There is a thread only while there is work. The pixels of all thumbnails together are bounded; the ones
// that were made longest ago go first.
#pragma once

#include <deque>
#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "framework/thumbnails/ThumbnailPicture.h"
#include "platform/Dispatcher.h"

namespace vexo {

class ThumbnailQueue : public std::enable_shared_from_this<ThumbnailQueue> {
  public:
    using PictureRef = std::weak_ptr<const ThumbnailPicture>;
    // Finds or makes the thumbnail of the movie at `path`; nil when it has none. Called on the queue's
    // thread.
    using Maker = std::function<std::optional<platform::Bitmap>(const std::string& path, int side)>;

    static constexpr std::size_t mostBytes = 128u << 20;

    explicit ThumbnailQueue(Maker maker, std::size_t mostBytesKept = mostBytes);

    void add(PictureRef picture) VX_EXCLUDES(mutex_);
    // Drops what waits; nothing is made any more.
    void close() VX_EXCLUDES(mutex_);

  private:
    struct Shown {
        PictureRef picture;
        std::size_t bytes = 0;
    };

    void serve() VX_EXCLUDES(mutex_);
    // nil when nothing waits; the thread is then to end.
    std::optional<PictureRef> takeNext() VX_EXCLUDES(mutex_);
    void fill(const ThumbnailPicture& picture, const PictureRef& reference) VX_EXCLUDES(mutex_);
    // Answers the pictures whose pixels are to be given back.
    std::vector<PictureRef> keepAccountOf(const Shown& shown) VX_EXCLUDES(mutex_);

    const Maker maker_;
    const std::size_t mostBytesKept_;

    platform::Mutex mutex_;
    std::vector<PictureRef> waiting_ VX_GUARDED_BY(mutex_);
    bool serving_ VX_GUARDED_BY(mutex_) = false;
    bool closed_ VX_GUARDED_BY(mutex_) = false;
    std::deque<Shown> shown_ VX_GUARDED_BY(mutex_);  // in the order in which they were made
};

}  // namespace vexo
