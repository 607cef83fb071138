// Making an image by drawing on it.
//
// What is drawn is kept as it was said, in points, and played back when the image is drawn: it is crisp at
// every scale, and an image that nobody looks at costs no pixels. The origin is the lower left corner, y
// grows upwards; what lies outside leaves no mark, and numbers that make no rectangle draw nothing.
#pragma once

#include <memory>
#include <string>

#include "platform/Image.h"

namespace platform {

struct Rect {
    double x = 0, y = 0, width = 0, height = 0;  // in points
};

// In the calibrated RGB space, each from 0 to 1.
struct Color {
    double red = 0, green = 0, blue = 0, alpha = 1;
};

inline constexpr Color whiteColor{1, 1, 1, 1};

struct Font {
    double size;  // in points; text is drawn for sizes above 0 and up to 1000
    bool bold;
};

// The desktop's usual font.
constexpr Font boldSystemFontOfSize(double size) {
    return {size, /*bold=*/true};
}

// One line of text in one font and colour. Thread-safe.
class AttributedString {
  public:
    AttributedString(std::string text, Font font, Color color);

    // What the text takes up, in points, the same at every scale; nothing when it can't be drawn.
    Size size() const;

    const std::string& text() const { return text_; }
    const Font& font() const { return font_; }
    const Color& color() const { return color_; }

  private:
    std::string text_;
    Font font_;
    Color color_;
};

// Belongs to one thread; the image it makes is for all of them.
class Drawing {
  public:
    // A size that is not drawn makes an image that is not drawable.
    explicit Drawing(Size size);
    ~Drawing();
    Drawing(const Drawing&) = delete;
    Drawing& operator=(const Drawing&) = delete;

    Size size() const;
    void setColor(const Color& color) { color_ = color; }  // of the rectangles that follow; black at first
    // NSRectFill: the rectangle takes the colour on, alpha and all, whatever was there.
    void fillRect(const Rect& rect);
    // The same over what is there, with rounded corners.
    void fillRoundedRect(const Rect& rect, double radius);
    // drawInRect:fromRect:operation:fraction: of the whole image, over what is there, opaque. An image that
    // can't be drawn leaves nothing.
    void drawImage(const Image& image, const Rect& inRect);
    // drawInRect:; the text begins at the upper left corner of the rectangle and ends where that does.
    void drawString(const AttributedString& text, const Rect& inRect);

    // What was drawn, in an image of the drawing's size. Nothing may be asked of the drawing afterwards.
    ImageRef image();

  private:
    class Recording;

    std::shared_ptr<Recording> recording_;
    Color color_;
};

}  // namespace platform
