#include "framework/MediaObjectRegistry.h"

#include <functional>
#include <vector>

#include "framework/TreeWalk.h"

namespace vexo {
namespace {

std::size_t hashOf(const std::string& ID) {
    return std::hash<std::string>{}(ID);
}

}  // namespace

void MediaObjectRegistry::registerTree(const VXMediaGroupRef& root) {
    std::vector<VXMediaGroupRef> groups;
    visitGroups(root, [&groups](const VXMediaGroupRef& group) {
        groups.push_back(group);
        return true;
    });
    platform::Locked lock(mutex_);
    forgetVanished();
    for (const VXMediaGroupRef& group : groups)
        registerObjectsOf(*group);
}

void MediaObjectRegistry::registerObjectsOf(const VXMediaGroup& group) {
    if (const auto mediaObjects = group.ownMediaObjects())
        for (const VXMediaObjectRef& mediaObject : *mediaObjects)
            registerObject(mediaObject);
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
