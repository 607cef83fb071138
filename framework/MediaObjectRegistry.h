// The items of a plug-in's trees by ID. The first item registered under an ID wins while it lives: items are
// held weakly. Thread-safe.
#pragma once

#include <cstddef>
#include <memory>
#include <string>
#include <unordered_map>

#include "host/VXMediaGroup.h"
#include "platform/ThreadSafety.h"

namespace vexo {

class MediaObjectRegistry {
  public:
    // Registers every item of a tree, a group's own items before those of its children.
    void registerTree(const VXMediaGroupRef& root) VX_EXCLUDES(mutex_);
    // nil when there is none, or when it has gone.
    VXMediaObjectRef objectForID(const std::string& ID) const VX_EXCLUDES(mutex_);

  private:
    void registerObjectsOf(const VXMediaGroup& group) VX_REQUIRES(mutex_);
    void registerObject(const VXMediaObjectRef& mediaObject) VX_REQUIRES(mutex_);
    void forgetVanished() VX_REQUIRES(mutex_);
    VXMediaObjectRef find(const std::string& ID) const VX_REQUIRES(mutex_);

    mutable platform::Mutex mutex_;
    // By the hash of the ID, so that no ID is stored twice.
    std::unordered_multimap<std::size_t, std::weak_ptr<VXMediaObject>> objects_ VX_GUARDED_BY(mutex_);
};

}  // namespace vexo
