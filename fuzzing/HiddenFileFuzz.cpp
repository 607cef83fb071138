// Lists of hidden names: every name is a line of the file, and every line is one.
#include <cstdint>

#include "fuzzing/Require.h"
#include "platform/linux/HiddenNames.h"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    const std::string_view content(reinterpret_cast<const char*>(data), size);
    const std::string lines = "\n" + std::string(content) + "\n";
    const auto names = platform::namesInHiddenFile(content);
    for (const auto& name : names) {
        require(!name.empty() && name.find('\n') == std::string::npos);
        require(lines.find("\n" + name + "\n") != std::string::npos);
    }
    require(names.contains(content.substr(0, content.find('\n'))) == (size > 0 && content.front() != '\n'));
    return 0;
}
