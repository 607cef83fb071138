// Packages count as one item, so what happens inside one is reported as a change of the package.
#pragma once

#include <string_view>

namespace vexo {

// Whether a folder of this name, found below a watched folder, is a package.
bool isPackageName(std::string_view folderName);

// The part of `folder`, a path relative to a watched folder, that ends with the outermost package on it; all
// of it when it is in none.
std::string_view outermostPackageOrAll(std::string_view folder);

}  // namespace vexo
