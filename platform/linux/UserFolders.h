// Where the desktop keeps a user's files.
#pragma once

#include <optional>
#include <string>

namespace platform {

// XDG_CACHE_HOME, else ".cache" in the user's home; nil when there is neither. A relative path counts as
// none: what lies in the current folder is not the user's for that. Need not exist. Callable from any thread.
std::optional<std::string> userCacheFolder();
// The same of XDG_DATA_HOME and ".local/share".
std::optional<std::string> userDataFolder();

}  // namespace platform
