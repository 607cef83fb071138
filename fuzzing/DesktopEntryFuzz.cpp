// Desktop entries, and the command lines in them.
#include <cstdint>

#include "fuzzing/Require.h"
#include "platform/linux/DesktopEntries.h"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    const auto entry = platform::desktopEntryWithData({reinterpret_cast<const char*>(data), size});
    if (const auto path = entry ? entry->programPath() : std::nullopt)
        require(path->starts_with("/"));
    return 0;
}
