// The bundle's module: the one symbol by which the host gets at the principal class.
#include <cstring>

#include "core/ReelixConstants.h"
#include "core/VXReelixPlugin.h"

namespace {

std::shared_ptr<vexo::VXMediaManager> newReelixPlugin(vexo::VXBundleRef bundle) {
    const auto plugin = std::make_shared<reelix::VXReelixPlugin>(std::move(bundle));
    return plugin->init() ? plugin : nullptr;
}

}  // namespace

extern "C" const vexo::VXPrincipalClass* VXPluginPrincipalClass(const char* className) {
    static const vexo::VXPrincipalClass principalClass{
        &reelix::VXReelixPlugin::isManagedMediaSource, &reelix::VXReelixPlugin::supportedPasteboardTypes,
        reelix::vxMBReelixPluginVersionNumber, reelix::vxMBReelixPluginVersionString, &newReelixPlugin};
    return std::strcmp(className, "VXReelixPlugin") == 0 ? &principalClass : nullptr;
}
