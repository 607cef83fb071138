#include "tests/soak/TreePick.h"

namespace soak {

using vexo::VXMediaGroupRef;

// Goes down, and stops somewhere on the way.
VXMediaGroupRef anyGroup(const vexo::Host& host, testing_support::RandomSource& chance) {
    VXMediaGroupRef group = managerOf(host).rootMediaGroup();
    while (group && !chance.oneIn(4)) {
        const vexo::VXMediaGroupList children = group->childGroups();
        if (children.empty())
            break;
        group = children[chance.below(children.size())];
    }
    return group;
}

PickedItem anyItem(const vexo::Host& host, testing_support::RandomSource& chance) {
    const VXMediaGroupRef group = anyGroup(host, chance);
    const vexo::VXMediaObjectList items = group ? group->mediaObjects() : vexo::VXMediaObjectList();
    return {items.empty() ? nullptr : items[chance.below(items.size())], group};
}

}  // namespace soak
