#include "framework/pathwatcher/ChangeDelivery.h"

#include <algorithm>
#include <iterator>
#include <string>
#include <utility>
#include <vector>

#include "platform/Dispatcher.h"
#include "platform/Services.h"

namespace vexo {

using platform::Locked;

namespace {

constexpr double normalPriority = 0.5;

// What a subscriber that takes its time may have waiting besides as many as there are distinct paths.
constexpr std::size_t mostRepetitions = 10'000;

void sortWithoutRepetitions(ChangeBurst::Paths& paths) {
    std::sort(paths.begin(), paths.end());
    paths.erase(std::unique(paths.begin(), paths.end()), paths.end());
}

}  // namespace

void ChangeDelivery::add(const Subscriber& subscriber, ChangeBurst::Paths changedPaths) {
    Locked lock(mutex_);
    if (closed_)
        return;
    Report& report = waiting_[subscriber];
    if (report.paths.empty()) {
        report.paths = std::move(changedPaths);
        return;
    }
    std::move(changedPaths.begin(), changedPaths.end(), std::back_inserter(report.paths));
    if (report.paths.size() > mostRepetitions + 2 * report.distinct) {
        sortWithoutRepetitions(report.paths);
        report.distinct = report.paths.size();
    }
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
    while (auto report = takeNext()) {
        sortWithoutRepetitions(report.mapped().paths);
        report.key().hear(report.mapped().paths);
    }
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
