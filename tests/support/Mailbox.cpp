#include "tests/support/Mailbox.h"

#include <fcntl.h>
#include <poll.h>
#include <sys/stat.h>

namespace testing_support {
namespace {

constexpr int patienceInMilliseconds = 60'000;

// Open for writing as well, so that it does not end with a writer.
int newPipe(const std::string& path) {
    mkfifo(path.c_str(), 0600);
    return open(path.c_str(), O_RDWR | O_CLOEXEC);
}

}  // namespace

Mailbox::Mailbox(const std::string& path) : path_(path), pipe_(newPipe(path)) {}

std::optional<std::string> Mailbox::nextLine() {
    while (read_.find('\n') == std::string::npos) {
        pollfd waiting{pipe_.number(), POLLIN, 0};
        if (poll(&waiting, 1, patienceInMilliseconds) != 1)
            return std::nullopt;
        char buffer[4096];
        const ssize_t count = read(pipe_.number(), buffer, sizeof buffer);
        if (count <= 0)
            return std::nullopt;
        read_.append(buffer, static_cast<std::size_t>(count));
    }
    const std::size_t end = read_.find('\n');
    const std::string line = read_.substr(0, end);
    read_.erase(0, end + 1);
    return line;
}

}  // namespace testing_support
