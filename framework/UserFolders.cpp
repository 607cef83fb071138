#include "framework/UserFolders.h"

#include <cstdlib>

#include "platform/Path.h"

namespace vexo {

std::optional<std::string> userCacheFolder() {
    // A relative XDG_CACHE_HOME is to be ignored.
    if (const char* cache = std::getenv("XDG_CACHE_HOME"); cache && *cache == '/')
        return cache;
    if (const char* home = std::getenv("HOME"); home && *home)
        return platform::path::appending(home, ".cache");
    return std::nullopt;
}

}  // namespace vexo
