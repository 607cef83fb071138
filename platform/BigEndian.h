// Numbers as most file formats write them, the highest byte first.
#pragma once

#include <cstddef>
#include <cstdint>
#include <span>

namespace platform {

// Of at most eight bytes.
constexpr std::uint64_t bigEndian(std::span<const std::byte> bytes) {
    std::uint64_t number = 0;
    for (const std::byte byte : bytes)
        number = number << 8 | std::to_integer<std::uint64_t>(byte);
    return number;
}

}  // namespace platform
