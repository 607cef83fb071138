// Pictures of pixels and of data, drawn with Cairo: PNG by its own decoder, SVG by librsvg.
#pragma once

#include <memory>
#include <optional>
#include <span>
#include <vector>

#include "platform/Image.h"

namespace platform {

// nil for a size that is not drawn. Requires: isWhole(bitmap).
std::optional<Bitmap> scaled(const Bitmap& bitmap, int width, int height);

// Of the bytes of an SVG or PNG file; nil when they are damaged, or the picture is one that is not drawn.
std::shared_ptr<const Picture> newDataPicture(std::span<const std::byte> data);

// Lays pixels over others, scaled to their size. Requires: both bitmaps are whole.
bool layOver(Bitmap& bitmap, const Bitmap& drawn);

// Empty when Cairo fails. Requires: isWhole(bitmap).
std::vector<std::byte> encodedPNG(const Bitmap& bitmap);

}  // namespace platform
