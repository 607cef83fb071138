// What everything that is drawn with Cairo begins with: a context on the pixels of a bitmap.
#pragma once

#include <cairo.h>

#include <memory>
#include <optional>

#include "platform/Image.h"

namespace platform {

struct CairoRelease {
    void operator()(cairo_surface_t* surface) const { cairo_surface_destroy(surface); }
    void operator()(cairo_t* context) const { cairo_destroy(context); }
};
using CairoSurface = std::unique_ptr<cairo_surface_t, CairoRelease>;
using CairoContext = std::unique_ptr<cairo_t, CairoRelease>;

// A surface that shows the bitmap's own pixels. Requires: the bitmap is whole and outlives the surface.
inline CairoSurface surfaceOf(const Bitmap& bitmap) {
    // Cairo takes no const pixels; a surface that is only read from leaves them alone.
    auto* pixels = reinterpret_cast<unsigned char*>(const_cast<std::uint32_t*>(bitmap.pixels.data()));
    return CairoSurface(cairo_image_surface_create_for_data(pixels, CAIRO_FORMAT_ARGB32, bitmap.width,
                                                            bitmap.height, bitmap.width * 4));
}

// Draws with `drawContent`, which sees an area of `contentSize`, over the bitmap. NO when `drawContent`
// answers that or Cairo has failed. Requires: the bitmap is whole; isDrawableSize(contentSize).
template <typename DrawContent>
bool paintOver(Bitmap& bitmap, Size contentSize, const DrawContent& drawContent) {
    const CairoSurface surface = surfaceOf(bitmap);
    const CairoContext context(cairo_create(surface.get()));
    cairo_scale(context.get(), bitmap.width / contentSize.width, bitmap.height / contentSize.height);
    const bool isDrawn = drawContent(context.get()) && cairo_status(context.get()) == CAIRO_STATUS_SUCCESS;
    cairo_surface_flush(surface.get());
    return isDrawn;
}

// What `drawContent` draws on an area of `contentSize`, as a bitmap of the given pixels; nil for a size that
// is not drawn, or when `drawContent` answers NO. Requires: isDrawableSize(contentSize).
template <typename DrawContent>
std::optional<Bitmap> paint(int width, int height, Size contentSize, const DrawContent& drawContent) {
    if (!isDrawableSize(width, height))
        return std::nullopt;
    Bitmap bitmap{width, height, std::vector<std::uint32_t>(std::size_t(width) * std::size_t(height))};
    if (!paintOver(bitmap, contentSize, drawContent))
        return std::nullopt;
    return bitmap;
}

}  // namespace platform
