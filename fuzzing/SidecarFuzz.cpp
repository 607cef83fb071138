// AppleDouble files: whatever their bytes, a value is a piece of the file.
#include <cstdint>
#include <span>

#include "fuzzing/Require.h"
#include "platform/linux/AppleDouble.h"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    const std::string_view content(reinterpret_cast<const char*>(data), size);
    platform::BorrowedByteSource file(std::as_bytes(std::span(content)));
    for (const char* name : {"date", ""}) {
        if (const auto value = platform::attributeInAppleDouble(file, name))
            require(content.find(*value) != std::string_view::npos);
    }
    return 0;
}
