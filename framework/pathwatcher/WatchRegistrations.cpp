#include "framework/pathwatcher/WatchRegistrations.h"

#include <algorithm>

#include "platform/Path.h"

namespace vexo {

using platform::Locked;

namespace {

bool isLiving(const Subscriber& subscriber) {
    return !subscriber.isGone();
}

}  // namespace

std::string WatchRegistrations::registeredForm(std::string path) {
    while (path.size() > 1 && path.back() == '/')
        path.pop_back();
    return path;
}

void WatchRegistrations::add(const std::string& path, const Subscriber& subscriber) {
    Locked lock(mutex_);
    forgetGone();
    auto& subscribers = subscribersByPath_[registeredForm(path)];
    std::erase_if(subscribers,
                  [&](const Subscriber& known) { return known.isGone() || known == subscriber; });
    subscribers.push_back(subscriber);
}

// Only when the paths have doubled: looking at all of them for each new one takes seconds for thousands.
void WatchRegistrations::forgetGone() {
    if (subscribersByPath_.size() < sizeToForgetAt_)
        return;
    std::erase_if(subscribersByPath_, [](const auto& entry) {
        return std::none_of(entry.second.begin(), entry.second.end(), isLiving);
    });
    sizeToForgetAt_ = 2 * subscribersByPath_.size() + 1;
}

bool WatchRegistrations::covers(const std::string& path, const Subscriber& subscriber) const {
    Locked lock(mutex_);
    return findAncestor(path, [&](const Subscriber& known) { return known == subscriber; }).has_value();
}

std::optional<std::string> WatchRegistrations::registeredAncestor(const std::string& path) const {
    Locked lock(mutex_);
    return findAncestor(path, isLiving);
}

std::vector<Subscriber> WatchRegistrations::subscribersOf(const std::string& path) const {
    Locked lock(mutex_);
    std::vector<Subscriber> living;
    const auto found = subscribersByPath_.find(path);
    if (found != subscribersByPath_.end())
        std::copy_if(found->second.begin(), found->second.end(), std::back_inserter(living), isLiving);
    return living;
}

std::vector<std::string> WatchRegistrations::paths() const {
    Locked lock(mutex_);
    std::vector<std::string> paths;
    for (const auto& [path, subscribers] : subscribersByPath_)
        if (std::any_of(subscribers.begin(), subscribers.end(), isLiving))
            paths.push_back(path);
    return paths;
}

template <typename Predicate>
std::optional<std::string> WatchRegistrations::findAncestor(const std::string& path,
                                                            Predicate matches) const {
    for (std::string folder = registeredForm(path); !folder.empty();
         folder = platform::path::withoutLastComponent(folder)) {
        const auto found = subscribersByPath_.find(folder);
        if (found != subscribersByPath_.end() &&
            std::any_of(found->second.begin(), found->second.end(), matches))
            return folder;
        if (folder == "/")
            break;
    }
    return std::nullopt;
}

}  // namespace vexo
