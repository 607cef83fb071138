#include "apps/vexo/Commands.h"
#include "apps/vexo/Json.h"
#include "apps/vexo/Progress.h"
#include "apps/vexo/Terminal.h"
#include "framework/GuardedWork.h"
#include "framework/pathwatcher/PathWatcher.h"
#include "framework/pathwatcher/WatchLimits.h"
#include "platform/FileManager.h"
#include "platform/Services.h"

namespace vexo {
namespace {

struct Location {
    std::string path;
    std::optional<std::string> resolvedPath;  // nil where no volume has the name
    bool exists;
    WatchState watching;

    bool isWatched() const { return watching.how != WatchState::How::none; }
};

Location locate(const std::string& path, const PathWatcher& watcher) {
    const platform::FileManager& files = platform::services().fileManager;
    return {path, files.resolvedPath(path), files.fileExistsAtPath(path), watcher.watchStateOf(path)};
}

// The folders of one kind of library, of all plug-ins, in the order in which they are looked at.
std::vector<Location> locationsOf(Host& host, std::string_view kind) {
    std::vector<Location> locations;
    for (const LoadedPlugin& plugin : host.plugins()) {
        for (const VXLibraryLocations& library :
             guardedAnswer([&] { return plugin.manager->libraryLocations(); })) {
            if (library.kind != kind)
                continue;
            for (const std::string& path : library.paths)
                locations.push_back(locate(path, host.pathWatcher()));
        }
    }
    return locations;
}

const char* nameOf(WatchState::How how) {
    switch (how) {
        case WatchState::How::events:
            return "events";
        case WatchState::How::polling:
            return "polling";
        case WatchState::How::none:
            break;
    }
    return "none";
}

Json jsonLocations(const std::vector<Location>& locations) {
    Json json = Json::array();
    for (const Location& location : locations)
        json.push_back({{"path", jsonText(location.path)},
                        {"resolvedPath", jsonText(location.resolvedPath)},
                        {"exists", location.exists},
                        {"watched", location.isWatched()},
                        {"how", nameOf(location.watching.how)},
                        {"why", jsonText(location.watching.why)}});
    return json;
}

Json jsonLimits(const WatchLimits& limits) {
    const auto number = [](const std::optional<std::int64_t>& limit) {
        return limit ? Json(*limit) : Json();
    };
    return {{"maxUserWatches", number(limits.maxUserWatches)},
            {"maxUserInstances", number(limits.maxUserInstances)},
            {"maxQueuedEvents", number(limits.maxQueuedEvents)}};
}

void printJson(Host& host, std::ostream& out) {
    out << Json{{"projects", jsonLocations(locationsOf(host, "projects"))},
                {"events", jsonLocations(locationsOf(host, "events"))},
                {"watchLimits", jsonLimits(readWatchLimits())},
                {"suitePreferences", jsonText(host.suitePreferencesPath())}}
               .dump(2)
        << "\n";
}

// "events: watched through /home/you/Movies"
std::string describe(const WatchState& watching) {
    return nameOf(watching.how) + (": " + printable(watching.why));
}

void printLocations(const char* title, const std::vector<Location>& locations, const OutputStyle& style,
                    std::ostream& out) {
    out << style.bold(title) << "\n";
    for (const Location& location : locations) {
        out << (location.exists ? "  found    " : style.dim("  missing  ")) << printable(location.path);
        if (location.resolvedPath && *location.resolvedPath != location.path)
            out << style.dim(" → " + printable(*location.resolvedPath));
        out << "\n           " << style.dim(describe(location.watching)) << "\n";
    }
}

void printText(Host& host, std::ostream& out) {
    const OutputStyle style = OutputStyle::ofStandardOutput();
    printLocations("Project libraries", locationsOf(host, "projects"), style, out);
    printLocations("Event libraries", locationsOf(host, "events"), style, out);
    out << style.bold("Suite preferences") << "\n  " << printable(host.suitePreferencesPath()) << "\n";
}

}  // namespace

Problems runLocations(Host& host, OutputFormat format, std::ostream& out) {
    loadWithProgress(host);
    if (format == OutputFormat::json)
        printJson(host, out);
    else
        printText(host, out);
    return {};
}

}  // namespace vexo
