// Paths as people give them on the command line.
#pragma once

#include <string>

namespace vexo {

// The path from "/" on; relative ones begin at the working folder. Links stay as they are.
std::string absolutePath(const std::string& path);

}  // namespace vexo
