#include "platform/linux/ServedWays.h"

#include <climits>
#include <optional>

#include "platform/Path.h"
#include "platform/linux/FileStatus.h"

namespace platform {

namespace {

constexpr int mostLinks = 40;  // as many as the kernel follows
constexpr std::size_t mostFoldersKept = 1024;

}  // namespace

// A path that the kernel refuses leads nowhere.
std::vector<std::string> ServedWays::mountPointsOnTheWayTo(const std::string& path) {
    if (served_->empty() || !path.starts_with('/') || path.size() >= PATH_MAX)
        return {};
    const bool isRoot = path.find_first_not_of('/') == path.npos;
    return (isRoot ? begin() : wayTo(path)).mountPoints;
}

// From the nearest folder that was followed before.
ServedWays::Way ServedWays::wayTo(const std::string& path) {
    std::vector<std::string> names;
    std::string folder = path;
    do {
        names.push_back(path::lastComponent(folder));
        folder = path::withoutLastComponent(folder);
    } while (folder != "/" && !ways_.contains(folder));
    Way way = folder == "/" ? begin() : ways_.at(folder);
    for (;;) {
        goOn(way, names.back());
        if (names.size() == 1)
            return way;
        folder = path::appending(folder, names.back());
        keep(folder, way);
        names.pop_back();
    }
}

ServedWays::Way ServedWays::begin() const {
    Way way;
    enter(way, "/");
    return way;
}

// Behind a link that leads in a circle the kernel goes no further either.
void ServedWays::goOn(Way& way, const std::string& name) const {
    std::vector<std::string> names{name};  // the next is the last
    for (int linksFollowed = 0; !names.empty() && linksFollowed <= mostLinks;) {
        const std::string next = std::move(names.back());
        names.pop_back();
        if (next == "..")
            way.path = path::withoutLastComponent(way.path);
        if (next == "." || next == "..")
            continue;
        std::string child = path::appending(way.path, next);
        const bool mayBeRead = way.mountPoints.empty() && !served_->contains(child);
        const auto target = mayBeRead ? targetOfLink(child) : std::nullopt;
        if (!target) {
            enter(way, std::move(child));
            continue;
        }
        ++linksFollowed;
        std::vector<std::string> inside = path::components(*target);
        if (!inside.empty() && inside.front() == "/") {
            way.path = "/";
            inside.erase(inside.begin());
        }
        names.insert(names.end(), inside.rbegin(), inside.rend());
    }
}

void ServedWays::enter(Way& way, std::string child) const {
    way.path = std::move(child);
    if (served_->contains(way.path))
        way.mountPoints.push_back(way.path);
}

// A scan goes through one folder after another, so starting over costs it little.
void ServedWays::keep(const std::string& folder, const Way& way) {
    if (ways_.size() == mostFoldersKept)
        ways_.clear();
    ways_.emplace(folder, way);
}

}  // namespace platform
