#include "framework/pathwatcher/PackageName.h"

#include <algorithm>

#include "framework/metadata/FileTypes.h"
#include "platform/Path.h"

namespace vexo {

bool isPackageName(std::string_view folderName) {
    return isPackageExtension(platform::path::extension(folderName));
}

std::string_view outermostPackageOrAll(std::string_view folder) {
    for (std::size_t begin = 0; begin < folder.size();) {
        const std::size_t end = std::min(folder.find('/', begin), folder.size());
        if (isPackageName(folder.substr(begin, end - begin)))
            return folder.substr(0, end);
        begin = end + 1;
    }
    return folder;
}

}  // namespace vexo
