// What a plug-in says of itself.
#pragma once

#include <string>

#include "framework/Host.h"
#include "platform/Value.h"

namespace vexo {

struct PluginIdentity {
    std::string title;
    std::string uniqueID;
    unsigned mediaTypesSupported = 0;
    bool isManagedMediaSource = false;
    platform::Array supportedPasteboardTypes;
    bool canLoadData = false;
    bool appInstalled = false;
};

// Asks the plug-in, on the main thread. Where it raises instead, that is a warning and the answer is empty.
PluginIdentity identityOf(const LoadedPlugin& plugin);

}  // namespace vexo
