#include "framework/DurationBadge.h"

#include <cmath>

#include "host/VXMediaBrowserUtilities.h"
#include "platform/Drawing.h"
#include "platform/Duration.h"
#include "platform/Text.h"

namespace vexo {
namespace {

using platform::Rect;
using platform::Size;

// In points.
constexpr double margin = 4;
constexpr double paddingBeside = 5;
constexpr double height = 16;
constexpr double radius = 4;
constexpr double fontSize = 10;

// Readable on every picture without hiding it.
constexpr platform::Color color{0.08, 0.08, 0.1, 0.72};

platform::AttributedString textOf(double duration) {
    const std::string format =
        VXMediaBrowserUtilities::localizedStringForKey("DurationString", "DurationString");
    const auto [minutes, seconds] = platform::minutesAndSeconds(duration);
    return {platform::stringWithFormat(format, minutes, seconds), platform::boldSystemFontOfSize(fontSize),
            platform::whiteColor};
}

// Whole points wide: its edges lie on pixels.
Rect badgeAround(Size text, Size thumbnail) {
    const double width = std::ceil(text.width) + 2 * paddingBeside;
    return {thumbnail.width - margin - width, margin, width, height};
}

// No more than two thirds of the thumbnail either way: a wide one of 80 points still has room for minutes.
bool hasRoomFor(const Rect& badge, Size thumbnail) {
    constexpr double part = 2.0 / 3;
    return badge.width + 2 * margin <= thumbnail.width * part &&
           badge.height + 2 * margin <= thumbnail.height * part;
}

Rect centered(Size size, const Rect& rect) {
    return {rect.x + (rect.width - size.width) / 2, rect.y + (rect.height - size.height) / 2, size.width,
            size.height};
}

}  // namespace

platform::ImageRef durationBadge(double duration, Size size) {
    if (!(duration > 0) || !std::isfinite(duration))
        return nullptr;
    const platform::AttributedString text = textOf(duration);
    const Rect badge = badgeAround(text.size(), size);
    if (!hasRoomFor(badge, size))
        return nullptr;
    platform::Drawing drawing(size);
    drawing.setColor(color);
    drawing.fillRoundedRect(badge, radius);
    drawing.drawString(text, centered(text.size(), badge));
    return drawing.image();
}

}  // namespace vexo
