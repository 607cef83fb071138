#include "tests/support/Program.h"

#include <fcntl.h>
#include <spawn.h>
#include <sys/wait.h>
#include <unistd.h>

#include "tests/support/FileContent.h"
#include "tests/support/TemporaryFolder.h"

namespace testing_support {
namespace {

// Nil-terminated, as the kernel wants them.
std::vector<char*> pointersTo(std::vector<std::string>& texts) {
    std::vector<char*> pointers;
    for (std::string& text : texts)
        pointers.push_back(text.data());
    pointers.push_back(nullptr);
    return pointers;
}

}  // namespace

Outcome runProgram(const std::string& program, std::vector<std::string> arguments) {
    const TemporaryFolder files;
    const ScopedEnvironment cache("XDG_CACHE_HOME", files.makeFolder("cache").c_str());
    const ScopedEnvironment home("HOME", files.makeFolder("home").c_str());

    posix_spawn_file_actions_t actions;
    posix_spawn_file_actions_init(&actions);
    const int creating = O_WRONLY | O_CREAT | O_TRUNC;
    posix_spawn_file_actions_addopen(&actions, STDOUT_FILENO, files.path("out").c_str(), creating, 0600);
    posix_spawn_file_actions_addopen(&actions, STDERR_FILENO, files.path("err").c_str(), creating, 0600);
    arguments.insert(arguments.begin(), program);
    pid_t child = 0;
    const int error =
        posix_spawnp(&child, program.c_str(), &actions, nullptr, pointersTo(arguments).data(), environ);
    posix_spawn_file_actions_destroy(&actions);
    if (error != 0)
        return {};

    int status = 0;
    waitpid(child, &status, 0);
    return {WIFEXITED(status) ? WEXITSTATUS(status) : -1, contentOf(files.path("out")),
            contentOf(files.path("err"))};
}

Outcome runVexo(std::vector<std::string> arguments) {
    return runProgram(VEXO_BIN_DIR "/vexo", std::move(arguments));
}

bool isOneLine(const std::string& text) {
    return !text.empty() && text.find('\n') == text.size() - 1;
}

}  // namespace testing_support
