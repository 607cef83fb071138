#include "core/VXReelixPlugin.h"

namespace reelix {

platform::Array VXReelixPlugin::supportedPasteboardTypes() {
    const platform::Array types{platform::Value("VXReelixProjectsPboardType")};
    return platform::Array{platform::Value(types)};
}

}  // namespace reelix
