#include "framework/pathwatcher/Watches.h"

#include <algorithm>

namespace vexo {

WatchResult Watches::add(const std::string& folder, std::uint32_t kinds, EventListener& listener) {
    const WatchResult result = events_.add(folder, kinds);
    if (!result)
        return result;
    auto& listeners = listeners_[result.watch];
    if (std::find(listeners.begin(), listeners.end(), &listener) == listeners.end())
        listeners.push_back(&listener);
    return result;
}

void Watches::remove(int watch, EventListener& listener) {
    std::replace(hearing_.begin(), hearing_.end(), &listener, static_cast<EventListener*>(nullptr));
    const auto found = listeners_.find(watch);
    if (found == listeners_.end() || std::erase(found->second, &listener) == 0 || !found->second.empty())
        return;
    forget(watch);
    events_.remove(watch);
}

void Watches::dispatch(const FileEvent& event) {
    if (!latest_ || latest_->first != event.watch) {
        const auto found = listeners_.find(event.watch);
        if (found == listeners_.end())
            return;
        latest_ = &*found;
    }
    hearing_ = latest_->second;
    if (event.kinds & IN_IGNORED)
        forget(event.watch);
    for (std::size_t i = 0; i < hearing_.size(); ++i)
        if (hearing_[i])
            hearing_[i]->heard(event);
    hearing_.clear();
}

void Watches::forget(int watch) {
    listeners_.erase(watch);
    latest_ = nullptr;
}

void Watches::reopen() {
    listeners_.clear();
    latest_ = nullptr;
    events_.reopen();
}

}  // namespace vexo
