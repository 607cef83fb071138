#include "platform/linux/ThreadPriority.h"

#include <pthread.h>
#include <sched.h>
#include <sys/resource.h>
#include <sys/syscall.h>
#include <unistd.h>

#include <algorithm>
#include <cmath>

namespace platform {

namespace {

constexpr int lowestNice = 19;
constexpr int highestNice = -20;

// As in ioprio_set(2). Some versions of <linux/ioprio.h> name a parameter "class", which C++ does not read.
constexpr int ioprioWhoProcess = 1;
constexpr int ioprioClassIdle = 3;
constexpr int ioprioClassShift = 13;

// On Linux these act on one thread, by its number.
void setNice(int nice) {
    setpriority(PRIO_PROCESS, static_cast<id_t>(gettid()), nice);
}

}  // namespace

void nameThisThread(const std::string& name) {
    constexpr std::size_t longestName = 15;
    pthread_setname_np(pthread_self(), name.substr(0, longestName).c_str());
}

void lowerThisThreadToBackground() {
    const sched_param parameter{};
    sched_setscheduler(0, SCHED_BATCH, &parameter);
    setNice(lowestNice);
    syscall(SYS_ioprio_set, ioprioWhoProcess, gettid(), ioprioClassIdle << ioprioClassShift);
}

void setPriorityOfThisThread(double priority) {
    if (const int step = niceStepForPriority(priority))
        setNice(getpriority(PRIO_PROCESS, static_cast<id_t>(gettid())) + step);
}

int niceStepForPriority(double priority) {
    const double fromNormal = std::clamp(priority, 0.0, 1.0) - 0.5;
    const int range = fromNormal < 0 ? lowestNice : -highestNice;
    return static_cast<int>(std::lround(-2 * fromNormal * range));
}

}  // namespace platform
