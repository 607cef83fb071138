#include "framework/ImageManager.h"

#include "framework/FrameworkResources.h"
#include "platform/FileManager.h"
#include "platform/Services.h"
#include "platform/Workspace.h"

namespace vexo {

namespace {

bool isVolume(const std::string& path) {
    const auto mountPoint = platform::services().fileManager.resolvedPath(path);
    const auto volumes = platform::services().workspace.mountedLocalVolumePaths();
    return mountPoint && std::find(volumes.begin(), volumes.end(), *mountPoint) != volumes.end();
}

}  // namespace

ImageManager::ImageManager(std::function<bool(const std::string& path)> isMovie)
    : isMovie_(std::move(isMovie)),
      folder_(frameworkIcon("folder")),
      movie_(frameworkIcon("movie")),
      package_(frameworkIcon("package")),
      document_(frameworkIcon("document")),
      volume_(frameworkIcon("volume")) {}

platform::ImageRef ImageManager::iconForFile(const std::string& path) {
    const auto& fileManager = platform::services().fileManager;
    const auto flags = fileManager.itemFlagsAtPath(path);
    if (!flags)
        return nullptr;
    if (*flags & platform::itemIsPackage)
        return package_;
    if (fileManager.kindOfItemAtPath(path) == platform::FileKind::directory)
        return isVolume(path) ? volume_ : folder_;
    return isMovie_(path) ? movie_ : document_;
}

}  // namespace vexo
