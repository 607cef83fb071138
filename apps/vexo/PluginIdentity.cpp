#include "apps/vexo/PluginIdentity.h"

#include "framework/GuardedWork.h"

namespace vexo {

PluginIdentity identityOf(const LoadedPlugin& plugin) {
    VXMediaManager& manager = *plugin.manager;
    const VXPrincipalClass& principalClass = *plugin.principalClass;
    return {.title = guardedAnswer([&] { return manager.rootMediaGroupTitle(); }),
            .uniqueID = guardedAnswer([&] { return manager.uniqueID(); }),
            .mediaTypesSupported = guardedAnswer([&] { return manager.mediaTypesSupported(); }),
            .isManagedMediaSource = guardedAnswer(principalClass.isManagedMediaSource),
            .supportedPasteboardTypes = guardedAnswer(principalClass.supportedPasteboardTypes),
            .canLoadData = guardedAnswer([&] { return manager.canLoadData(); }),
            .appInstalled = guardedAnswer([&] { return manager.appInstalled(); })};
}

}  // namespace vexo
