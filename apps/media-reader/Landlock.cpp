#include "apps/media-reader/Landlock.h"

#include <linux/landlock.h>
#include <sys/syscall.h>
#include <unistd.h>

#include <cstdint>

#include "platform/linux/FileDescriptor.h"

namespace reader {

namespace {

// As the kernel has it. The system's header may be older than the kernel and lack the later fields; a kernel
// older than this code wants those it does not know to be zero.
struct Ruleset {
    std::uint64_t deniedFileAccess = 0;
    std::uint64_t deniedNetworkAccess = 0;
    std::uint64_t deniedOutside = 0;
};

constexpr std::uint64_t lowest(int bits) {
    return (std::uint64_t{1} << bits) - 1;
}

// Each version of the interface has added rights at the upper end.
Ruleset everythingKnownTo(long version) {
    constexpr int truncation = 3, network = 4, devices = 5, outside = 6;
    const int fileRights = version >= devices ? 16 : version >= truncation ? 15 : version >= 2 ? 14 : 13;
    return {.deniedFileAccess = lowest(fileRights),
            .deniedNetworkAccess = version >= network ? lowest(2) : 0,
            .deniedOutside = version >= outside ? lowest(2) : 0};
}

}  // namespace

// A set of rules without a rule that allows anything.
bool denyFilesAndNetwork() {
    const long version = syscall(SYS_landlock_create_ruleset, nullptr, 0, LANDLOCK_CREATE_RULESET_VERSION);
    if (version < 1)
        return false;
    const Ruleset everything = everythingKnownTo(version);
    const platform::FileDescriptor rules(
        static_cast<int>(syscall(SYS_landlock_create_ruleset, &everything, sizeof everything, 0)));
    return rules && syscall(SYS_landlock_restrict_self, rules.number(), 0) == 0;
}

}  // namespace reader
