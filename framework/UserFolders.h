// Where the desktop keeps a user's files.
#pragma once

#include <optional>
#include <string>

namespace vexo {

// XDG_CACHE_HOME, else ".cache" in HOME; nil when there is neither. Need not exist. Callable from any thread.
std::optional<std::string> userCacheFolder();

}  // namespace vexo
