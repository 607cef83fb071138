// Counts what lives: groups and items that were once in a tree and have not gone, and the memory in use.
#pragma once

#include <cstddef>
#include <memory>
#include <set>

#include "host/VXMediaGroup.h"
#include "platform/ThreadSafety.h"

namespace soak {

// Thread-safe.
class Census {
  public:
    // Remembers everything in the tree, without keeping it alive.
    void take(const vexo::VXMediaGroupRef& root) VX_EXCLUDES(mutex_);
    // How much of what was ever remembered lives; the rest is forgotten.
    std::size_t living() VX_EXCLUDES(mutex_);

  private:
    using Known = std::set<std::weak_ptr<const void>, std::owner_less<>>;

    platform::Mutex mutex_;
    Known known_ VX_GUARDED_BY(mutex_);
};

// The bytes that the process has allocated and not freed.
std::size_t allocatedBytes();

}  // namespace soak
