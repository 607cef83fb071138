// Walks trees of groups.
#pragma once

#include <utility>
#include <vector>

#include "host/VXMediaGroup.h"

namespace vexo {

// Passes each group below and including `root` to `visit`, a group before its children and these in order,
// until it answers false. Callable from any thread.
template <typename Visit>
void visitGroups(const VXMediaGroupRef& root, const Visit& visit) {
    // A stack of our own: a tree may be as deep as a path can be long.
    std::vector<VXMediaGroupRef> pending{root};
    while (!pending.empty()) {
        const VXMediaGroupRef group = std::move(pending.back());
        pending.pop_back();
        if (!visit(group))
            return;
        const VXMediaGroupList childGroups = group->childGroups();
        for (std::size_t i = childGroups.size(); i > 0; --i)
            pending.push_back(childGroups[i - 1]);
    }
}

}  // namespace vexo
