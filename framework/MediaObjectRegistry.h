// The items of a plug-in's trees by ID. The first item registered under an ID wins while it lives: items are
// held weakly. Thread-safe.
//
// The table of a tree is made when somebody first asks for an item, or when the next tree comes: a load is
// not kept waiting for one that nobody may need. Until then the tree's lists are kept.
#pragma once

#include <cstddef>
#include <memory>
#include <string>
#include <unordered_map>
#include <vector>

#include "host/VXMediaGroup.h"
#include "platform/ThreadSafety.h"

namespace vexo {

class MediaObjectRegistry {
  public:
    MediaObjectRegistry() = default;
    ~MediaObjectRegistry();
    MediaObjectRegistry(const MediaObjectRegistry&) = delete;
    MediaObjectRegistry& operator=(const MediaObjectRegistry&) = delete;

    // Registers every item of a tree, a group's own items before those of its children; nil has none.
    void registerTree(const VXMediaGroupRef& root) VX_EXCLUDES(mutex_);
    // Gives up the memory of items that have gone: a weak reference keeps it.
    void forgetVanished() VX_EXCLUDES(mutex_);
    // nil when there is none, or when it has gone.
    VXMediaObjectRef objectForID(const std::string& ID) VX_EXCLUDES(mutex_);

  private:
    void registerLatestTree() VX_REQUIRES(mutex_);
    void makeFirstRoom(std::size_t count) VX_REQUIRES(mutex_);
    void registerObject(const VXMediaObjectRef& mediaObject) VX_REQUIRES(mutex_);
    VXMediaObjectRef find(const std::string& ID, std::size_t hash) const VX_REQUIRES(mutex_);

    platform::Mutex mutex_;
    std::vector<VXMediaObjectList> latestTree_ VX_GUARDED_BY(mutex_);  // until its items are in the table
    // By the hash of the ID, so that no ID is stored twice.
    std::unordered_multimap<std::size_t, std::weak_ptr<VXMediaObject>> objects_ VX_GUARDED_BY(mutex_);
};

}  // namespace vexo
