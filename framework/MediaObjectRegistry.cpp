#include "framework/MediaObjectRegistry.h"

#include <functional>
#include <vector>

namespace vexo {
namespace {

std::size_t hashOf(const std::string& ID) {
    return std::hash<std::string>{}(ID);
}

}  // namespace

void MediaObjectRegistry::registerTree(const VXMediaGroupRef& root) {
    platform::Locked lock(mutex_);
    forgetVanished();
    // A stack of our own: a tree may be as deep as a path can be long.
    std::vector<VXMediaGroupRef> pending{root};
    while (!pending.empty()) {
        const VXMediaGroupRef group = std::move(pending.back());
        pending.pop_back();
        if (const auto mediaObjects = group->ownMediaObjects()) {
            for (const VXMediaObjectRef& mediaObject : *mediaObjects)
                registerObject(mediaObject);
        }
        const VXMediaGroupList childGroups = group->childGroups();
        for (std::size_t i = childGroups.size(); i > 0; --i)
            pending.push_back(childGroups[i - 1]);
    }
}

VXMediaObjectRef MediaObjectRegistry::objectForID(const std::string& ID) const {
    platform::Locked lock(mutex_);
    return find(ID);
}

void MediaObjectRegistry::registerObject(const VXMediaObjectRef& mediaObject) {
    if (!find(mediaObject->ID()))
        objects_.emplace(hashOf(mediaObject->ID()), mediaObject);
}

void MediaObjectRegistry::forgetVanished() {
    std::erase_if(objects_, [](const auto& entry) { return entry.second.expired(); });
}

VXMediaObjectRef MediaObjectRegistry::find(const std::string& ID) const {
    const auto [first, last] = objects_.equal_range(hashOf(ID));
    for (auto entry = first; entry != last; ++entry) {
        VXMediaObjectRef mediaObject = entry->second.lock();
        if (mediaObject && mediaObject->ID() == ID)
            return mediaObject;
    }
    return nullptr;
}

}  // namespace vexo
