// Where the picture of an application's icon is. Looks in the one icon theme that every application installs
// into, "hicolor", and in the folder for icons of no theme.
#pragma once

#include <optional>
#include <string>
#include <vector>

namespace platform {

// The path of an SVG or PNG file for `icon`, a name or an absolute path as desktop entries have it. Scalable
// pictures come first, then larger before smaller. nil when there is none.
std::optional<std::string> pathOfIcon(const std::string& icon, const std::vector<std::string>& dataFolders);

}  // namespace platform
