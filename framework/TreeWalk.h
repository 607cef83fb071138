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
    struct Level {
        VXMediaGroupList groups;
        std::size_t next = 0;
    };
    // A stack of our own: a tree may be as deep as a path can be long.
    std::vector<Level> levels{{VXMediaGroupList{root}}};
    while (!levels.empty()) {
        Level& level = levels.back();
        if (level.next == level.groups.size()) {
            levels.pop_back();
            continue;
        }
        const VXMediaGroupRef& group = level.groups[level.next++];  // lives as long as the level
        if (!visit(group))
            return;
        if (VXMediaGroupList childGroups = group->childGroups(); !childGroups.empty())
            levels.push_back({std::move(childGroups)});
    }
}

}  // namespace vexo
