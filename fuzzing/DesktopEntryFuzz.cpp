// Desktop entries, and the command lines in them.
#include <cstdint>
#include <cstdlib>

#include "platform/linux/DesktopEntries.h"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    const auto entry = platform::desktopEntryWithData({reinterpret_cast<const char*>(data), size});
    const auto path = entry ? entry->programPath() : std::nullopt;
    if (path && !path->starts_with("/"))
        std::abort();
    return 0;
}
