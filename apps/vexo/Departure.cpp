#include "apps/vexo/Departure.h"

#include <signal.h>
#include <unistd.h>

#include <string_view>

namespace vexo {
namespace {

constexpr std::string_view message = "vexo: a file system does not answer; leaving without waiting for it\n";

// Only what a handler of a signal may do.
void leave(int) {
    [[maybe_unused]] const auto written = write(STDERR_FILENO, message.data(), message.size());
    _exit(1);
}

}  // namespace

Departure::~Departure() {
    if (hasBegun_)
        alarm(0);
}

void Departure::begin() {
    struct sigaction action {};
    action.sa_handler = leave;
    sigaction(SIGALRM, &action, nullptr);
    alarm(secondsAtMost);
    hasBegun_ = true;
}

}  // namespace vexo
