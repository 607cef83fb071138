#include "framework/MediaObjectRegistry.h"

#include <utility>

#include "framework/TreeWalk.h"

namespace vexo {

namespace {

std::vector<VXMediaObjectList> listsOfTree(const VXMediaGroupRef& root) {
    std::vector<VXMediaObjectList> lists;
    if (!root)
        return lists;
    visitGroups(root, [&lists](const VXMediaGroupRef& group) {
        if (auto own = group->ownMediaObjects(); own && !own->empty())
            lists.push_back(std::move(*own));
        return true;
    });
    return lists;
}

}  // namespace

// Items may live on, and another registry may come to lie where this one was.
MediaObjectRegistry::~MediaObjectRegistry() {
    for (const auto& entry : objects_) {
        const MediaObjectRegistry* self = this;
        if (const VXMediaObjectRef mediaObject = entry.second.lock())
            mediaObject->registry_.compare_exchange_strong(self, nullptr);
    }
}

void MediaObjectRegistry::registerTree(const VXMediaGroupRef& root) {
    std::vector<VXMediaObjectList> lists = listsOfTree(root);
    platform::Locked lock(mutex_);
    registerLatestTree();
    latestTree_.swap(lists);
}

VXMediaObjectRef MediaObjectRegistry::objectForID(const std::string& ID) {
    const std::size_t hash = VXMediaObject::hashOfID(ID);
    platform::Locked lock(mutex_);
    registerLatestTree();
    return find(ID, hash);
}

void MediaObjectRegistry::registerLatestTree() {
    for (const VXMediaObjectList& mediaObjects : latestTree_) {
        makeFirstRoom(mediaObjects.size());
        for (const VXMediaObjectRef& mediaObject : mediaObjects)
            registerObject(mediaObject);
    }
    latestTree_.clear();
}

// A root lists nearly all items of its tree, so the table of the first one need not grow by and by. It gets
// room for twice as many: an item that isn't in it is then mostly told by an empty place.
void MediaObjectRegistry::makeFirstRoom(std::size_t count) {
    if (objects_.empty())
        objects_.reserve(2 * count);
}

// Most items are in several lists, and most trees are those of before with a change.
void MediaObjectRegistry::registerObject(const VXMediaObjectRef& mediaObject) {
    if (mediaObject->registry_.load(std::memory_order_relaxed) == this)
        return;
    if (find(mediaObject->ID(), mediaObject->IDHash_))
        return;
    objects_.emplace(mediaObject->IDHash_, mediaObject);
    mediaObject->registry_.store(this, std::memory_order_relaxed);
}

void MediaObjectRegistry::forgetVanished() {
    platform::Locked lock(mutex_);
    std::erase_if(objects_, [](const auto& entry) { return entry.second.expired(); });
}

VXMediaObjectRef MediaObjectRegistry::find(const std::string& ID, std::size_t hash) const {
    const auto [first, last] = objects_.equal_range(hash);
    for (auto entry = first; entry != last; ++entry) {
        VXMediaObjectRef mediaObject = entry->second.lock();
        if (mediaObject && mediaObject->ID() == ID)
            return mediaObject;
    }
    return nullptr;
}

}  // namespace vexo
