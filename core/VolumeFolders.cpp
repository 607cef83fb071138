#include "core/VolumeFolders.h"

#include "core/ReelixConstants.h"
#include "platform/FileManager.h"
#include "platform/Path.h"
#include "platform/Services.h"
#include "platform/Workspace.h"

namespace reelix {
namespace {

namespace path = platform::path;

void appendBothForms(std::vector<std::string>& folders, const std::string& folder) {
    folders.push_back(folder);
    folders.push_back(path::appendingExtension(folder, ReelixLocalizedExtension));
}

}  // namespace

std::vector<std::string> foldersOnVolumes(std::string_view folderName) {
    const platform::Services& services = platform::services();
    std::vector<std::string> folders;
    for (const std::string& volume : services.workspace.mountedLocalVolumePaths()) {
        if (volume == "/Network" || volume == "/")
            continue;
        const auto displayName = services.fileManager.displayNameAtPath(volume);
        // A volume that has gone since it was listed is still known by its mount point.
        appendBothForms(folders,
                        folderOnVolume(displayName.value_or(path::lastComponent(volume)), folderName));
    }
    appendBothForms(folders, "/" + std::string(folderName));
    for (const std::string& volume : services.workspace.mountedRemovableMedia())
        appendBothForms(folders, path::appending(volume, folderName));
    return folders;
}

std::string folderOnVolume(const std::string& displayName, std::string_view folderName) {
    return "/Volumes/" + displayName + "/" + std::string(folderName);
}

}  // namespace reelix
