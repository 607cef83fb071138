// The items of the tree that a plug-in has installed, by ID; the first in the tree's order with an ID counts.
// Thread-safe.
//
// The table is made when somebody first asks for an item of the tree: a load is not kept waiting for one that
// nobody may need. The registry keeps the items that the tree had when it was installed until the next one
// is.
#pragma once

#include <string>
#include <string_view>
#include <unordered_map>
#include <vector>

#include "host/VXMediaGroup.h"
#include "platform/ThreadSafety.h"

namespace vexo {

class MediaObjectRegistry {
  public:
    // Takes the place of the tree before, whose items are found no more. A group's own items come before
    // those of its children; nil has none.
    void setTree(const VXMediaGroupRef& root) VX_EXCLUDES(mutex_);
    // nil when the tree has none.
    VXMediaObjectRef objectForID(const std::string& ID) VX_EXCLUDES(mutex_);

  private:
    // The keys are the items' own texts.
    using Table = std::unordered_map<std::string_view, VXMediaObjectRef>;

    void makeTable() VX_REQUIRES(mutex_);

    platform::Mutex mutex_;
    std::vector<VXMediaObjectList> lists_ VX_GUARDED_BY(mutex_);  // that are not in the table yet
    Table table_ VX_GUARDED_BY(mutex_);
};

}  // namespace vexo
