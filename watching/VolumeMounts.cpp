// Takes the event libraries of volumes in as they are mounted.
#include <array>

#include "core/ReelixConstants.h"
#include "core/VXReelixPlugin.h"
#include "core/VolumeFolders.h"
#include "host/VXLog.h"
#include "platform/Dispatcher.h"
#include "platform/FileManager.h"
#include "platform/Path.h"
#include "platform/Services.h"

namespace reelix {

void VXReelixPlugin::_fileSystemMounted(const platform::Notification& notification) {
    platform::services().dispatcher.detachThread("vexo-mount", 0.5, [plugin = self(), notification] {
        plugin->_fileSystemMountedThreaded(notification);
    });
}

void VXReelixPlugin::_fileSystemMountedThreaded(const platform::Notification& notification) {
    try {
        const platform::Value* device = platform::find(notification.userInfo, "NSDevicePath");
        const std::string* mountPath = device ? device->string() : nullptr;
        if (!mountPath || mountPath->starts_with("/Network") || mountPath->starts_with("/private/Network"))
            return;
        const auto name = platform::services().fileManager.displayNameAtPath(*mountPath);
        if (!name)
            return;
        const std::string folder = folderOnVolume(*name, ReelixEventsFolderName);
        {
            platform::Locked monitor(_monitor);
            if (!_ReelixEventsSearchPaths || _ReelixEventsSearchPaths->contains(folder))
                return;
            _ReelixEventsSearchPaths->append(folder);
            _ReelixEventsSearchPaths->append(
                platform::path::appendingExtension(folder, ReelixLocalizedExtension));
        }
        watchedPathChanged(*mountPath, 0);
    } catch (const std::exception& error) {
        vexo::VXLog(std::string("Error in _fileSystemMountedThreaded: ") + error.what(),
                    vexo::VXLogLevelCaughtError, this);
    }
}

bool VXReelixPlugin::validDiskFormat(const std::string& path) {
    static constexpr std::array<std::string_view, 6> refused{"msdos", "ntfs",   "nfs",
                                                             "afpfs", "webdav", "udf"};
    const auto format = platform::services().fileManager.fileSystemTypeNameAtPath(path);
    return format && std::find(refused.begin(), refused.end(), *format) == refused.end();
}

}  // namespace reelix
