#include "framework/pathwatcher/FolderTree.h"

#include <algorithm>
#include <utility>

#include "framework/metadata/FileTypes.h"
#include "framework/pathwatcher/PackageName.h"
#include "platform/Path.h"

namespace vexo {

namespace {

constexpr std::uint32_t contentKinds = IN_MODIFY | IN_CLOSE_WRITE;
constexpr std::uint32_t folderKinds =
    IN_CREATE | IN_DELETE | IN_MOVED_FROM | IN_MOVED_TO | IN_ATTRIB | contentKinds;
// What happens to other folders themselves is an event of the folders around them.
constexpr std::uint32_t topKinds = folderKinds | IN_DELETE_SELF | IN_MOVE_SELF;

// Which files of the folder are hidden, and which attributes the file has whose name follows.
bool tellsOfOtherFiles(std::string_view name) {
    return name == ".hidden" || name.starts_with("._");
}

}  // namespace

class FolderTree::Folder final : public EventListener {
  public:
    Folder(FolderTree& itsTree, Folder* itsParent, std::string itsName)
        : tree(itsTree), parent(itsParent), name(std::move(itsName)) {
        if (parent)
            package = parent->package ? parent->package : isPackageName(name) ? this : nullptr;
    }
    ~Folder() {
        tree.means_.watches.remove(watch, *this);
        stopPolling();
    }
    Folder(const Folder&) = delete;
    Folder& operator=(const Folder&) = delete;

    void heard(const FileEvent& event) override { tree.heard(*this, event); }

    bool isFollowed() const { return watch >= 0 || pollReason; }
    bool isFollowedLike(const Folder& other) const {
        return watch == other.watch && pollReason == other.pollReason && error == other.error &&
               silentMount == other.silentMount;
    }
    void stopPolling() {
        if (polled)
            for (const std::uint64_t place : polled->places())
                tree.polledFolders_.erase(place);
        polled.reset();
    }

    FolderTree& tree;
    Folder* const parent;  // nil for the top
    const std::string name;
    Folder* package = nullptr;  // the outermost package that the folder is in or is
    std::map<std::string, std::unique_ptr<Folder>> children;
    std::uint64_t markedInBurst = 0;

