// What makes pixels of pictures, drawings and text. It lies in a library of its own, which is loaded when
// something is first drawn, measured or asked whether it can be drawn: loading it takes about as long as
// everything else that a program does which only prints names.
#pragma once

#include <memory>
#include <optional>
#include <span>
#include <variant>
#include <vector>

#include "platform/Drawing.h"
#include "platform/Image.h"

namespace platform {

// What a Drawing was told, in points.
struct FilledRect {
    Rect rect;
    Color color;
};
struct RoundedRect {
    Rect rect;
    double radius;
    Color color;
};
struct DrawnImage {
    std::shared_ptr<const Picture> picture;
    Rect rect;
};
struct DrawnText {
    AttributedString text;
    Rect rect;
};
using DrawingStep = std::variant<FilledRect, RoundedRect, DrawnImage, DrawnText>;
struct RecordedDrawing {
    Size size;
    std::vector<DrawingStep> steps;
};

// Callable from any thread.
class Renderer {
  public:
    virtual ~Renderer() = default;

    // What data shows, of which pictureWithData makes a picture; nil for data that can't be drawn.
    virtual std::shared_ptr<const Picture> pictureOfData(std::span<const std::byte> data) const = 0;
    // Scaled. Requires: isWhole(bitmap).
    virtual std::optional<Bitmap> draw(const Bitmap& bitmap, int width, int height) const = 0;
    // Requires: isDrawableSize(drawing.size).
    virtual std::optional<Bitmap> draw(const RecordedDrawing& drawing, int width, int height) const = 0;
    // Requires: isDrawableSize(drawing.size), isWhole(bitmap).
    virtual bool drawOver(Bitmap& bitmap, const RecordedDrawing& drawing) const = 0;
    // Lays pixels over others, scaled to their size. Requires: both bitmaps are whole.
    virtual bool drawOver(Bitmap& bitmap, const Bitmap& drawn) const = 0;
    virtual Size sizeOf(const AttributedString& text) const = 0;
    // Requires: isWhole(bitmap).
    virtual std::vector<std::byte> pngData(const Bitmap& bitmap) const = 0;
};

// The process's renderer, loaded by the first call. Throws a std::runtime_error that says why it can't be,
// and so does whatever draws or measures: then the installation is damaged.
const Renderer& renderer();

}  // namespace platform
