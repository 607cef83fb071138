// The platform's system log. Callable from any thread.
#pragma once

#include <string_view>

namespace platform {

class SystemLog {
  public:
    virtual ~SystemLog() = default;
    virtual void log(std::string_view line) = 0;
};

}  // namespace platform
