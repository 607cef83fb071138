#include "framework/pathwatcher/PolledSubtree.h"

#include <fmt/format.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <cstring>
#include <utility>

#include "framework/pathwatcher/WatchLimits.h"
#include "platform/Path.h"

namespace vexo {

namespace {

namespace path = platform::path;

std::vector<std::string> pathsOf(const std::vector<const SilentMount*>& mounts) {
    std::vector<std::string> paths;
    for (const SilentMount* mount : mounts)
        paths.push_back(mount->path);
    return paths;
}

std::string limitReached(const std::optional<std::int64_t>& limit, std::string_view what) {
    return limit ? fmt::format("the limit of {} {} is reached", *limit, what)
                 : fmt::format("the limit of {} is reached", what);
}

}  // namespace

PolledSubtree::PolledSubtree(WatchMeans& means, const Place& place, PolledPlace::Depth depth, Reason reason)
    : means_(means) {
    const auto nested = depth == PolledPlace::Depth::tree ? means.mounts.silentMountsBelow(place.path)
                                                          : std::vector<const SilentMount*>();
    places_.push_back(
        means_.polling.add({place.path, means.mounts.mountPointOf(place.path), depth, pathsOf(nested),
                            place.reportedPath, place.package, reason == Reason::passing}));
    for (const SilentMount* mount : nested)
        if (mount->source == ChangeSource::polling)
            places_.push_back(means_.polling.add(
                {mount->path, mount->path, depth, pathsOf(means.mounts.silentMountsBelow(mount->path)),
                 path::appending(place.reportedPath, mount->path.substr(place.path.size())), place.package}));
}

PolledSubtree::~PolledSubtree() {
    for (const std::uint64_t place : places_)
        means_.polling.remove(place);
}

std::string explanationOf(const SilentMount& mount) {
    return mount.isNetwork ? fmt::format("network file system ({})", mount.fileSystem)
                           : fmt::format("file system that does not tell of changes ({})", mount.fileSystem);
}

std::string explanationOf(const std::string& folder, int error) {
    if (error == ENOSPC)
        return limitReached(readWatchLimits().maxUserWatches, "watched folders");
    if (error == EMFILE)
        return limitReached(readWatchLimits().maxUserInstances, "watchers");
    return fmt::format("{} cannot be watched: {}", folder, std::strerror(error));
}

std::string rhythmOf(const FolderPolling& polling) {
    return fmt::format("looked at every {} s", polling.interval().count() / 1000);
}

bool isNatural(int error) {
    constexpr std::array usual{ENOENT, ENOTDIR, EACCES, EPERM, ELOOP, ENAMETOOLONG};
    return std::find(usual.begin(), usual.end(), error) != usual.end();
}

}  // namespace vexo
