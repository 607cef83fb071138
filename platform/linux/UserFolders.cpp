#include "platform/linux/UserFolders.h"

#include <cstdlib>

#include "platform/Path.h"
#include "platform/linux/LinuxFileManager.h"

namespace platform {
namespace {

std::optional<std::string> userFolder(const char* variable, std::string_view nameInHome) {
    if (const char* folder = std::getenv(variable); folder && *folder == '/')
        return folder;
    const auto home = LinuxFileManager::userHomeDirectory();
    return home ? std::optional(path::appending(*home, nameInHome)) : std::nullopt;
}

}  // namespace

std::optional<std::string> userCacheFolder() {
    return userFolder("XDG_CACHE_HOME", ".cache");
}

std::optional<std::string> userDataFolder() {
    return userFolder("XDG_DATA_HOME", ".local/share");
}

}  // namespace platform
