// A log of failures, each of which is a warning: for those parts of the platform that log only what is wrong
// with the user's own files. Of a path the first failure is one; the others follow from it as a rule, and are
// logged alone. Callable from any thread.
#pragma once

#include <string>
#include <string_view>
#include <unordered_set>

#include "framework/Diagnostics.h"
#include "platform/SystemLog.h"
#include "platform/ThreadSafety.h"

namespace vexo {

class WarningLog final : public platform::SystemLog {
  public:
    // `diagnostics` is not owned and outlives the object.
    explicit WarningLog(Diagnostics& diagnostics) : diagnostics_(diagnostics) {}

    void log(std::string_view line) override VX_EXCLUDES(mutex_);

  private:
    bool isFirstOfItsPath(std::string_view line) VX_EXCLUDES(mutex_);

    Diagnostics& diagnostics_;
    platform::Mutex mutex_;
    std::unordered_set<std::string> knownPaths_ VX_GUARDED_BY(mutex_);  // no more than there are warnings
};

}  // namespace vexo
