// The file of a plug-in's code, looked at before the system's loader is let at it: the loader waits for
// whoever writes into a pipe, and kills the process over a file that ends early.
#pragma once

#include <optional>
#include <string>

namespace vexo {

// Why the file is no module for this process; nil when nothing speaks against loading it. Only its outline is
// read: whether the code is sound cannot be told.
std::optional<std::string> problemOfModuleFile(const std::string& path);

}  // namespace vexo
