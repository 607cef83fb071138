// How the memory of a program grows that loads large libraries on several threads.
#pragma once

namespace platform {

// Has each heap take the addresses that it may need at once. The C library otherwise asks the kernel for
// every 4 KiB by which a thread's heap grows, and each time keeps the other threads from using new memory. No
// memory is taken before it is used, but the end of a heap that has become free is kept for what comes next
// instead of being given back.
//
// For programs to call before they start threads, whose heaps it concerns.
void letHeapsGrowAtOnce();

}  // namespace platform
