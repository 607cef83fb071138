#include "framework/pathwatcher/PathTrail.h"

#include <utility>

#include "framework/pathwatcher/PolledSubtree.h"
#include "platform/Path.h"

namespace vexo {

namespace {

namespace path = platform::path;

constexpr int mostLinks = 40;  // as many as the kernel follows

constexpr std::uint32_t contentKinds = IN_MODIFY | IN_CLOSE_WRITE | IN_ATTRIB;
constexpr std::uint32_t entryKinds = IN_CREATE | IN_DELETE | IN_MOVED_FROM | IN_MOVED_TO;
constexpr std::uint32_t guardKinds = entryKinds | IN_DELETE_SELF | IN_MOVE_SELF;

}  // namespace

// Watches one folder of the way for the entry of one name.
class PathTrail::Guard final : public EventListener {
  public:
    Guard(Watches& watches, Owner& owner, std::string itsFolder, std::string itsName)
        : folder(std::move(itsFolder)), name(std::move(itsName)), watches_(watches), owner_(owner) {}
    ~Guard() { watches_.remove(watch_, *this); }
    Guard(const Guard&) = delete;
    Guard& operator=(const Guard&) = delete;

    // Answers errno.
    int watch() {
        const WatchResult result = watches_.add(folder, guardKinds, *this);
        watch_ = result.watch;
        return result.error;
    }
    void watchContent() {
        watchesContent_ = true;
        watches_.add(folder, guardKinds | contentKinds, *this);
    }
    bool isWatching() const { return watch_ >= 0; }

    void heard(const FileEvent& event) override {
        if (event.kinds & (IN_IGNORED | IN_UNMOUNT | IN_DELETE_SELF | IN_MOVE_SELF))
            owner_.trailChanged();
        else if (event.name == name && event.kinds & entryKinds)
            owner_.trailChanged();
        else if (event.name == name && event.kinds & contentKinds && watchesContent_)
            owner_.contentChanged();
    }

    const std::string folder;
    const std::string name;

  private:
    Watches& watches_;
    Owner& owner_;
    bool watchesContent_ = false;
    int watch_ = -1;
};

PathTrail::PathTrail(WatchMeans& means, Owner& owner, const std::string& path)
    : means_(means), owner_(owner) {
    const std::vector<std::string> names = path::components(path);
    follow(Names(names.begin() + 1, names.end()));
}

PathTrail::~PathTrail() = default;

std::string PathTrail::lastWatchedFolder() const {
    for (auto guard = guards_.rbegin(); guard != guards_.rend(); ++guard)
        if ((*guard)->isWatching())
            return (*guard)->folder;
    return "";
}

void PathTrail::follow(Names names) {
    std::string folder = "/";
    if (means_.mounts.silentMountAt(folder)) {
        stopAtSilentMount(folder, names);
        return;
    }
    while (!names.empty())
        if (!step(folder, names))
            return;
    stopAt(End::folder, folder, {});
}

// Goes one name further. False where the way ends.
bool PathTrail::step(std::string& folder, Names& names) {
    const std::string name = std::move(names.front());
    names.pop_front();
    if (name == ".")
        return true;
    if (name == "..") {
        folder = path::withoutLastComponent(folder);
        return true;
    }
    const std::string child = path::appending(folder, name);
    if (!guard(folder, name))
        return stopAt(End::failure, child, names);
    if (means_.mounts.silentMountAt(child))
        return stopAtSilentMount(child, names);
    return enter(folder, child, names);
}

// False where the folder can't be watched now, though it might be later.
bool PathTrail::guard(const std::string& folder, const std::string& name) {
    guards_.push_back(std::make_unique<Guard>(means_.watches, owner_, folder, name));
    const int error = guards_.back()->watch();
    if (error == 0)
        return true;
    if (isNatural(error)) {
        hasBlindSpot_ = true;
        return true;
    }
    explainFailure(folder, error);
    return false;
}

void PathTrail::explainFailure(const std::string& path, int error) {
    explanation_ = explanationOf(path, error);
    means_.warnOfFailure(path, error);
}

bool PathTrail::enter(std::string& folder, const std::string& child, Names& names) {
    entry_ = means_.folders.look(child);
    switch (entry_.kind) {
        case PathEntry::Kind::folder:
            folder = child;
            return true;
        case PathEntry::Kind::link:
            return followLink(folder, names) || stopAt(End::missing, child, names);
        case PathEntry::Kind::other:
            return names.empty() ? stopAtFile(child) : stopAt(End::missing, child, names);
        case PathEntry::Kind::missing:
            break;
    }
    if (isNatural(entry_.error))
        return stopAt(End::missing, child, names);
    explainFailure(child, entry_.error);
    return stopAt(End::failure, child, names);
}

// False for a link that leads nowhere, or in a circle.
bool PathTrail::followLink(std::string& folder, Names& names) {
    std::vector<std::string> target = path::components(entry_.target);
    if (target.empty() || ++linksFollowed_ > mostLinks)
        return false;
    if (target.front() == "/") {
        folder = "/";
        target.erase(target.begin());
    }
    names.insert(names.begin(), target.begin(), target.end());
    return true;
}

bool PathTrail::stopAtFile(const std::string& path) {
    watchContentOfLast();
    return stopAt(End::file, path, {});
}

bool PathTrail::stopAtSilentMount(const std::string& path, const Names& rest) {
    const SilentMount& mount = *means_.mounts.silentMountAt(path);
    explanation_ = explanationOf(mount);
    isWorthPolling_ = mount.source == ChangeSource::polling;
    return stopAt(End::silentMount, path, rest);
}

bool PathTrail::stopAt(End end, const std::string& path, const Names& rest) {
    end_ = end;
    path_ = path;
    for (const std::string& name : rest)
        path_ = path::appending(path_, name);
    return false;
}

void PathTrail::watchContentOfLast() {
    if (!guards_.empty())
        guards_.back()->watchContent();
}

}  // namespace vexo
