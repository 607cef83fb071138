// A log whose every line is a warning: for those parts of the platform that log only what is wrong with the
// user's own files. Callable from any thread.
#pragma once

#include <string>

#include "framework/Diagnostics.h"
#include "platform/SystemLog.h"

namespace vexo {

class WarningLog final : public platform::SystemLog {
  public:
    // `diagnostics` is not owned and outlives the object.
    explicit WarningLog(Diagnostics& diagnostics) : diagnostics_(diagnostics) {}

    void log(std::string_view line) override { diagnostics_.warn(std::string(line)); }

  private:
    Diagnostics& diagnostics_;
};

}  // namespace vexo
