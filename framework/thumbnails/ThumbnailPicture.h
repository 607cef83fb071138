// What a movie looks like: a stand-in at first, its thumbnail once that has been found or made. Nothing is
// looked for before the picture is drawn, and drawing never waits.
//
// Thread-safe. Holds its pixels only as long as the thumbnailer lets it; it asks for them again when it is
// drawn after that.
#pragma once

#include <memory>
#include <optional>
#include <string>

#include "platform/Image.h"
#include "platform/ObserverList.h"
#include "platform/ThreadSafety.h"

namespace vexo {

class ThumbnailQueue;

class ThumbnailPicture final : public platform::Picture,
                               public std::enable_shared_from_this<ThumbnailPicture> {
  public:
    // `standIn` is drawn in the middle, as large as it fits.
    ThumbnailPicture(std::string path, std::shared_ptr<const platform::Picture> standIn,
                     std::weak_ptr<ThumbnailQueue> queue);

    // 128 points on the longer side. A square, until the proportions of the movie are known.
    platform::Size naturalSize() const override VX_EXCLUDES(mutex_);
    bool isDrawable() const override { return true; }
    std::optional<platform::Bitmap> draw(int width, int height) const override VX_EXCLUDES(mutex_);
    void addObserver(std::weak_ptr<const void> owner, Observer observer) const override;
    void refresh() const override VX_EXCLUDES(mutex_);

    // --- For the thumbnailer, which works on what was drawn ---

    // Which thumbnail is wanted: for how many pixels a side, and how often the picture had been refreshed.
    struct Wish {
        int side = 0;
        unsigned refreshes = 0;
    };

    const std::string& path() const { return path_; }
    Wish wish() const VX_EXCLUDES(mutex_);
    // Takes the thumbnail that was made for a wish; nil when the movie has none.
    void show(std::optional<platform::Bitmap> thumbnail, const Wish& wish) const VX_EXCLUDES(mutex_);
    // Gives the pixels back.
    void forget() const VX_EXCLUDES(mutex_);

  private:
    struct State {
        std::shared_ptr<const platform::Picture> thumbnail;  // nil: the stand-in is shown
        // For how many pixels `thumbnail` was made, or was found not to exist; 0 when that is not known.
        int side = 0;
        Wish wish;             // the most pixels it was drawn with
        bool waiting = false;  // in the queue
    };

    std::shared_ptr<const platform::Picture> thumbnailFor(int side) const VX_EXCLUDES(mutex_);
    std::optional<platform::Bitmap> drawStandIn(int width, int height) const;

    const std::string path_;
    const std::shared_ptr<const platform::Picture> standIn_;
    const std::weak_ptr<ThumbnailQueue> queue_;
    mutable platform::ObserverList<> observers_;

    mutable platform::Mutex mutex_;
    mutable State state_ VX_GUARDED_BY(mutex_);
};

}  // namespace vexo
