#include "tests/pathwatcher/FakeDisk.h"

#include <algorithm>
#include <cerrno>

#include "platform/Path.h"

namespace testing_support {

namespace path = platform::path;

class FakeDisk::Events final : public vexo::FileEvents {
  public:
    explicit Events(FakeDisk& disk) : disk_(disk) {}

    int descriptor() const override { return -1; }

    vexo::WatchResult add(const std::string& folder, std::uint32_t kinds) override {
        const vexo::WatchResult result = tryToAdd(folder, kinds);
        disk_.afterLook();
        return result;
    }

    void remove(int watch) override {
        if (disk_.watches_.erase(watch) > 0)
            disk_.enqueue(watch, IN_IGNORED, "");
    }

    std::optional<vexo::FileEvent> next() override {
        if (disk_.queue_.empty())
            return std::nullopt;
        current_ = disk_.queue_.front();
        disk_.queue_.pop_front();
        return vexo::FileEvent{current_.watch, current_.kinds, current_.name};
    }

    void reopen() override {
        disk_.watches_.clear();
        disk_.queue_.clear();
    }

  private:
    vexo::WatchResult tryToAdd(const std::string& folder, std::uint32_t kinds) {
        if (const auto failure = disk_.failures.find(folder); failure != disk_.failures.end())
            return {-1, failure->second};
        const NodeRef node = disk_.find(folder);
        if (!node || !node->isFolder)
            return {-1, node ? ENOTDIR : ENOENT};
        for (auto& [number, watch] : disk_.watches_) {
            if (watch.folder.lock() == node) {
                watch.kinds |= kinds;
                return {number, 0};
            }
        }
        if (disk_.watches_.size() >= disk_.watchLimit)
            return {-1, ENOSPC};
        disk_.watches_[++disk_.lastWatch_] = {node, kinds};
        return {disk_.lastWatch_, 0};
    }

    FakeDisk& disk_;
    QueuedEvent current_{};
};

class FakeDisk::Access final : public vexo::FolderAccess {
  public:
    explicit Access(FakeDisk& disk) : disk_(disk) {}

    vexo::PathEntry look(const std::string& path) const override {
        const NodeRef node = disk_.find(path);
        disk_.afterLook();
        using Kind = vexo::PathEntry::Kind;
        if (!node)
            return {Kind::missing, "", 0, 0, ENOENT};
        return {node->isFolder ? Kind::folder : Kind::other, "", 1, node->number, 0};
    }

    vexo::FolderListing list(const std::string& folder) const override {
        const vexo::FolderListing listing = listingOf(folder);
        disk_.afterLook();
        return listing;
    }

  private:
    vexo::FolderListing listingOf(const std::string& folder) const {
        if (const auto failure = disk_.listingFailures.find(folder); failure != disk_.listingFailures.end())
            return {failure->second, true, {}};
        const NodeRef node = disk_.find(folder);
        if (!node || !node->isFolder)
            return {node ? ENOTDIR : ENOENT, true, {}};
        vexo::FolderListing listing;
        listing.isEmpty = node->entries.empty();
        for (const auto& [name, entry] : node->entries)
            if (entry->isFolder)
                listing.folders.push_back(name);
        return listing;
    }

