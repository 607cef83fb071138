#include "apps/media-reader/SystemCallFilter.h"

#include <seccomp.h>
#include <sys/mman.h>
#include <sys/resource.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <initializer_list>
#include <memory>

namespace reader {

namespace {

struct ReleaseFilter {
    void operator()(void* filter) const { seccomp_release(filter); }
};
using Filter = std::unique_ptr<void, ReleaseFilter>;

// clang-format off
constexpr int freely[] = {
    // the file and the channel
    SCMP_SYS(read), SCMP_SYS(pread64), SCMP_SYS(lseek), SCMP_SYS(close),
    SCMP_SYS(recvmsg), SCMP_SYS(sendto), SCMP_SYS(poll), SCMP_SYS(ppoll),
    // memory
    SCMP_SYS(brk), SCMP_SYS(munmap), SCMP_SYS(mremap), SCMP_SYS(madvise),
    // what the C library does by itself
    SCMP_SYS(futex), SCMP_SYS(getrandom), SCMP_SYS(sched_yield), SCMP_SYS(getpid), SCMP_SYS(gettid),
    SCMP_SYS(clock_gettime), SCMP_SYS(clock_getres), SCMP_SYS(gettimeofday), SCMP_SYS(time),
    SCMP_SYS(rt_sigreturn), SCMP_SYS(rt_sigprocmask), SCMP_SYS(restart_syscall),
    SCMP_SYS(exit), SCMP_SYS(exit_group),
    // processor time
    SCMP_SYS(getrusage),
};
// clang-format on

bool allow(const Filter& filter, int call) {
    return seccomp_rule_add(filter.get(), SCMP_ACT_ALLOW, call, 0) == 0;
}

bool allowIf(const Filter& filter, int call, std::initializer_list<scmp_arg_cmp> conditions) {
    return seccomp_rule_add_array(filter.get(), SCMP_ACT_ALLOW, call,
                                  static_cast<unsigned>(conditions.size()), conditions.begin()) == 0;
}

scmp_arg_cmp argumentIs(unsigned index, scmp_datum_t value) {
    return {index, SCMP_CMP_EQ, value, 0};
}

scmp_arg_cmp argumentLacks(unsigned index, scmp_datum_t bits) {
    return {index, SCMP_CMP_MASKED_EQ, bits, 0};
}

// Memory that can be run as code is not to be had, the only output is messages of the C library, and the only
// limit that can be set is this process's own processor time.
bool allowConditionally(const Filter& filter) {
    constexpr unsigned protection = 2;
    return allowIf(filter, SCMP_SYS(mmap), {argumentLacks(protection, PROT_EXEC)}) &&
           allowIf(filter, SCMP_SYS(mprotect), {argumentLacks(protection, PROT_EXEC)}) &&
           allowIf(filter, SCMP_SYS(write), {argumentIs(0, STDERR_FILENO)}) &&
           allowIf(filter, SCMP_SYS(writev), {argumentIs(0, STDERR_FILENO)}) &&
           allowIf(filter, SCMP_SYS(prlimit64), {argumentIs(0, 0), argumentIs(1, RLIMIT_CPU)});
}

}  // namespace

bool allowOnlyDecoding() {
    const Filter filter(seccomp_init(SCMP_ACT_ERRNO(EPERM)));
    return filter &&
           std::all_of(std::begin(freely), std::end(freely), [&](int call) { return allow(filter, call); }) &&
           allowConditionally(filter) && seccomp_load(filter.get()) == 0;
}

}  // namespace reader
