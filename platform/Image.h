// Images with identity. Two images may show the same picture and still be two objects: `copy` makes a
// distinct image that shares the picture.
//
// An image is set up by the thread that makes it and is not changed once others can see it.
#pragma once

#include <cstddef>
#include <cstdint>
#include <functional>
#include <memory>
#include <optional>
#include <span>
#include <string>
#include <vector>

#include "platform/Value.h"

namespace platform {

// Pixels as premultiplied ARGB, 8 bits a channel in native byte order, rows from the top without padding.
struct Bitmap {
    int width = 0;
    int height = 0;
    std::vector<std::uint32_t> pixels;
};

// Whether pictures of that size are drawn at all, in points or in pixels: from 1 to 16384 a side and up to
// 64 Mi in all.
bool isDrawableSize(double width, double height);

// Whether the bitmap has all its pixels and is of a size that is drawn.
bool isWhole(const Bitmap& bitmap);

// A picture that can be drawn at any size. Thread-safe.
//
// Most pictures never change. One that shows something on a disk may be drawn as a stand-in first and tell
// its observers when it has become what it is to show.
class Picture {
  public:
    virtual ~Picture() = default;

    // Told after each change, on any thread, outside every lock. An observer is forgotten when its owner
    // goes.
    using Observer = std::function<void()>;
    virtual void addObserver(std::weak_ptr<const void> /*owner*/, Observer /*observer*/) const {}
    // Has the picture look again at what it shows, where that may have changed; observers are then told.
    virtual void refresh() const {}

    virtual Size naturalSize() const = 0;  // in points
    // False when the picture's data is damaged.
    virtual bool isDrawable() const = 0;
    // The whole picture scaled to `width` x `height` pixels; nil when it can't be drawn, or for a size that
    // is not drawn.
    virtual std::optional<Bitmap> draw(int width, int height) const = 0;
    // Lays the whole picture over what the bitmap shows, scaled to its size. NO when it can't be drawn, or
    // the bitmap lacks pixels or is of a size that is not drawn; the bitmap may then show a part of it, and
    // so it may when this raises. Where a picture knows no quicker way it is drawn by itself first.
    virtual bool drawOver(Bitmap& bitmap) const;
};

class Image;
using ImageRef = std::shared_ptr<Image>;

// Made by make_shared. It may have owners that are counted apart from the others, so what tells images apart
// by their owners asks the image itself, by `weak_from_this`.
class Image : public std::enable_shared_from_this<Image> {
  public:
    explicit Image(std::shared_ptr<const Picture> picture, std::string name = {});

    // A distinct image of the same picture, name and size.
    ImageRef copy() const;

    const std::string& name() const { return name_; }  // empty when it has none
    // In points; the picture's until it is set.
    Size size() const;
    void setSize(Size size) { size_ = size; }
    // Whether a change of size scales the picture (else it is drawn at its natural size).
    bool scalesWhenResized() const { return scalesWhenResized_; }
    void setScalesWhenResized(bool scales) { scalesWhenResized_ = scales; }

    // False when the image can't be drawn.
    bool isValid() const;
    const std::shared_ptr<const Picture>& picture() const { return picture_; }

  private:
    std::shared_ptr<const Picture> picture_;
    std::string name_;
    std::optional<Size> size_;
    bool scalesWhenResized_ = false;
};

// A picture of the bytes of an SVG or PNG file, which it copies, never nil. They are parsed when something is
// first asked of the picture. Damaged bytes give a picture that is not drawable; so do pictures of a size
// that is not drawn, and SVG that is compressed or not in UTF-8, declares entities, embeds files, tells no
// size, or is larger or has more elements than any icon needs. Nothing outside the bytes is loaded, whatever
// an SVG refers to.
std::shared_ptr<const Picture> pictureWithData(std::span<const std::byte> data);

// A picture of those pixels; one that is not drawable for a bitmap that lacks some or has too many.
std::shared_ptr<const Picture> pictureWithBitmap(Bitmap bitmap);

// The picture in an SVG or PNG file, read at once through the file manager; nil when there is no plain file
// of at most 8 MiB that can be read.
std::shared_ptr<const Picture> pictureWithContentsOfFile(const std::string& path);

// The PNG encoding of a bitmap; empty when the bitmap is, or when it can't be encoded.
std::vector<std::byte> pngData(const Bitmap& bitmap);

}  // namespace platform
