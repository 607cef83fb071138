// What tests draw, and look at, in bitmaps.
#pragma once

#include <cstdint>
#include <vector>

#include "platform/Image.h"

namespace testing_support {

constexpr std::uint32_t transparent = 0;
constexpr std::uint32_t opaqueRed = 0xffff0000, opaqueGreen = 0xff00ff00, opaqueBlue = 0xff0000ff;

inline platform::Bitmap plainBitmap(int width, int height, std::uint32_t colour = opaqueRed) {
    return {width, height, std::vector<std::uint32_t>(std::size_t(width) * std::size_t(height), colour)};
}

// `y` counts from the top.
inline std::uint32_t pixel(const platform::Bitmap& bitmap, int x, int y) {
    return bitmap.pixels[std::size_t(y * bitmap.width + x)];
}

}  // namespace testing_support
