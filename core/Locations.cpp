#include "core/ProcessCaches.h"
#include "core/ReelixConstants.h"
#include "core/VXReelixPlugin.h"
#include "platform/FileManager.h"
#include "platform/Path.h"
#include "platform/Services.h"

namespace reelix {
namespace {

namespace path = platform::path;

// The path that a slot keeps; found at the first call that finds a home.
template <typename Form>
std::optional<std::string> cachedPath(PathSlot& slot, Form form) {
    if (auto known = slot.get())
        return known;
    const std::optional<std::string> home = platform::services().fileManager.homeDirectory();
    if (!home)
        return std::nullopt;
    std::string found = vexo::VXMediaObject::aliasResolvedPath(form(*home));
    slot.set(found);
    return found;
}

std::string moviesFolder(const std::string& home) {
    return home + "/Movies";
}

auto inMoviesFolder(std::string_view name) {
    return [name](const std::string& home) { return moviesFolder(home) + "/" + std::string(name); };
}

auto inMoviesFolderLocalized(std::string_view name) {
    return [name](const std::string& home) {
        return path::appendingExtension(inMoviesFolder(name)(home), ReelixLocalizedExtension);
    };
}

}  // namespace

std::optional<std::string> VXReelixPlugin::_ReelixDefaultPath() {
    return cachedPath(defaultPathCache().defaultPath, inMoviesFolder(ReelixProjectsFolderName));
}

std::optional<std::string> VXReelixPlugin::_ReelixDefaultPath2() {
    return cachedPath(defaultPathCache().defaultPath2, inMoviesFolderLocalized(ReelixProjectsFolderName));
}

std::optional<std::string> VXReelixPlugin::_oldReelixDefaultPath() {
    return cachedPath(defaultPathCache().oldDefaultPath, moviesFolder);
}

std::optional<std::string> VXReelixPlugin::_ReelixDefaultEventsFolderPath() {
    return cachedPath(defaultPathCache().defaultEventsFolderPath, inMoviesFolder(ReelixEventsFolderName));
}

std::optional<std::string> VXReelixPlugin::_ReelixDefaultEventsFolderPath2() {
    return cachedPath(defaultPathCache().defaultEventsFolderPath2,
                      inMoviesFolderLocalized(ReelixEventsFolderName));
}

}  // namespace reelix
