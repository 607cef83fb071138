#include <fmt/format.h>

#include <algorithm>
#include <cmath>
#include <limits>

#include "apps/vexo/Commands.h"
#include "apps/vexo/OutputFile.h"
#include "apps/vexo/Progress.h"
#include "apps/vexo/TreeLookup.h"
#include "framework/GuardedWork.h"

namespace vexo {
namespace {

// Whole pixels that hold so many points. What is beyond the type is beyond any picture.
int pixels(double points, double scale) {
    const double most = std::numeric_limits<int>::max();
    return static_cast<int>(std::clamp(std::ceil(points * scale), 0.0, most));
}

std::string text(platform::Size size) {
    return fmt::format("{}x{}", size.width, size.height);
}

}  // namespace

Problems runOverlay(Host& host, const OverlayOptions& options) {
    loadWithProgress(host);
    const TreeLookup lookup(host);
    const FoundObject* const found = lookup.objectWithID(options.object);
    if (!found)
        return {TreeLookup::noObjectProblem(options.object)};
    const platform::ImageRef overlay = guardedAnswer([&] {
        return found->manager->thumbnailOverlayForMediaObject(found->mediaObject, {found->mediaGroup},
                                                              options.size);
    });
    if (!overlay || !overlay->picture())
        return {"the item has no overlay at " + text(options.size) + " points; no file was written"};
    const auto bitmap = guardedAnswer([&] {
        return overlay->picture()->draw(pixels(options.size.width, options.scale),
                                        pixels(options.size.height, options.scale));
    });
    const std::vector<std::byte> png = bitmap ? platform::pngData(*bitmap) : std::vector<std::byte>();
    if (png.empty())
        return {fmt::format("an overlay of {} points at scale {} cannot be drawn; try a smaller one",
                            text(options.size), options.scale)};
    if (const Problem problem = writeFile(options.outputFile, png))
        return {*problem};
    return {};
}

}  // namespace vexo
