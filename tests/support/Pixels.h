// What tests draw, and look at, in bitmaps.
#pragma once

#include <cstdint>
#include <cstdlib>
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

inline std::uint32_t channel(std::uint32_t pixel, int shift) {
    return pixel >> shift & 255;
}

// One pixel over another, both premultiplied.
inline std::uint32_t blended(std::uint32_t over, std::uint32_t under) {
    std::uint32_t result = 0;
    for (int shift = 0; shift < 32; shift += 8) {
        const std::uint32_t shown = (channel(under, shift) * (255 - (over >> 24)) + 127) / 255;
        result |= (channel(over, shift) + shown) << shift;
    }
    return result;
}

// Alike but for what two ways to round can make of it.
inline bool areAlike(std::uint32_t one, std::uint32_t other) {
    for (int shift = 0; shift < 32; shift += 8) {
        if (std::abs(int(channel(one, shift)) - int(channel(other, shift))) > 2)
            return false;
    }
    return true;
}

}  // namespace testing_support
