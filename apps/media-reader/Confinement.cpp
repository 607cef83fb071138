#include "apps/media-reader/Confinement.h"

#include <sys/prctl.h>
#include <sys/resource.h>
#include <unistd.h>

#include "apps/media-reader/Sandbox.h"
#include "framework/metadata/ReaderMessage.h"

namespace reader {

namespace {

// The standard three, the channel, and the file and the memory that the host sends.
constexpr rlim_t openFiles = vexo::readerChannelDescriptor + 3;
constexpr rlim_t processorSecondsPerFile = 10;

bool limit(int resource, rlim_t most) {
    const rlimit both{most, most};
    return setrlimit(resource, &both) == 0;
}

bool limitMemory() {
#ifdef VEXO_READER_MEMORY_LIMIT
    return limit(RLIMIT_AS, VEXO_READER_MEMORY_LIMIT);
#else
    return true;
#endif
}

bool setLimits() {
    return prctl(PR_SET_NO_NEW_PRIVS, 1, 0, 0, 0) == 0 && limit(RLIMIT_CORE, 0) && limit(RLIMIT_FSIZE, 0) &&
           limit(RLIMIT_NOFILE, openFiles) && limitMemory();
}

rlim_t processorSecondsUsed() {
    rusage usage{};
    getrusage(RUSAGE_SELF, &usage);
    return static_cast<rlim_t>(usage.ru_utime.tv_sec + usage.ru_stime.tv_sec + 1);
}

}  // namespace

std::optional<std::vector<std::string>> confine() {
    closefrom(vexo::readerChannelDescriptor + 1);
    if (!setLimits())
        return std::nullopt;
    std::vector<std::string> given{"no new privileges", "limits"};
    for (const std::string& wall : enterSandbox())
        given.push_back(wall);
    return given;
}

void renewProcessorTime() {
    const rlimit time{processorSecondsUsed() + processorSecondsPerFile, RLIM_INFINITY};
    setrlimit(RLIMIT_CPU, &time);
}

}  // namespace reader
