// A program of the build while it runs: what it prints, line by line. Ended with the object.
#pragma once

#include <sys/types.h>

#include <optional>
#include <string>
#include <vector>

#include "platform/linux/FileDescriptor.h"

namespace testing_support {

class RunningProgram {
  public:
    // Standard error goes where the test's goes. Raises std::runtime_error when it cannot be started.
    RunningProgram(const std::string& program, std::vector<std::string> arguments);
    ~RunningProgram();
    RunningProgram(const RunningProgram&) = delete;
    RunningProgram& operator=(const RunningProgram&) = delete;

    // The next line of standard output, without its end; nil when the output ended, or after a minute.
    std::optional<std::string> nextLine();
    void send(int signal);
    // Waits for its end and answers its exit status; -1 for one that a signal ended.
    int wait();

  private:
    pid_t process_ = 0;
    platform::FileDescriptor output_;
    std::string read_;  // and not yet answered
};

}  // namespace testing_support
