#include "platform/linux/IconLookup.h"

#include <sys/stat.h>

#include <array>

#include "platform/Path.h"

namespace platform {

namespace {

constexpr std::array<const char*, 11> sizes = {"scalable", "1024x1024", "512x512", "256x256",
                                               "192x192",  "128x128",   "96x96",   "64x64",
                                               "48x48",    "32x32",     "16x16"};

bool isPlainFile(const std::string& path) {
    struct stat status {};
    return stat(path.c_str(), &status) == 0 && S_ISREG(status.st_mode);
}

std::optional<std::string> pictureInFolder(const std::string& folder, const std::string& name) {
    for (const char* const extension : {".svg", ".png"})
        if (auto path = path::appending(folder, name + extension); isPlainFile(path))
            return path;
    return std::nullopt;
}

// Entries should name icons without an extension, and some don't.
std::string withoutPictureExtension(const std::string& name) {
    return name.ends_with(".svg") || name.ends_with(".png") ? name.substr(0, name.size() - 4) : name;
}

std::optional<std::string> pictureInTheme(const std::string& dataFolder, const std::string& name) {
    for (const char* const size : sizes)
        if (auto path = pictureInFolder(dataFolder + "/icons/hicolor/" + size + "/apps", name))
            return path;
    return std::nullopt;
}

}  // namespace

std::optional<std::string> pathOfIcon(const std::string& icon, const std::vector<std::string>& dataFolders) {
    if (icon.starts_with("/"))
        return isPlainFile(icon) ? std::optional(icon) : std::nullopt;
    if (icon.empty() || icon.find('/') != std::string::npos)
        return std::nullopt;
    const std::string name = withoutPictureExtension(icon);
    for (const auto& folder : dataFolders)
        if (auto path = pictureInTheme(folder, name))
            return path;
    for (const auto& folder : dataFolders)
        if (auto path = pictureInFolder(folder + "/pixmaps", name))
            return path;
    return std::nullopt;
}

}  // namespace platform
