// One running helper process and the channel to it. Belongs to one thread at a time; any other may end it.
#pragma once

#include <sys/types.h>

#include <chrono>
#include <memory>
#include <span>
#include <string>
#include <string_view>

#include "platform/linux/FileDescriptor.h"

namespace vexo {

class ReaderProcess {
  public:
    using Deadline = std::chrono::steady_clock::time_point;
    enum class Reception { message, ended, late };
    using Descriptors = std::span<const int>;
    static constexpr std::size_t mostDescriptors = 2;

    // nil, and errno set, when the program cannot be started.
    static std::unique_ptr<ReaderProcess> start(const std::string& program);
    // Ends the process, whatever it is doing.
    ~ReaderProcess();
    ReaderProcess(const ReaderProcess&) = delete;
    ReaderProcess& operator=(const ReaderProcess&) = delete;

    // Kills the process and does not wait for it to go; whoever waits for a message hears that it ended.
    // Callable from any thread.
    void end();

    // Sends at least one descriptor along with the message. False when the process is gone.
    [[nodiscard]] bool send(std::string_view message, Descriptors descriptors);
    // Waits for one message, which is cut when it is longer than allowed.
    [[nodiscard]] Reception receive(std::string& message, Deadline deadline);

  private:
    ReaderProcess(pid_t process, platform::FileDescriptor channel);

    void reap();

    const pid_t process_;
    platform::FileDescriptor channel_;
    platform::FileDescriptor processDescriptor_;  // becomes readable when the process has ended
};

}  // namespace vexo
