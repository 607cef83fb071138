#include "framework/Diagnostics.h"

#include "framework/HostServices.h"
#include "host/VXLog.h"

namespace vexo {

void Diagnostics::warn(const std::string& warning) {
    const std::optional<std::string> told = keep(warning);
    if (!told)
        return;
    log_.log(*told);
    try {
        observers_.notify(*told);
    } catch (...) {  // what is warned of must not depend on who hears it
        log_.log("an observer of warnings failed");
    }
}

// A library in which everything is broken must not fill memory and log for ever.
std::optional<std::string> Diagnostics::keep(const std::string& warning) {
    platform::Locked lock(mutex_);
    if (warnings_.size() > mostWarnings || !known_.insert(warning).second)
        return std::nullopt;
    const bool isOneTooMany = warnings_.size() == mostWarnings;
    warnings_.push_back(isOneTooMany ? "there are more warnings, which are left out" : warning);
    return warnings_.back();
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
