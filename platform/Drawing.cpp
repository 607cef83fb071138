#include "platform/Drawing.h"

#include "platform/Renderer.h"

namespace platform {

// Not changed once it has become the picture of an image.
class Drawing::Recording final : public Picture {
  public:
    explicit Recording(Size size) : drawing_{size, {}} { drawing_.steps.reserve(usualSteps); }

    void add(DrawingStep step) { drawing_.steps.push_back(std::move(step)); }

    Size naturalSize() const override { return drawing_.size; }
    bool isDrawable() const override { return isDrawableSize(drawing_.size.width, drawing_.size.height); }
    std::optional<Bitmap> draw(int width, int height) const override {
        return isDrawable() ? renderer().draw(drawing_, width, height) : std::nullopt;
    }
    bool drawOver(Bitmap& bitmap) const override {
        return isDrawable() && isWhole(bitmap) && renderer().drawOver(bitmap, drawing_);
    }

  private:
    static constexpr std::size_t usualSteps = 4;  // of an overlay

    RecordedDrawing drawing_;
};

Drawing::Drawing(Size size) : recording_(std::make_shared<Recording>(size)) {}

Drawing::~Drawing() = default;

Size Drawing::size() const {
    return recording_->naturalSize();
}

void Drawing::fillRect(const Rect& rect) {
    recording_->add(FilledRect{rect, color_});
}

void Drawing::fillRoundedRect(const Rect& rect, double radius) {
    recording_->add(RoundedRect{rect, radius, color_});
}

void Drawing::drawImage(const Image& image, const Rect& inRect) {
    if (image.picture())
        recording_->add(DrawnImage{image.picture(), inRect});
}

void Drawing::drawString(const AttributedString& text, const Rect& inRect) {
    recording_->add(DrawnText{text, inRect});
}

ImageRef Drawing::image() {
    return std::make_shared<Image>(std::move(recording_));
}

AttributedString::AttributedString(std::string text, Font font, Color color)
    : text_(std::move(text)), font_(font), color_(color) {}

Size AttributedString::size() const {
    return renderer().sizeOf(*this);
}

}  // namespace platform
