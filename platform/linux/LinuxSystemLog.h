// The system log through syslog(3), which the journal receives too.
#pragma once

#include <string>

#include "platform/SystemLog.h"

namespace platform {

// Each call is one line, whatever it contains: control characters are escaped. One exists in a process at a
// time, because syslog knows one identity. Callable from any thread.
class LinuxSystemLog final : public SystemLog {
  public:
    enum class StandardError { silent, copies };

    // `identity` begins each line, usually the program's name.
    explicit LinuxSystemLog(std::string identity, StandardError standardError = StandardError::silent);
    ~LinuxSystemLog() override;
    LinuxSystemLog(const LinuxSystemLog&) = delete;
    LinuxSystemLog& operator=(const LinuxSystemLog&) = delete;

    void log(std::string_view line) override;

  private:
    const std::string identity_;
    const StandardError standardError_;
};

}  // namespace platform