    FakeDisk& disk_;
};

FakeDisk::FakeDisk() : root_(std::make_shared<Node>(Node{true, 1, 0, {}})) {}

bool FakeDisk::makeFolder(const std::string& path) {
    return make(path, true);
}

bool FakeDisk::makeFile(const std::string& path) {
    return make(path, false) && write(path);
}

bool FakeDisk::make(const std::string& path, bool isFolder) {
    const NodeRef parent = parentOf(path);
    if (!parent || find(path))
        return false;
    parent->entries[path::lastComponent(path)] = std::make_shared<Node>(Node{isFolder, ++lastNumber_, 0, {}});
    send(parent, IN_CREATE | (isFolder ? IN_ISDIR : 0), path::lastComponent(path));
    return true;
}

bool FakeDisk::write(const std::string& path) {
    const NodeRef node = find(path);
    if (!node || node->isFolder)
        return false;
    ++node->version;
    send(parentOf(path), IN_MODIFY, path::lastComponent(path));
    send(parentOf(path), IN_CLOSE_WRITE, path::lastComponent(path));
    return true;
}

bool FakeDisk::changeAttributes(const std::string& path) {
    const NodeRef node = find(path);
    if (!node || node == root_)
        return false;
    const std::uint32_t isFolder = node->isFolder ? IN_ISDIR : 0;
    send(parentOf(path), IN_ATTRIB | isFolder, path::lastComponent(path));
    send(node, IN_ATTRIB | isFolder, "");
    return true;
}

bool FakeDisk::remove(const std::string& path) {
    const NodeRef node = find(path);
    if (!node || node == root_ || !node->entries.empty())
        return false;
    const NodeRef parent = parentOf(path);
    parent->entries.erase(path::lastComponent(path));
    destroy(node);
    send(parent, IN_DELETE | (node->isFolder ? IN_ISDIR : 0), path::lastComponent(path));
    return true;
}

void FakeDisk::removeWithAllInIt(const std::string& path) {
    const NodeRef node = find(path);
    if (!node)
        return;
    while (!node->entries.empty())
        removeWithAllInIt(path::appending(path, node->entries.begin()->first));
    remove(path);
}

bool FakeDisk::rename(const std::string& from, const std::string& to) {
    const NodeRef node = find(from), newParent = parentOf(to), replaced = find(to);
    const bool isIntoItself = to == from || to.starts_with(from + "/");
    if (!node || node == root_ || !newParent || isIntoItself)
        return false;
    if (replaced && (replaced->isFolder != node->isFolder || !replaced->entries.empty()))
        return false;
    const std::uint32_t isFolder = node->isFolder ? IN_ISDIR : 0;
    const NodeRef oldParent = parentOf(from);
    oldParent->entries.erase(path::lastComponent(from));
    newParent->entries[path::lastComponent(to)] = node;
    send(oldParent, IN_MOVED_FROM | isFolder, path::lastComponent(from));
    send(newParent, IN_MOVED_TO | isFolder, path::lastComponent(to));
    send(node, IN_MOVE_SELF, "");
    if (replaced)
        destroy(replaced);
    return true;
}

void FakeDisk::unmount(const std::string& path) {
    const NodeRef node = find(path);
    parentOf(path)->entries.erase(path::lastComponent(path));
    std::vector<NodeRef> unmounted{node};
    while (!unmounted.empty()) {
        const NodeRef next = unmounted.back();
        unmounted.pop_back();
        dropWatches(next, IN_UNMOUNT);
        for (const auto& [name, entry] : next->entries)
            unmounted.push_back(entry);
    }
}

void FakeDisk::destroy(const NodeRef& node) {
    dropWatches(node, IN_DELETE_SELF);
}

void FakeDisk::dropWatches(const NodeRef& node, std::uint32_t lastKinds) {
    std::erase_if(watches_, [&](const auto& entry) {
        const auto& [number, watch] = entry;
        if (watch.folder.lock() != node)
            return false;
        if (lastKinds == IN_UNMOUNT || watch.kinds & lastKinds)
            enqueue(number, lastKinds, "");
        enqueue(number, IN_IGNORED, "");
        return true;
    });
}

void FakeDisk::send(const NodeRef& folder, std::uint32_t kinds, const std::string& name) {
    for (const auto& [number, watch] : watches_)
        if (watch.folder.lock() == folder && (watch.kinds & kinds & IN_ALL_EVENTS))
            enqueue(number, kinds, name);
}

// Two equal events in a row are one, and the last place in the queue is for the word of the loss.
void FakeDisk::enqueue(int watch, std::uint32_t kinds, const std::string& name) {
    if (queue_.size() > queueLimit)
        return;
    if (queue_.size() == queueLimit) {
        queue_.push_back({-1, IN_Q_OVERFLOW, ""});
        return;
    }
    const bool isRepeated = !queue_.empty() && queue_.back().watch == watch && queue_.back().kinds == kinds &&
                            queue_.back().name == name;
    if (!isRepeated)
        queue_.push_back({watch, kinds, name});
}

FakeDisk::NodeRef FakeDisk::find(const std::string& path) const {
    NodeRef node = root_;
    for (const std::string& name : path::components(path)) {
        if (name == "/")
            continue;
        const auto entry = node->entries.find(name);
        if (entry == node->entries.end())
            return nullptr;
        node = entry->second;
    }
    return node;
}

FakeDisk::NodeRef FakeDisk::parentOf(const std::string& path) const {
    const NodeRef parent = find(path::withoutLastComponent(path));
    return parent && parent->isFolder ? parent : nullptr;
}

std::uint64_t FakeDisk::identityOf(const std::string& path) const {
    const NodeRef node = find(path);
    return node ? node->number : 0;
}

Picture FakeDisk::picture(const std::string& folder) const {
    Picture picture;
    const NodeRef node = find(folder);
    if (node && node->isFolder)
        draw(picture, *node, "");
    return picture;
}

void FakeDisk::draw(Picture& picture, const Node& folder, const std::string& path) {
    auto& entries = picture[path];
    for (const auto& [name, entry] : folder.entries) {
        entries[name] = {entry->number, entry->version, entry->isFolder};
        if (entry->isFolder)
            draw(picture, *entry, path::appending(path, name));
    }
}

std::unique_ptr<vexo::FileEvents> FakeDisk::events() {
    return std::make_unique<Events>(*this);
}

std::unique_ptr<vexo::FolderAccess> FakeDisk::access() {
    return std::make_unique<Access>(*this);
}

}  // namespace testing_support
