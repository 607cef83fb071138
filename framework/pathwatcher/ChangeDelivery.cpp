#include "framework/pathwatcher/ChangeDelivery.h"

#include "platform/Dispatcher.h"
#include "platform/Services.h"

namespace vexo {

using platform::Locked;

namespace {

constexpr double normalPriority = 0.5;

}  // namespace

void ChangeDelivery::add(const Subscriber& subscriber, const ChangeBurst::Paths& changedPaths) {
    Locked lock(mutex_);
    if (!closed_)
        waiting_[subscriber].insert(changedPaths.begin(), changedPaths.end());
}

void ChangeDelivery::begin() {
    {
        Locked lock(mutex_);
        if (waiting_.empty() || std::exchange(isDelivering_, true))
            return;
    }
    platform::services().dispatcher.detachThread("vexo-changes", normalPriority,
                                                 [self = shared_from_this()] { self->deliver(); });
}

void ChangeDelivery::close() {
    Locked lock(mutex_);
    closed_ = true;
    waiting_.clear();
}

void ChangeDelivery::deliver() {
    while (const auto report = takeNext())
        report->first.hear({report->second.begin(), report->second.end()});
}

std::optional<ChangeDelivery::Reports::value_type> ChangeDelivery::takeNext() {
    Locked lock(mutex_);
    if (waiting_.empty()) {
        isDelivering_ = false;
        return std::nullopt;
    }
    Reports::value_type next = *waiting_.begin();
    waiting_.erase(waiting_.begin());
    return next;
}

}  // namespace vexo
