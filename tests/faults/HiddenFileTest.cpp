// Files that hide names and can't be read for a moment.
#include <gtest/gtest.h>
#include <sys/syscall.h>
#include <unistd.h>

#include <cerrno>
#include <ctime>

#include "platform/linux/HiddenNames.h"
#include "tests/faults/SystemCalls.h"
#include "tests/support/TemporaryFolder.h"

namespace {

thread_local time_t secondsAhead = 0;  // of the clock that this program sees

}  // namespace

extern "C" int clock_gettime(clockid_t clock, timespec* time) noexcept {
    const auto result = static_cast<int>(syscall(SYS_clock_gettime, clock, time));
    if (clock == CLOCK_REALTIME)
        time->tv_sec += secondsAhead;
    return result;
}

namespace testing_support {
namespace {

// What was read is kept only of files that are older than the ticks of a clock.
TEST(HiddenFile, ThatCouldNotBeReadIsReadTheNextTime) {
    const TemporaryFolder folder;
    folder.writeFile(".hidden", "secret\n");
    secondsAhead = 60;
    std::size_t index = 0;
    for (bool failed = true; failed; ++index) {
        SCOPED_TRACE(index);
        const platform::HiddenNames names;
        {
            SystemCalls calls(folder.path());
            calls.failAt(index, EIO);
            names.contains(folder.path(), "secret");
            failed = calls.calls().size() > index;
        }
        EXPECT_TRUE(names.contains(folder.path(), "secret"));
    }
    secondsAhead = 0;
    EXPECT_GT(index, 3u);
}

}  // namespace
}  // namespace testing_support
