#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sys/socket.h>
#include <sys/un.h>
#include <unistd.h>

#include "platform/linux/LinuxSystemLog.h"
#include "platform/linux/LogText.h"

using namespace platform;
using testing::HasSubstr;

namespace {

// Stands in for the machine's log where none runs.
class LogSocket {
  public:
    LogSocket() : socket_(socket(AF_UNIX, SOCK_DGRAM | SOCK_CLOEXEC, 0)) {
        sockaddr_un address{AF_UNIX, "/dev/log"};
        isBound_ = bind(socket_, reinterpret_cast<sockaddr*>(&address), sizeof address) == 0;
    }
    ~LogSocket() {
        close(socket_);
        if (isBound_)
            unlink("/dev/log");
    }

    bool isBound() const { return isBound_; }
    std::string nextMessage() const {
        char buffer[1024];
        const auto size = recv(socket_, buffer, sizeof buffer, MSG_DONTWAIT);
        return size < 0 ? "" : std::string(buffer, static_cast<std::size_t>(size));
    }

  private:
    const int socket_;
    bool isBound_;
};

}  // namespace

TEST(SystemLog, ReachesTheMachinesLogAsOneLine) {
    const LogSocket machine;
    if (!machine.isBound())
        GTEST_SKIP() << "/dev/log is taken or may not be made";
    LinuxSystemLog log("vexo-test");
    log.log("first\nsecond %s %n");
    const auto message = machine.nextMessage();
    EXPECT_THAT(message, HasSubstr("vexo-test[" + std::to_string(getpid()) + "]: first\\x0asecond %s %n"));
    EXPECT_EQ(machine.nextMessage(), "");
}

TEST(SystemLog, CopiesToStandardErrorOnlyWhenAsked) {
    testing::internal::CaptureStderr();
    LinuxSystemLog("vexo-test").log("silent");
    LinuxSystemLog("vexo-test", LinuxSystemLog::StandardError::copies).log("two\rlines");
    EXPECT_EQ(testing::internal::GetCapturedStderr(), "vexo-test: two\\x0dlines\n");
}

TEST(LogText, EscapesWhatATerminalOrALogWouldObey) {
    EXPECT_EQ(printable("a\tb\x1b[31m\x7f"), "a\\x09b\\x1b[31m\\x7f");
    EXPECT_EQ(printable("\xC2\x9B"
                        "31m"),
              "\\x9b31m");
    EXPECT_EQ(printable("Stra\xC3\x9F"
                        "e \xC2\xA0 \xFF \xC2"),
              "Stra\xC3\x9F"
              "e \xC2\xA0 \xFF \xC2");
    EXPECT_EQ(printable(std::string_view("\0", 1)), "\\x00");
}

TEST(LogText, AFailureNamesOperationPathAndReason) {
    EXPECT_EQ(failureLine("open", "/a\nb", ENOENT), "cannot open /a\\x0ab: No such file or directory");
}
