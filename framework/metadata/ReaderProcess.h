// One running helper process and the channel to it. Belongs to one thread at a time.
#pragma once

#include <sys/types.h>

#include <chrono>
#include <memory>
#include <string>
#include <string_view>

#include "platform/linux/FileDescriptor.h"

namespace vexo {

class ReaderProcess {
  public:
    using Deadline = std::chrono::steady_clock::time_point;
    enum class Reception { message, ended, late };

    // nil when the program cannot be started.
    static std::unique_ptr<ReaderProcess> start(const std::string& program);
    // Ends the process, whatever it is doing.
    ~ReaderProcess();
    ReaderProcess(const ReaderProcess&) = delete;
    ReaderProcess& operator=(const ReaderProcess&) = delete;

    // False when the process is gone.
    [[nodiscard]] bool send(std::string_view message, int descriptor);
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
