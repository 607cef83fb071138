#include "platform/linux/CairoCanvas.h"

namespace platform {

bool isDrawableSize(double width, double height) {
    constexpr double longestSide = 16384;
    constexpr double largestArea = 64.0 * 1024 * 1024;
    return width >= 1 && height >= 1 && width <= longestSide && height <= longestSide &&
           width * height <= largestArea;
}

bool isWhole(const Bitmap& bitmap) {
    return isDrawableSize(bitmap.width, bitmap.height) &&
           bitmap.pixels.size() == std::size_t(bitmap.width) * std::size_t(bitmap.height);
}

CairoSurface surfaceOf(const Bitmap& bitmap) {
    // Cairo takes no const pixels; a surface that is only read from leaves them alone.
    auto* pixels = reinterpret_cast<unsigned char*>(const_cast<std::uint32_t*>(bitmap.pixels.data()));
    return CairoSurface(cairo_image_surface_create_for_data(pixels, CAIRO_FORMAT_ARGB32, bitmap.width,
                                                            bitmap.height, bitmap.width * 4));
}

}  // namespace platform
