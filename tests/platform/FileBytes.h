// Pieces of the files that tests make up.
#pragma once

#include <cstdint>
#include <string>
#include <string_view>

namespace testing_support {

// The number in `width` bytes, the highest first.
inline std::string bigEndian(std::uint64_t number, int width) {
    std::string bytes;
    for (int shift = 8 * (width - 1); shift >= 0; shift -= 8)
        bytes += static_cast<char>(number >> shift);
    return bytes;
}

inline std::string repeated(std::string_view text, int times) {
    std::string result;
    for (int i = 0; i < times; ++i)
        result += text;
    return result;
}

}  // namespace testing_support
