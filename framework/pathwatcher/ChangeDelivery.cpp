#include "framework/pathwatcher/ChangeDelivery.h"

#include <algorithm>
#include <iterator>
#include <utility>

#include "platform/Dispatcher.h"
#include "platform/Services.h"

namespace vexo {

using platform::Locked;

namespace {

constexpr double normalPriority = 0.5;

}  // namespace

void ChangeDelivery::add(const Subscriber& subscriber, ChangeBurst::Paths changedPaths) {
    Locked lock(mutex_);
    if (closed_)
        return;
    Report& report = waiting_[subscriber];
    if (report.burst.empty())
        report.burst = std::move(changedPaths);
    else
        report.sinceThen.insert(std::move_iterator(changedPaths.begin()),
                                std::move_iterator(changedPaths.end()));
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
        report.key().hear(pathsOf(std::move(report.mapped())));
}

std::vector<std::string> ChangeDelivery::pathsOf(Report report) {
    std::vector<std::string> paths = std::move(report.burst);
    while (!report.sinceThen.empty())
        paths.push_back(std::move(report.sinceThen.extract(report.sinceThen.begin()).value()));
    std::sort(paths.begin(), paths.end());
    paths.erase(std::unique(paths.begin(), paths.end()), paths.end());
    return paths;
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
