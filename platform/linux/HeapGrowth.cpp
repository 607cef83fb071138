#include "platform/linux/HeapGrowth.h"

#include <malloc.h>

namespace platform {

void letHeapsGrowAtOnce() {
    constexpr int largestHeapOfAThread = 64 * 1024 * 1024;
    mallopt(M_TOP_PAD, largestHeapOfAThread);
}

}  // namespace platform
