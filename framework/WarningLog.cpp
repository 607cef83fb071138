#include "framework/WarningLog.h"

#include "platform/linux/LogText.h"

namespace vexo {

void WarningLog::log(std::string_view line) {
    if (isFirstOfItsPath(line))
        diagnostics_.warn(std::string(line));
    else
        diagnostics_.log(line);
}

bool WarningLog::isFirstOfItsPath(std::string_view line) {
    platform::Locked lock(mutex_);
    return knownPaths_.size() == Diagnostics::mostWarnings ||
           knownPaths_.emplace(platform::pathInFailureLine(line)).second;
}

}  // namespace vexo
