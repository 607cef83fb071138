// The movies rendered from a project, and which of them is the best.
#include <algorithm>
#include <array>

#include "core/VXReelixPlugin.h"
#include "platform/FileManager.h"
#include "platform/Path.h"
#include "platform/Services.h"

namespace reelix {
namespace {

namespace path = platform::path;

bool isMovieName(const std::string& name) {
    static constexpr std::array<std::string_view, 3> extensions{"mov", "m4v", "3gp"};
    return std::find(extensions.begin(), extensions.end(), path::extension(name)) != extensions.end();
}

// The names in a project's folder of movies, in listing order; none when there is no such folder.
std::vector<std::string> namesInMoviesFolder(const std::string& moviesFolder) {
    const platform::FileManager& files = platform::services().fileManager;
    if (!files.fileExistsAtPath(moviesFolder))
        return {};
    return files.contentsOfDirectoryAtPath(moviesFolder).value_or(std::vector<std::string>{});
}

std::string moviesFolderOf(const std::string& projectPath) {
    return path::appending(projectPath, "Movies");
}

// A folder has no file size, whatever its name.
std::optional<std::uint64_t> fileSizeOf(const vexo::VXMediaObject& mediaObject) {
    const platform::FileManager& files = platform::services().fileManager;
    const auto url = mediaObject.URL();
    if (!url || files.kindOfItemAtPath(url->path()) != platform::FileKind::file)
        return std::nullopt;
    const auto attributes = files.attributesOfItemAtPath(url->path());
    return attributes ? std::optional(attributes->size) : std::nullopt;
}

}  // namespace

std::vector<std::string> VXReelixPlugin::_renderedMoviesPathsForProjectPath(const std::string& projectPath) {
    const std::string folder = moviesFolderOf(projectPath);
    std::vector<std::string> movies;
    for (const std::string& name : namesInMoviesFolder(folder)) {
        if (isMovieName(name))
            movies.push_back(path::appending(folder, name));
    }
    return movies;
}

std::optional<std::string> VXReelixPlugin::_previewFileForProjectPath(const std::string& projectPath) {
    const std::string folder = moviesFolderOf(projectPath);
    for (const std::string& name : namesInMoviesFolder(folder)) {
        if (isMovieName(name))
            return path::appending(folder, name);
    }
    return std::nullopt;
}

// The duration is the one that the movie file itself states.
void VXReelixPlugin::_durationOfReelixProjectAtPath(const Object& mediaObject) {
    const auto url = mediaObject->URL();
    if (!url)
        return;
    const auto properties = vexo::VXMediaObject::spotlightProperties(url->path());
    const auto duration = properties->valueForKey(vexo::kMDItemDurationSeconds);
    const std::optional<double> seconds = duration ? duration->doubleValue() : std::nullopt;
    if (seconds)
        mediaObject->setAttribute(*seconds, vexo::VXMediaObjectDurationKey);
}

// Widths alone are compared, and on equal widths the earlier movie stays. One movie without a size makes the
// widths of the others no measure.
VXReelixPlugin::Object VXReelixPlugin::_highestQualityClipByDimensions(
    const vexo::VXMediaObjectList& mediaObjects) {
    Object best;
    double bestWidth = 0;
    for (const Object& mediaObject : mediaObjects) {
        if (isCancelLoadRequestPending())
            break;
        const auto resolution = mediaObject->attributeForKey(vexo::VXMediaObjectResolutionKey);
        if (!resolution || !resolution->size())
            return nullptr;
        if (best && resolution->size()->width <= bestWidth)
            continue;
        best = mediaObject;
        bestWidth = resolution->size()->width;
    }
    return best;
}

VXReelixPlugin::Object VXReelixPlugin::_highestQualityClipByFileSize(
    const vexo::VXMediaObjectList& mediaObjects) {
    Object best;
    std::uint64_t bestSize = 0;
    for (const Object& mediaObject : mediaObjects) {
        if (isCancelLoadRequestPending())
            break;
        const std::optional<std::uint64_t> size = fileSizeOf(*mediaObject);
        if (!size || (best && *size <= bestSize))
            continue;
        best = mediaObject;
        bestSize = *size;
    }
    return best;
}

VXReelixPlugin::Object VXReelixPlugin::_highestQualityClip(const vexo::VXMediaObjectList& mediaObjects) {
    if (const Object widest = _highestQualityClipByDimensions(mediaObjects))
        return widest;
    return _highestQualityClipByFileSize(mediaObjects);
}

}  // namespace reelix