    // Either of the two, or neither for what can't be followed.
    int watch = -1;
    std::optional<PolledSubtree::Reason> pollReason;
    std::string silentMount;  // in words for people, where one is to be polled
    int error = 0;            // errno where watching failed
    bool couldNotBeListed = false;
    std::unique_ptr<PolledSubtree> polled;
};

FolderTree::FolderTree(WatchMeans& means, Owner& owner, std::string path, std::string reportedPath)
    : means_(means),
      owner_(owner),
      path_(std::move(path)),
      reportedPath_(std::move(reportedPath)),
      top_(std::make_unique<Folder>(*this, nullptr, "")) {}

FolderTree::~FolderTree() {
    forget(std::move(top_));
}

int FolderTree::watch() {
    const int error = follow(*top_);
    if (top_->watch >= 0)
        explore(*top_, Discovery::initial);
    else if (top_->pollReason)
        poll(*top_);
    return top_->isFollowed() ? 0 : error;
}

bool FolderTree::isInPlace() {
    const WatchResult found = means_.watches.add(path_, topKinds, *top_);
    if (found.watch == top_->watch)
        return found || top_->pollReason;
    means_.watches.remove(found.watch, *top_);
    return false;
}

void FolderTree::heard(Folder& folder, const FileEvent& event) {
    if (event.kinds & (IN_IGNORED | IN_UNMOUNT))
        return lost(folder, event.kinds & IN_UNMOUNT);
    if (event.name.empty())
        return heardOfItself(folder, event);
    if (event.kinds & contentKinds)
        return heardOfContent(folder, event);
    markChanged(folder);
    if (event.kinds & IN_ISDIR)
        examine(folder, std::string(event.name),
                event.kinds & IN_MOVED_TO ? Known::isOutdated : Known::isKept);
}

void FolderTree::heardOfItself(Folder& folder, const FileEvent& event) {
    if (folder.parent)
        return;
    if (event.kinds & IN_ATTRIB)
        markChanged(folder);
    else
        owner_.treeWasLost(/*unmounted=*/false);
}

void FolderTree::heardOfContent(Folder& folder, const FileEvent& event) {
    if (isContentKnown(folder, event.name))
        return;
    if (tellsOfOtherFiles(event.name) || (folder.package && !typeOfFile(event.name).isMovie))
        return markChanged(folder);
    means_.burst.add(reportedPath_, pathBelow(reportedPath_, folder, event.name));
}

// Writing a file is several events in a row, which say the same to a burst.
bool FolderTree::isContentKnown(const Folder& folder, std::string_view name) {
    const std::uint64_t burst = means_.burst.number();
    if (latestContent_.folder == &folder && latestContent_.burst == burst && latestContent_.name == name)
        return true;
    latestContent_.folder = &folder;
    latestContent_.name = name;
    latestContent_.burst = burst;
    return false;
}

// The folder may be gone afterwards.
void FolderTree::lost(Folder& folder, bool unmounted) {
    if (!unmounted)
        folder.watch = -1;
    if (!folder.parent)
        return owner_.treeWasLost(unmounted);
    markChanged(*folder.parent);
    examine(*folder.parent, std::string(folder.name));
}

// A folder that was moved here may be known, from a listing or because it was here before. What happened in
// it while it was elsewhere was looked for here, in vain; so it is explored anew.
void FolderTree::examine(Folder& parent, const std::string& name, Known whatIsKnown) {
    latestContent_ = {};  // of a folder that may be gone
    auto found = std::make_unique<Folder>(*this, &parent, name);
    follow(*found);
    const auto known = parent.children.find(name);
    if (known != parent.children.end()) {
        if (whatIsKnown == Known::isKept && found->isFollowed() && known->second->isFollowedLike(*found))
            return;
        std::unique_ptr<Folder> outdated = std::move(known->second);
        parent.children.erase(known);
        forget(std::move(outdated));
    }
    if (found->isFollowed())
        add(std::move(found), Discovery::appeared);
}

void FolderTree::add(std::unique_ptr<Folder> folder, Discovery discovery) {
    Folder& added = *folder;
    added.parent->children[added.name] = std::move(folder);
    if (added.pollReason)
        poll(added);
    else
        explore(added, discovery);
}

void FolderTree::explore(Folder& folder, Discovery discovery) {
    std::vector<Folder*> unexplored{&folder};
    while (!unexplored.empty()) {
        Folder& next = *unexplored.back();
        unexplored.pop_back();
        const FolderListing listing = means_.folders.list(pathBelow(path_, next));
        if (listing.error != 0 && !isNatural(listing.error)) {
            pollInstead(next, listing.error);
            continue;
        }
        if (discovery == Discovery::appeared && !listing.isEmpty)
            markChanged(next);
        for (const std::string& name : listing.folders)
            discover(next, name, unexplored);
    }
}

// A broken file system may list a name twice.
void FolderTree::discover(Folder& parent, const std::string& name, std::vector<Folder*>& discovered) {
    if (parent.children.contains(name))
        return;
    auto folder = std::make_unique<Folder>(*this, &parent, name);
    follow(*folder);
    if (!folder->isFollowed())
        return;
    if (folder->pollReason)
        poll(*folder);
    else
        discovered.push_back(folder.get());
    parent.children[name] = std::move(folder);
}

// Answers errno where the folder can't be watched; a passing reason leads to polling.
int FolderTree::follow(Folder& folder) {
    const std::string path = pathBelow(path_, folder);
    if (const SilentMount* mount = folder.parent ? means_.mounts.silentMountAt(path) : nullptr) {
        if (mount->source == ChangeSource::polling)
            folder.pollReason = PolledSubtree::Reason::lasting;
        folder.silentMount = explanationOf(*mount);
        return 0;
    }
    const WatchResult result = means_.watches.add(path, folder.parent ? folderKinds : topKinds, folder);
    folder.watch = result.watch;
    folder.error = result.error;
    if (!result && !isNatural(result.error))
        folder.pollReason = PolledSubtree::Reason::passing;
    return result.error;
}

void FolderTree::poll(Folder& folder) {
    folder.stopPolling();
    PolledSubtree::Place place{pathBelow(path_, folder), pathBelow(reportedPath_, folder), std::nullopt};
    if (folder.package)
        place.package = pathBelow(reportedPath_, *folder.package);
    if (folder.error != 0)
        means_.warnOfFailure(place.path, folder.error);
    folder.polled =
        std::make_unique<PolledSubtree>(means_, place, PolledPlace::Depth::tree, *folder.pollReason);
    for (const std::uint64_t number : folder.polled->places())
        polledFolders_[number] = &folder;
}

void FolderTree::pollInstead(Folder& folder, int error) {
    means_.watches.remove(std::exchange(folder.watch, -1), folder);
    folder.pollReason = PolledSubtree::Reason::passing;
    folder.error = error;
    folder.couldNotBeListed = true;
    poll(folder);
}

// Level by level, because a tree may be deeper than the stack.
void FolderTree::forget(std::unique_ptr<Folder> folder) {
    std::vector<std::unique_ptr<Folder>> forgotten;
    forgotten.push_back(std::move(folder));
    while (!forgotten.empty()) {
        const std::unique_ptr<Folder> next = std::move(forgotten.back());
        forgotten.pop_back();
        for (auto& [name, child] : next->children)
            forgotten.push_back(std::move(child));
    }
}

void FolderTree::mountsChangedAt(const std::string& path) {
    bool isExact = false;
    Folder& folder = deepestKnown(platform::path::withoutLastComponent(path), isExact);
    if (folder.pollReason)
        return poll(folder);
    if (!isExact)
        return;
    markChanged(folder);
    examine(folder, platform::path::lastComponent(path));
}

bool FolderTree::take(const PollReport& report) {
    const auto found = polledFolders_.find(report.place);
    if (found == polledFolders_.end())
        return false;
    for (const std::string& path : report.changedPaths)
        means_.burst.add(reportedPath_, path);
    if (found->second->pollReason == PolledSubtree::Reason::passing)
        retry(*found->second);
    return true;
}

// Whether what kept the folder from being watched has passed. The folder may be gone afterwards.
void FolderTree::retry(Folder& folder) {
    if (folder.couldNotBeListed && means_.folders.list(pathBelow(path_, folder)).error != 0)
        return;
    if (folder.parent)
        return examine(*folder.parent, std::string(folder.name));
    follow(folder);
    if (folder.watch < 0)
        return;
    folder.pollReason.reset();
    folder.couldNotBeListed = false;
    folder.stopPolling();
    explore(folder, Discovery::appeared);
}

std::optional<std::string> FolderTree::whyPolled(const std::string& pathInTree) const {
    bool isExact = false;
    const Folder& folder = deepestKnown(pathInTree, isExact);
    return folder.pollReason ? std::optional(whyPolled(folder)) : std::nullopt;
}

std::optional<std::string> FolderTree::whyPartlyPolled() const {
    if (polledFolders_.empty())
        return std::nullopt;
    return whyPolled(*polledFolders_.begin()->second);
}

std::string FolderTree::whyPolled(const Folder& folder) const {
    return folder.error == 0 ? folder.silentMount : explanationOf(pathBelow(path_, folder), folder.error);
}

std::vector<std::string> FolderTree::watchedFolders() const {
    std::vector<std::string> paths;
    visitAll([&](const Folder& folder) {
        if (folder.watch >= 0)
            paths.push_back(pathBelow(reportedPath_, folder));
    });
    return paths;
}

void FolderTree::markChanged(Folder& folder) {
    Folder& reported = folder.package ? *folder.package : folder;
    if (std::exchange(reported.markedInBurst, means_.burst.number()) != means_.burst.number())
        means_.burst.add(reportedPath_, pathBelow(reportedPath_, reported));
}

std::string FolderTree::pathBelow(const std::string& base, const Folder& folder,
                                  std::string_view entry) const {
    const std::string_view start = base == "/" ? std::string_view() : base;
    std::size_t length = start.size() + (entry.empty() ? 0 : entry.size() + 1);
    for (const Folder* each = &folder; each->parent; each = each->parent)
        length += each->name.size() + 1;
    if (length == 0)
        return base;
    std::string path(length, '/');
    const auto putBefore = [&](std::size_t end, std::string_view name) {
        name.copy(path.data() + end - name.size(), name.size());
        return end - name.size();
    };
    putBefore(start.size(), start);
    if (!entry.empty())
        length = putBefore(length, entry) - 1;
    for (const Folder* each = &folder; each->parent; each = each->parent)
        length = putBefore(length, each->name) - 1;
    return path;
}

// The folder at the path, or the last known one on the way to it.
FolderTree::Folder& FolderTree::deepestKnown(const std::string& path, bool& isExact) const {
    Folder* folder = top_.get();
    for (const std::string& name :
         platform::path::components(path.substr(std::min(path.size(), path_.size())))) {
        if (name == "/")
            continue;
        const auto child = folder->children.find(name);
        isExact = child != folder->children.end();
        if (!isExact)
            return *folder;
        folder = child->second.get();
    }
    isExact = true;
    return *folder;
}

template <typename Visit>
void FolderTree::visitAll(Visit visit) const {
    std::vector<const Folder*> unvisited{top_.get()};
    while (!unvisited.empty()) {
        const Folder& next = *unvisited.back();
        unvisited.pop_back();
        visit(next);
        for (const auto& [name, child] : next.children)
            unvisited.push_back(child.get());
    }
}

}  // namespace vexo
