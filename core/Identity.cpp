#include "core/ReelixConstants.h"
#include "core/VXReelixPlugin.h"
#include "platform/Services.h"
#include "platform/SystemLog.h"

namespace reelix {

[[gnu::used]] const char vxMBReelixPluginVersionString[] = "@(#)PROGRAM:Reelix  PROJECT:Vexo-507.3\n";

bool VXReelixPlugin::isManagedMediaSource() {
    return false;
}

std::string VXReelixPlugin::rootMediaGroupTitle() {
    return std::string(ReelixApplicationName);
}

unsigned VXReelixPlugin::mediaTypesSupported() {
    return vexo::VXMediaTypeMaskMovie;
}

std::string VXReelixPlugin::uniqueID() {
    return "Reelix Media Manager";
}

// The mix of double and single colons is part of the message: log filters know it so.
std::string VXReelixPlugin::displayName() {
    platform::services().systemLog.log(
        "Call to deprecated method VXReelixPlugin::displayName. "
        "Please update your code to use VXReelixPlugin:rootMediaGroupTitle:");
    return rootMediaGroupTitle();
}

platform::ImageRef VXReelixPlugin::displayImage() {
    platform::services().systemLog.log(
        "Call to deprecated method VXReelixPlugin::displayImage. "
        "Please update your code to use VXReelixPlugin:rootMediaGroupIcon:");
    return rootMediaGroupIcon();
}

}  // namespace reelix
