#include "platform/linux/drawing/DrawingPlayer.h"

#include <algorithm>
#include <cmath>
#include <numbers>
#include <variant>

#include "platform/linux/drawing/CairoCanvas.h"
#include "platform/linux/drawing/CairoPicture.h"
#include "platform/linux/drawing/TextLayout.h"

namespace platform {
namespace {

bool isEmpty(const Rect& rect) {
    return !(rect.width > 0 && rect.height > 0);
}

// Empty where the rectangle lies outside, or isn't one. Cairo wraps numbers that are too large for it.
Rect partInside(Size area, const Rect& rect) {
    if (!std::isfinite(rect.x + rect.width) || !std::isfinite(rect.y + rect.height))
        return {};
    const double left = std::max(rect.x, 0.0), bottom = std::max(rect.y, 0.0);
    return {left, bottom, std::min(rect.x + rect.width, area.width) - left,
            std::min(rect.y + rect.height, area.height) - bottom};
}

bool holds(const Rect& rect, Size size) {
    return size.width <= rect.width && size.height <= rect.height;
}

// Plays steps back, on an area of `size` points that the context has scaled to pixels.
class Player {
  public:
    // On clear ground a rectangle replaces what is there. Over a picture, which is to stay, it is laid over
    // it: that comes to the same unless the rectangle would have to replace what another step drew.
    enum class Ground { clear, picture };

    Player(cairo_t* context, Size size, Ground ground)
        : context_(context),
          size_(size),
          rectOperator_(ground == Ground::clear ? CAIRO_OPERATOR_SOURCE : CAIRO_OPERATOR_OVER) {
        cairo_user_to_device_distance(context, &pixelsPerPointX_, &pixelsPerPointY_);
    }

    void operator()(const FilledRect& step) const {
        const Rect rect = partInside(size_, step.rect);
        if (isEmpty(rect))
            return;
        setColor(step.color);
        cairo_set_operator(context_, rectOperator_);
        cairo_rectangle(context_, rect.x, top(rect), rect.width, rect.height);
        cairo_fill(context_);
        cairo_set_operator(context_, CAIRO_OPERATOR_OVER);
    }
    void operator()(const RoundedRect& step) const {
        const Rect rect = partInside(size_, step.rect);
        if (isEmpty(rect))
            return;
        setColor(step.color);
        addRoundedRectangle(rect, std::clamp(step.radius, 0.0, std::min(rect.width, rect.height) / 2));
        cairo_fill(context_);
    }
    void operator()(const DrawnImage& step) const {
        const double width = step.rect.width * pixelsPerPointX_;
        const double height = step.rect.height * pixelsPerPointY_;
        if (isEmpty(partInside(size_, step.rect)) || !isDrawableSize(width, height))
            return;
        const auto bitmap = step.picture->draw(int(std::lround(width)), int(std::lround(height)));
        if (bitmap && isWhole(*bitmap))
            draw(*bitmap, step.rect);
    }
    void operator()(const DrawnText& step) const {
        const TextLine* line = isEmpty(partInside(size_, step.rect)) ? nullptr : lineOf(step.text);
        if (!line)
            return;
        const bool isClipped = !holds(step.rect, line->size());
        if (isClipped) {
            cairo_save(context_);
            clipToPixelsOf(partInside(size_, step.rect));
        }
        setColor(step.text.color());
        line->draw(context_, step.rect.x, top(step.rect));
        if (isClipped)
            cairo_restore(context_);
    }

  private:
    // How far the rectangle is below the upper edge, where Cairo begins to count.
    double top(const Rect& rect) const { return size_.height - rect.y - rect.height; }
    void setColor(const Color& color) const {
        cairo_set_source_rgba(context_, color.red, color.green, color.blue, color.alpha);
    }
    void addRoundedRectangle(const Rect& rect, double radius) const {
        constexpr double quarter = std::numbers::pi / 2;
        const double left = rect.x + radius, right = rect.x + rect.width - radius;
        const double upper = top(rect) + radius, lower = top(rect) + rect.height - radius;
        cairo_new_sub_path(context_);
        cairo_arc(context_, right, upper, radius, -quarter, 0);
        cairo_arc(context_, right, lower, radius, 0, quarter);
        cairo_arc(context_, left, lower, radius, quarter, 2 * quarter);
        cairo_arc(context_, left, upper, radius, 2 * quarter, 3 * quarter);
        cairo_close_path(context_);
    }
    // The matrix of the source, unlike that of the context, need not be put back. A bitmap of just the right
    // size comes out as a shift by whole pixels, which is copied and not filtered.
    void draw(const Bitmap& bitmap, const Rect& rect) const {
        const CairoSurface surface = surfaceOf(bitmap);
        cairo_set_source_surface(context_, surface.get(), 0, 0);
        cairo_matrix_t pixelsOfPoints;
        cairo_matrix_init_scale(&pixelsOfPoints, bitmap.width / rect.width, bitmap.height / rect.height);
        cairo_matrix_translate(&pixelsOfPoints, -rect.x, -top(rect));
        cairo_pattern_set_matrix(cairo_get_source(context_), &pixelsOfPoints);
        cairo_paint(context_);
    }
    // Whole pixels: the edge of a clip that cuts through some would be blurred, and drawing slow.
    void clipToPixelsOf(const Rect& rect) const {
        const double left = std::floor(rect.x * pixelsPerPointX_);
        const double right = std::ceil((rect.x + rect.width) * pixelsPerPointX_);
        const double upper = std::floor(top(rect) * pixelsPerPointY_);
        const double lower = std::ceil((top(rect) + rect.height) * pixelsPerPointY_);
        cairo_rectangle(context_, left / pixelsPerPointX_, upper / pixelsPerPointY_,
                        (right - left) / pixelsPerPointX_, (lower - upper) / pixelsPerPointY_);
        cairo_clip(context_);
    }

    cairo_t* const context_;
    const Size size_;
    const cairo_operator_t rectOperator_;
    double pixelsPerPointX_ = 1, pixelsPerPointY_ = 1;
};

bool play(cairo_t* context, const RecordedDrawing& drawing, Player::Ground ground) {
    const Player player(context, drawing.size, ground);
    for (const DrawingStep& step : drawing.steps)
        std::visit(player, step);
    return true;
}

// Whether a rectangle that one can see through may replace what another step drew; where exactly that is
// doesn't count.
bool replacesWhatWasDrawn(const RecordedDrawing& drawing) {
    bool isClear = true;
    for (const DrawingStep& step : drawing.steps) {
        if (isEmpty(partInside(drawing.size, std::visit([](const auto& any) { return any.rect; }, step))))
            continue;
        const auto* fill = std::get_if<FilledRect>(&step);
        if (!isClear && fill && !(fill->color.alpha >= 1))
            return true;
        isClear = false;
    }
    return false;
}

}  // namespace

std::optional<Bitmap> played(const RecordedDrawing& drawing, int width, int height) {
    return paint(width, height, drawing.size,
                 [&](cairo_t* context) { return play(context, drawing, Player::Ground::clear); });
}

bool playOver(Bitmap& bitmap, const RecordedDrawing& drawing) {
    if (!replacesWhatWasDrawn(drawing))
        return paintOver(bitmap, drawing.size,
                         [&](cairo_t* context) { return play(context, drawing, Player::Ground::picture); });
    const auto drawn = played(drawing, bitmap.width, bitmap.height);
    return drawn && layOver(bitmap, *drawn);
}

}  // namespace platform
