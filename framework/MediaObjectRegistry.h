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
    MediaObjectRegistry() = default;
    ~MediaObjectRegistry();
    MediaObjectRegistry(const MediaObjectRegistry&) = delete;
    MediaObjectRegistry& operator=(const MediaObjectRegistry&) = delete;

    // Registers every item of a tree, a group's own items before those of its children. Whoever asks for an
    // item meanwhile doesn't wait for the whole tree.
    void registerTree(const VXMediaGroupRef& root) VX_EXCLUDES(mutex_);
    // Gives up the memory of items that have gone: a weak reference keeps it.
    void forgetVanished() VX_EXCLUDES(mutex_);
    // nil when there is none, or when it has gone.
    VXMediaObjectRef objectForID(const std::string& ID) const VX_EXCLUDES(mutex_);

  private:
    void makeFirstRoom(std::size_t count) VX_EXCLUDES(mutex_);
    void registerObject(const VXMediaObjectRef& mediaObject) VX_EXCLUDES(mutex_);
    VXMediaObjectRef find(const std::string& ID, std::size_t hash) const VX_REQUIRES(mutex_);

    mutable platform::Mutex mutex_;
    // By the hash of the ID, so that no ID is stored twice.
    std::unordered_multimap<std::size_t, std::weak_ptr<VXMediaObject>> objects_ VX_GUARDED_BY(mutex_);
};

}  // namespace vexo
