// What the reader program can't do, once it reads files.
#include <gmock/gmock.h>
#include <sys/mman.h>
#include <sys/syscall.h>

#include "tests/framework/ForeignCall.h"
#include "tests/framework/RunningReader.h"

using testing::Contains;
using testing::ContainsRegex;

namespace vexo {
namespace {

// A reader that is built with a sanitizer gives up less.
constexpr bool isSanitized = VEXO_SANITIZED;

// How many filters of system calls a process is subject to, by its /proc/…/status. A container may have put
// some on all of its processes.
int filtersIn(const std::string& status) {
    const std::string key = "Seccomp_filters:";
    const auto found = status.find(key);
    return found == std::string::npos ? 0 : std::stoi(status.substr(found + key.size()));
}

TEST(MediaReaderConfinement, LimitsWhatTheReaderMayUse) {
    const RunningReader program;
    const auto given = decodeGreeting(program.receive());
    ASSERT_TRUE(given);
    EXPECT_THAT(*given, Contains("no new privileges"));
    EXPECT_THAT(*given, Contains("limits"));
    EXPECT_THAT(program.about("status"), ContainsRegex("NoNewPrivs:\t1"));
    EXPECT_THAT(program.about("limits"), ContainsRegex("Max core file size +0 +0 "));
    EXPECT_THAT(program.about("limits"), ContainsRegex("Max file size +0 +0 "));
    EXPECT_THAT(program.about("limits"), ContainsRegex("Max open files +6 +6 "));
}

TEST(MediaReaderConfinement, SaysWhetherSystemCallsAreFiltered) {
    const RunningReader program;
    const auto given = decodeGreeting(program.receive());
    ASSERT_TRUE(given);
    const bool isFiltered = filtersIn(program.about("status")) > filtersIn(contentOf("/proc/self/status"));
    EXPECT_EQ(testing::Value(*given, Contains("seccomp")), isFiltered);
    EXPECT_TRUE(isFiltered || isSanitized);
}

TEST(MediaReaderConfinement, IsToldByTheMediaReader) {
    ProcessMediaReader reader({realProgram});
    const RunningReader program;
    EXPECT_EQ(reader.confinement(), decodeGreeting(program.receive()));
    EXPECT_EQ(reader.startedHelpers(), 1);
}

TEST(MediaReaderConfinement, IsUnknownOfAReaderThatCannotBeStarted) {
    ProcessMediaReader reader({"/nowhere/vexo-media-reader"});
    EXPECT_EQ(reader.confinement(), std::nullopt);
}

class ConfinedReader : public testing::Test {
  protected:
    void SetUp() override {
        ASSERT_TRUE(decodeGreeting(program_.receive()));
        if (isSanitized)
            GTEST_SKIP() << "a sanitizer needs what is forbidden here";
        call_.emplace(program_.process());
        if (!call_->isPossible())
            GTEST_SKIP() << "no other process may be held here";
    }
    void TearDown() override { call_.reset(); }

    long long make(long number, ForeignCall::Arguments arguments = {}) {
        return call_->make(number, arguments);
    }
    // The address at which the text now lies in the reader.
    unsigned long long placed(const std::string& text) { return call_->place(text); }

    RunningReader program_;
    std::optional<ForeignCall> call_;
};

// Without it, the tests that follow would hold for a call that is never made.
TEST_F(ConfinedReader, MakesTheCallsOfTheseTests) {
    EXPECT_EQ(make(SYS_getpid), program_.process());
}

constexpr auto here = static_cast<unsigned long long>(AT_FDCWD);

TEST_F(ConfinedReader, OpensNoFile) {
    const auto path = placed("/etc/passwd");
    EXPECT_EQ(make(SYS_openat, {here, path, O_RDONLY}), -EPERM);
    EXPECT_EQ(make(SYS_openat, {here, path, O_PATH}), -EPERM);
    EXPECT_EQ(make(SYS_statx, {here, path, 0, 0xFFF, path}), -EPERM);
    EXPECT_EQ(make(SYS_newfstatat, {here, path, path, 0}), -EPERM);
    EXPECT_EQ(make(SYS_memfd_create, {path, 0}), -EPERM);
}

TEST_F(ConfinedReader, ReachesNoNetwork) {
    for (const unsigned long long family : {AF_INET, AF_INET6, AF_UNIX, AF_NETLINK})
        EXPECT_EQ(make(SYS_socket, {family, SOCK_STREAM, 0}), -EPERM) << family;
    const auto address = placed(std::string(16, '\2'));
    EXPECT_EQ(make(SYS_connect, {readerChannelDescriptor, address, 16}), -EPERM);
}

TEST_F(ConfinedReader, StartsNoProcess) {
    const auto path = placed("/bin/sh");
    EXPECT_EQ(make(SYS_execve, {path, 0, 0}), -EPERM);
    EXPECT_EQ(make(SYS_clone, {SIGCHLD}), -EPERM);
    EXPECT_EQ(make(SYS_clone3, {path, 64}), -EPERM);
}

TEST_F(ConfinedReader, SignalsNobody) {
    EXPECT_EQ(make(SYS_kill, {static_cast<unsigned long long>(getpid()), 0}), -EPERM);
}

TEST_F(ConfinedReader, GetsNoMemoryForCode) {
    constexpr unsigned long long nowhere = -1;
    EXPECT_EQ(make(SYS_mmap, {0, 4096, PROT_READ | PROT_EXEC, MAP_PRIVATE | MAP_ANONYMOUS, nowhere, 0}),
              -EPERM);
    EXPECT_GT(make(SYS_mmap, {0, 4096, PROT_READ | PROT_WRITE, MAP_PRIVATE | MAP_ANONYMOUS, nowhere, 0}), 0);
}

}  // namespace
}  // namespace vexo
