#include "framework/pathwatcher/ChangeDelivery.h"

#include <algorithm>
#include <string>
#include <utility>
#include <vector>

#include "platform/Dispatcher.h"
#include "platform/Services.h"

namespace vexo {

using platform::Locked;

namespace {

constexpr double normalPriority = 0.5;

std::vector<std::string> sorted(ChangeBurst::Paths paths) {
    std::vector<std::string> list;
    list.reserve(paths.size());
    while (!paths.empty())
        list.push_back(std::move(paths.extract(paths.begin()).value()));
    std::sort(list.begin(), list.end());
    return list;
}

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
    while (auto report = takeNext())
        report.key().hear(sorted(std::move(report.mapped())));
}

ChangeDelivery::Reports::node_type ChangeDelivery::takeNext() {
    Locked lock(mutex_);
    if (waiting_.empty()) {
        isDelivering_ = false;
        return {};
    }
    return waiting_.extract(waiting_.begin());
}

}  // namespace vexo
