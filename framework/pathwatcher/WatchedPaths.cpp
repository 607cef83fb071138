#include "framework/pathwatcher/WatchedPaths.h"

#include <fmt/format.h>

#include <utility>

namespace vexo {

namespace {

constexpr int mostEventsAtOnce = 20'000;

}  // namespace

WatchedPaths::WatchedPaths(WatchSeams seams)
    : seams_(std::move(seams)),
      watches_(*seams_.events),
      means_{watches_,
             *seams_.folders,
             *seams_.polling,
             burst_,
             seams_.resolvedPath,
             [this](const std::string& warning) { warn(warning); },
             [this](const std::string& folder, int error) { warnOfFailure(folder, error); },
             seams_.mounts->table()} {}

// All watches end at once, instead of one after the other as the paths go.
WatchedPaths::~WatchedPaths() {
    watches_.reopen();
}

void WatchedPaths::add(const std::string& path) {
    if (contains(path))
        return;
    takeMountChanges();
    auto& added = paths_[path];
    added = std::make_unique<WatchedPath>(means_, path);
    added->begin();
}

void WatchedPaths::remove(const std::string& path) {
    paths_.erase(path);
}

void WatchedPaths::takeEvents() {
    for (int i = 0; i < mostEventsAtOnce; ++i) {
        const auto event = seams_.events->next();
        if (!event)
            break;
        if (event->kinds & IN_Q_OVERFLOW)
            beginAnew();
        else
            watches_.dispatch(*event);
    }
    checkDoubts();
}

void WatchedPaths::takePollReports() {
    for (const PollReport& report : seams_.polling->takeReports())
        take(report);
    checkDoubts();
}

void WatchedPaths::take(const PollReport& report) {
    for (const auto& [name, path] : paths_)
        if (path->take(report))
            return;
}

void WatchedPaths::takeMountChanges() {
    if (seams_.mounts->happened())
        mountsChanged();
}

void WatchedPaths::mountsChanged() {
    const MountKinds before = std::exchange(means_.mounts, seams_.mounts->table());
    const std::vector<std::string> mountPoints = before.differences(means_.mounts);
    for (const auto& [name, path] : paths_) {
        path->check();
        path->mountsChangedAt(mountPoints);
    }
}

void WatchedPaths::checkDoubts() {
    for (const auto& [name, path] : paths_)
        if (path->isInDoubt())
            path->check();
}

void WatchedPaths::beginAnew() {
    warn("changes came faster than they could be taken in; all watched folders are looked at anew");
    watches_.reopen();
    for (const auto& [name, path] : paths_)
        path->end();
    for (const auto& [name, path] : paths_) {
        path->begin();
        path->report();
    }
}

std::vector<std::string> WatchedPaths::takeWarnings() {
    return std::exchange(newWarnings_, {});
}

void WatchedPaths::warn(const std::string& warning) {
    if (knownWarnings_.insert(warning).second)
        newWarnings_.push_back(warning);
}

// Thousands of folders may fail for one reason.
void WatchedPaths::warnOfFailure(const std::string& folder, int error) {
    if (knownFailures_.insert(error).second)
        warn(fmt::format("{}; what is not watched is {}", explanationOf(folder, error),
                         rhythmOf(*seams_.polling)));
}

WatchState WatchedPaths::stateOf(const std::string& watchedPath, const std::string& path) const {
    return paths_.at(watchedPath)->stateOf(path);
}

std::vector<std::string> WatchedPaths::watchedFolders() const {
    std::vector<std::string> folders;
    for (const auto& [name, path] : paths_) {
        const auto more = path->watchedFolders();
        folders.insert(folders.end(), more.begin(), more.end());
    }
    return folders;
}

}  // namespace vexo
