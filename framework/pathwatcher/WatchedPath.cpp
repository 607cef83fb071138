#include "framework/pathwatcher/WatchedPath.h"

#include <fmt/format.h>

#include <algorithm>
#include <utility>

#include "platform/linux/MountRules.h"

namespace vexo {

namespace {

using End = PathTrail::End;
using How = WatchState::How;

bool contains(const std::vector<std::uint64_t>& list, std::uint64_t number) {
    return std::find(list.begin(), list.end(), number) != list.end();
}

}  // namespace

WatchedPath::WatchedPath(WatchMeans& means, std::string path) : means_(means), path_(std::move(path)) {}

void WatchedPath::begin() {
    isInDoubt_ = wasTouched_ = false;
    follow(newTrails());
}

void WatchedPath::end() {
    tree_.reset();
    polled_.reset();
    trails_.clear();
}

void WatchedPath::check() {
    isInDoubt_ = false;
    Trails next = newTrails();
    const bool isSame = leadsWhereItDid(next);
    wasTouched_ = false;
    if (isSame) {
        trails_ = std::move(next);
        return;
    }
    const bool existed = exists();
    follow(std::move(next));
    if (existed || exists())
        report();
}

void WatchedPath::report() {
    means_.burst.add(path_, path_);
}

// The volume of a name is looked for only where no entry of that name is, which comes first.
WatchedPath::Trails WatchedPath::newTrails() {
    Trails trails;
    trails.push_back(std::make_unique<PathTrail>(means_, *this, path_));
    if (trails.back()->end() != End::missing)
        return trails;
    const auto resolved = means_.resolvedPath(path_);
    if (resolved && *resolved != path_)
        trails.push_back(std::make_unique<PathTrail>(means_, *this, *resolved));
    return trails;
}

// What was away for a moment is not where it was: what happened in it meanwhile was looked for here, in vain.
bool WatchedPath::leadsWhereItDid(const Trails& next) {
    const PathTrail &before = trail(), &now = *next.back();
    if (before.end() != now.end() || before.path() != now.path() || before.explanation() != now.explanation())
        return false;
    if (now.end() == End::folder)
        return !wasTouched_ && tree_ && tree_->isInPlace();
    return now.end() != End::file || (!wasTouched_ && before.entry() == now.entry());
}

void WatchedPath::follow(Trails trails) {
    tree_.reset();
    polled_.reset();
    trouble_.clear();
    trails_ = std::move(trails);
    if (trail().end() == End::folder)
        watchFolder();
    pollAsNeeded();
}

void WatchedPath::watchFolder() {
    tree_ = std::make_unique<FolderTree>(means_, *this, trail().path(), path_);
    const int error = tree_->watch();
    if (error == 0)
        return;
    tree_.reset();
    trouble_ = explanationOf(trail().path(), error);
    trail().watchContentOfLast();  // rights may be given
}

void WatchedPath::pollAsNeeded() {
    using Reason = PolledSubtree::Reason;
    const End end = trail().end();
    const PolledSubtree::Place place{trail().path(), path_, std::nullopt};
    if (end == End::failure || (end == End::silentMount && trail().isWorthPolling()))
        polled_ = std::make_unique<PolledSubtree>(means_, place, PolledPlace::Depth::tree,
                                                  end == End::failure ? Reason::passing : Reason::lasting);
    else if (trail().hasBlindSpot() && end != End::silentMount)
        polled_ = std::make_unique<PolledSubtree>(means_, place, PolledPlace::Depth::itself, Reason::lasting);
}

// What lies behind a silent mount is not looked at, so it may well exist.
bool WatchedPath::exists() const {
    return !trails_.empty() && trail().end() != End::missing;
}

void WatchedPath::trailChanged() {
    isInDoubt_ = wasTouched_ = true;
}

void WatchedPath::contentChanged() {
    if (trail().end() == End::file)
        report();
    else
        isInDoubt_ = true;
}

void WatchedPath::treeWasLost(bool unmounted) {
    isInDoubt_ = wasTouched_ = true;
    if (unmounted)
        means_.warn(path_ + " was unmounted");
}

void WatchedPath::mountsChangedAt(const std::vector<std::string>& mountPoints) {
    for (const std::string& mountPoint : mountPoints) {
        if (mountPoint == trail().path() || !platform::isInside(mountPoint, trail().path()))
            continue;
        if (tree_)
            tree_->mountsChangedAt(mountPoint);
        else if (polled_)
            begin();
    }
}

bool WatchedPath::take(const PollReport& pollReport) {
    if (tree_ && tree_->take(pollReport))
        return true;
    if (!polled_ || !contains(polled_->places(), pollReport.place))
        return false;
    if (trail().end() != End::silentMount)
        isInDoubt_ = true;
    if (trail().end() == End::silentMount || trail().end() == End::failure)
        for (const std::string& changed : pollReport.changedPaths)
            means_.burst.add(path_, changed);
    return true;
}

WatchState WatchedPath::stateOf(const std::string& path) const {
    if (!tree_)
        return stateWithoutTree(path);
    const std::string rhythm = rhythmOf(means_.polling), watched = "watched through " + path_;
    if (const auto why = tree_->whyPolled(tree_->path() + path.substr(path_.size())))
        return {How::polling, fmt::format("{}; {}", *why, rhythm)};
    if (const auto why = path == path_ ? tree_->whyPartlyPolled() : std::nullopt)
        return {How::events, fmt::format("{}; some folders below are {}: {}", watched, rhythm, *why)};
    return {How::events, watched};
}

WatchState WatchedPath::stateWithoutTree(const std::string& path) const {
    const std::string missing = path == path_ ? "does not exist" : path_ + " does not exist";
    switch (trail().end()) {
        case End::folder:
            return {How::none, trouble_};
        case End::file:
            return {How::events, "watched through " + trail().lastWatchedFolder()};
        case End::missing:
            if (polled_)
                return {How::polling, fmt::format("{}; {}", missing, rhythmOf(means_.polling))};
            return {How::events,
                    fmt::format("{}; {} is watched for it", missing, trail().lastWatchedFolder())};
        case End::silentMount:
            if (!polled_)
                return {How::none, trail().explanation() + "; not watched"};
            break;
        case End::failure:
            break;
    }
    return {How::polling, fmt::format("{}; {}", trail().explanation(), rhythmOf(means_.polling))};
}

std::vector<std::string> WatchedPath::watchedFolders() const {
    return tree_ ? tree_->watchedFolders() : std::vector<std::string>();
}

}  // namespace vexo
