// What a thread is called and how much of the machine it gets. Each applies to the calling thread; what the
// process has no right to is left as it was.
#pragma once

#include <string>

namespace platform {

// The kernel keeps the first 15 bytes.
void nameThisThread(const std::string& name);

// Batch work at the lowest priority, reading from disks only when nobody else does.
void lowerThisThreadToBackground();

// `priority` from 0.0 (lowest) to 1.0; 0.5 keeps the thread as the one that started it.
void setPriorityOfThisThread(double priority);

// The change of the nice value for a priority: 19 for 0.0, none for 0.5, -20 for 1.0.
int niceStepForPriority(double priority);

}  // namespace platform
