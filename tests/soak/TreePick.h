// Something by chance from the tree that a host shows.
#pragma once

#include "framework/Host.h"
#include "tests/pathwatcher/RandomSource.h"

namespace soak {

// The plug-in of the host.
inline vexo::VXMediaManager& managerOf(const vexo::Host& host) {
    return *host.plugins().front().manager;
}

// nil where there is no tree.
vexo::VXMediaGroupRef anyGroup(const vexo::Host& host, testing_support::RandomSource& chance);

struct PickedItem {
    vexo::VXMediaObjectRef item;  // nil where the group has none
    vexo::VXMediaGroupRef group;
};
PickedItem anyItem(const vexo::Host& host, testing_support::RandomSource& chance);

}  // namespace soak
