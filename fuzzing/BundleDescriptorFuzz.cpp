// Plug-in bundles with any bytes for their descriptor: each is either opened or refused with a reason, and
// there is no code to be loaded.
#include <cstdint>

#include "framework/Bundle.h"
#include "fuzzing/OneFile.h"
#include "fuzzing/Require.h"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    const PlatformWithOneFile platform({data, size});
    const vexo::BundleResult result = vexo::Bundle::open("/nowhere.vxplugin");
    require((result.bundle == nullptr) != result.error.empty());
    if (!result.bundle)
        return 0;
    require(!result.bundle->identifier().empty());
    std::string error;
    require(!result.bundle->principalClass(error) && !error.empty());
    return 0;
}
