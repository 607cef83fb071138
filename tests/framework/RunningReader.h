// The reader program without a MediaReader around it.
#pragma once

#include <spawn.h>
#include <sys/socket.h>
#include <sys/wait.h>
#include <unistd.h>

#include <stdexcept>
#include <string>
#include <string_view>
#include <utility>

#include "framework/metadata/ReaderMessage.h"
#include "tests/framework/MediaReaderTest.h"

namespace vexo {

class RunningReader {
  public:
    RunningReader() {
        int ends[2];
        if (socketpair(AF_UNIX, SOCK_SEQPACKET | SOCK_CLOEXEC, 0, ends) != 0)
            throw std::runtime_error("no socket");
        channel_ = platform::FileDescriptor(ends[0]);
        const platform::FileDescriptor theirs(ends[1]);
        posix_spawn_file_actions_t actions;
        posix_spawn_file_actions_init(&actions);
        posix_spawn_file_actions_adddup2(&actions, theirs.number(), readerChannelDescriptor);
        char name[] = "vexo-media-reader";
        char* const arguments[] = {name, nullptr};
        if (posix_spawn(&process_, realProgram.c_str(), &actions, nullptr, arguments, environ) != 0)
            throw std::runtime_error("cannot start " + realProgram);
        posix_spawn_file_actions_destroy(&actions);
    }
    ~RunningReader() {
        closeChannel();
        if (process_ > 0)
            waitpid(process_, nullptr, 0);
    }

    std::string receive() const {
        std::string message(maximumMessageBytes, '\0');
        const ssize_t size = recv(channel_.number(), message.data(), message.size(), 0);
        message.resize(size > 0 ? static_cast<std::size_t>(size) : 0);
        return message;
    }
    void send(std::string_view message) const {
        ::send(channel_.number(), message.data(), message.size(), MSG_NOSIGNAL);
    }
    void closeChannel() { channel_ = platform::FileDescriptor(); }
    int exitStatus() {
        int status = -1;
        waitpid(std::exchange(process_, -1), &status, 0);
        return WIFEXITED(status) ? WEXITSTATUS(status) : -1;
    }
    pid_t process() const { return process_; }
    std::string about(const std::string& file) const {
        return contentOf("/proc/" + std::to_string(process_) + "/" + file);
    }

  private:
    pid_t process_ = -1;
    platform::FileDescriptor channel_;
};

}  // namespace vexo
