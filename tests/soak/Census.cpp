#include "tests/soak/Census.h"

#include "framework/TreeWalk.h"

#if VEXO_SANITIZED
// GCC has the function in its libraries and lacks the header that declares it.
extern "C" std::size_t __sanitizer_get_current_allocated_bytes();
#else
#include <malloc.h>
#endif

namespace soak {

using platform::Locked;

void Census::take(const vexo::VXMediaGroupRef& root) {
    if (!root)
        return;
    Known found;
    vexo::visitGroups(root, [&](const vexo::VXMediaGroupRef& group) {
        found.insert(group);
        for (const vexo::VXMediaObjectRef& item :
             group->ownMediaObjects().value_or(vexo::VXMediaObjectList()))
            found.insert(item);
        return true;
    });
    Locked lock(mutex_);
    std::erase_if(known_, [](const auto& each) { return each.expired(); });
    known_.merge(found);
}

std::size_t Census::living() {
    Locked lock(mutex_);
    std::erase_if(known_, [](const auto& each) { return each.expired(); });
    return known_.size();
}

std::size_t allocatedBytes() {
#if VEXO_SANITIZED
    return __sanitizer_get_current_allocated_bytes();
#else
    const struct mallinfo2 memory = mallinfo2();
    return memory.uordblks + memory.hblkhd;
#endif
}

}  // namespace soak
