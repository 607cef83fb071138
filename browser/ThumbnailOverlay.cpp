// What is drawn over the thumbnails of projects and their movies.
#include "core/ReelixConstants.h"
#include "core/VXReelixPlugin.h"
#include "host/VXMediaBrowserUtilities.h"
#include "platform/Drawing.h"
#include "platform/Duration.h"
#include "platform/Text.h"

namespace reelix {
namespace {

using platform::Color;
using platform::Drawing;
using platform::Rect;
using platform::Size;

// Widths in points that a thumbnail must exceed.
constexpr double leastWidthForOverlay = 40;
constexpr double leastWidthForBand = 50;

constexpr double bandHeight = 12;
constexpr double edgeBottom = -1;  // where the icon stands too, if there is a band
constexpr double iconLeft = 2;
constexpr double iconSide = 20;
constexpr double fontSize = 10;

constexpr Color bandColor{0, 0, 0, 0.5};
constexpr Color edgeColor{0, 0, 0, 0.65F};

// The attribute's value for the icon of the application itself.
constexpr int currentFormatVersion = 7;

std::string durationText(double duration) {
    const std::string format =
        vexo::VXMediaBrowserUtilities::localizedStringForKey("DurationString", "DurationString");
    const auto [minutes, seconds] = platform::minutesAndSeconds(duration);
    return platform::stringWithFormat(format, minutes, seconds);
}

// The edge line lies below the image and leaves no mark.
void drawBand(Drawing& drawing) {
    drawing.setColor(bandColor);
    drawing.fillRect({0, 0, drawing.size().width, bandHeight});
    drawing.setColor(edgeColor);
    drawing.fillRect({0, edgeBottom, drawing.size().width, 1});
}

void drawDuration(Drawing& drawing, double duration) {
    const platform::AttributedString text(durationText(duration), platform::boldSystemFontOfSize(fontSize),
                                          platform::whiteColor);
    const Size size = text.size();
    drawing.drawString(text, {drawing.size().width - size.width + 1 - 4, -0.5, size.width, size.height});
}

}  // namespace

platform::ImageRef VXReelixPlugin::thumbnailOverlayForMediaObject(const Object& mediaObject,
                                                                  const Groups& inMediaGroups, Size atSize) {
    // Small thumbnails get no overlay at all, not even the host's.
    if (!(atSize.width > leastWidthForOverlay))
        return nullptr;
    const auto formatVersion = mediaObject->attributeForKey(vexo::VXReelixProjectFormatVersion);
    if (!(atSize.height > 0) || !formatVersion)
        return VXMediaManager::thumbnailOverlayForMediaObject(mediaObject, inMediaGroups, atSize);

    Drawing drawing(atSize);
    const bool hasBand = atSize.width > leastWidthForBand;
    if (hasBand)
        drawBand(drawing);
    const bool isCurrent = formatVersion->intValue() == currentFormatVersion;
    if (const platform::ImageRef icon = iconNamed(isCurrent ? MBReelixAppIconSmall : MBReelixIcon))
        drawing.drawImage(*icon, {iconLeft, hasBand ? edgeBottom : 0, iconSide, iconSide});
    const double duration = hasBand ? mediaObject->duration() : 0;
    if (duration > 0)
        drawDuration(drawing, duration);
    return drawing.image();
}

}  // namespace reelix
