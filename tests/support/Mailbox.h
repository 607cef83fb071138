// What programs that others start tell a test: a pipe with a name, into which they write lines.
#pragma once

#include <optional>
#include <string>

#include "platform/linux/FileDescriptor.h"

namespace testing_support {

class Mailbox {
  public:
    // Makes the pipe.
    explicit Mailbox(const std::string& path);

    const std::string& path() const { return path_; }
    // The next line, without its end; nil when none comes for a minute.
    std::optional<std::string> nextLine();

  private:
    const std::string path_;
    const platform::FileDescriptor pipe_;
    std::string read_;  // and not yet answered
};

}  // namespace testing_support
