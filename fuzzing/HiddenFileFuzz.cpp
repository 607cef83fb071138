// Lists of hidden names: every name is a line of the file.
#include <cstdint>
#include <cstdlib>

#include "platform/linux/HiddenNames.h"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    const std::string_view content(reinterpret_cast<const char*>(data), size);
    for (const auto& name : platform::namesInHiddenFile(content))
        if (name.empty() || name.find('\n') != std::string::npos ||
            content.find(name) == std::string_view::npos)
            std::abort();
    return 0;
}
