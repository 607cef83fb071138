// AppleDouble files: whatever their bytes, a value lies within the file.
#include <cstdint>
#include <cstdlib>
#include <span>

#include "platform/linux/AppleDouble.h"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    const auto bytes = std::as_bytes(std::span(data, size));
    platform::MemoryByteSource source({bytes.begin(), bytes.end()});
    if (const auto value = platform::attributeInAppleDouble(source, "date"); value && value->size() > size)
        std::abort();
    platform::attributeInAppleDouble(source, "");
    return 0;
}
