// The one fact that the plug-in takes from a project's document: whether the project is a trailer.
#include "core/VXReelixPlugin.h"
#include "platform/FileManager.h"
#include "platform/Services.h"
#include "projects/QNPlaceholder.h"

namespace reelix {

platform::ArchivedObjectRef QNPlaceholder::initWithCoder(platform::KeyedUnarchiver&) {
    return std::make_shared<QNPlaceholder>();
}

bool VXReelixPlugin::_isTrailer(const std::string& projectPath) {
    auto bytes = platform::services().fileManager.openFileAtPath(projectPath + "/Project");
    if (!bytes)
        return false;
    platform::KeyedUnarchiver unarchiver(std::move(bytes), this);
    const auto root = unarchiver.decodeObjectForKey("root");
    const auto editInfo = root ? root->objectForKey("editInfo") : nullptr;
    const bool isTrailer = editInfo && editInfo->objectForKey("trailer");
    unarchiver.finishDecoding();
    return isTrailer;
}

platform::ArchivedClass VXReelixPlugin::cannotDecodeObjectOfClassName(platform::KeyedUnarchiver&,
                                                                      std::string_view,
                                                                      const std::vector<std::string>&) {
    return &QNPlaceholder::initWithCoder;
}

}  // namespace reelix
