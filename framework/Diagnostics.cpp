#include "framework/Diagnostics.h"

#include <algorithm>

#include "framework/HostServices.h"
#include "host/VXLog.h"

namespace vexo {

void Diagnostics::warn(const std::string& warning) {
    {
        platform::Locked lock(mutex_);
        if (std::find(warnings_.begin(), warnings_.end(), warning) != warnings_.end())
            return;
        warnings_.push_back(warning);
    }
    log_.log(warning);
    observers_.notify(warning);
}

std::vector<std::string> Diagnostics::warnings() const {
    platform::Locked lock(mutex_);
    return warnings_;
}

void Diagnostics::addWarningObserver(std::weak_ptr<const void> owner, WarningObserver observer) {
    observers_.add(std::move(owner), std::move(observer));
}

void Diagnostics::trace(std::string_view line) {
    if (verbosity_ == Verbosity::verbose)
        log_.log(line);
}

void VXLog(std::string_view message, int level, const void* /*sender*/) {
    if (level <= VXLogLevelCaughtError)
        hostServices().diagnostics.log(message);
    else
        hostServices().diagnostics.trace(message);
}

void VXLogDef(std::string_view message, int level, const void* sender) {
    VXLog(message, level, sender);
}

}  // namespace vexo
