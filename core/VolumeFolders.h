// The folders of one name at the top of every volume.
#pragma once

#include <string>
#include <string_view>
#include <vector>

namespace reelix {

// Each place in its plain and its ".localized" form: under /Volumes by the display names of the mounted local
// volumes, at the top of the start-up volume, and on removable media. What exists is not looked at, and a
// volume that is local and removable is listed for both.
std::vector<std::string> foldersOnVolumes(std::string_view folderName);

// "/Volumes/<display name>/<folder name>"
std::string folderOnVolume(const std::string& displayName, std::string_view folderName);

}  // namespace reelix
