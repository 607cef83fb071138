#include "tests/support/RunningProgram.h"

#include <fcntl.h>
#include <poll.h>
#include <signal.h>
#include <spawn.h>
#include <sys/wait.h>
#include <unistd.h>

#include <array>
#include <stdexcept>
#include <utility>

namespace testing_support {

namespace {

constexpr int patienceMilliseconds = 60'000;

}  // namespace

RunningProgram::RunningProgram(const std::string& program, std::vector<std::string> arguments) {
    int ends[2];
    if (pipe2(ends, O_CLOEXEC) != 0)
        throw std::runtime_error("no pipe");
    output_ = platform::FileDescriptor(ends[0]);
    const platform::FileDescriptor theirs(ends[1]);
    arguments.insert(arguments.begin(), program);
    std::vector<char*> pointers;
    for (std::string& argument : arguments)
        pointers.push_back(argument.data());
    pointers.push_back(nullptr);

    posix_spawn_file_actions_t actions;
    posix_spawn_file_actions_init(&actions);
    posix_spawn_file_actions_adddup2(&actions, theirs.number(), STDOUT_FILENO);
    const int error = posix_spawnp(&process_, program.c_str(), &actions, nullptr, pointers.data(), environ);
    posix_spawn_file_actions_destroy(&actions);
    if (error != 0)
        throw std::runtime_error("cannot start " + program);
}

RunningProgram::~RunningProgram() {
    if (process_ == 0)
        return;
    kill(process_, SIGKILL);
    wait();
}

std::optional<std::string> RunningProgram::nextLine() {
    for (;;) {
        if (const auto end = read_.find('\n'); end != std::string::npos) {
            std::string line = read_.substr(0, end);
            read_.erase(0, end + 1);
            return line;
        }
        pollfd readable{output_.number(), POLLIN, 0};
        if (poll(&readable, 1, patienceMilliseconds) <= 0)
            return std::nullopt;
        std::array<char, 65536> buffer;
        const ssize_t size = read(output_.number(), buffer.data(), buffer.size());
        if (size <= 0)
            return std::nullopt;
        read_.append(buffer.data(), static_cast<std::size_t>(size));
    }
}

void RunningProgram::send(int signal) {
    kill(process_, signal);
}

int RunningProgram::wait() {
    int status = 0;
    waitpid(std::exchange(process_, 0), &status, 0);
    return WIFEXITED(status) ? WEXITSTATUS(status) : -1;
}

}  // namespace testing_support
