#include "framework/pathwatcher/PathWatcher.h"

#include <algorithm>

#include "platform/Path.h"

namespace vexo {
namespace {

using platform::Locked;
namespace path = platform::path;

bool isObserver(const std::weak_ptr<VXPathObserver>& registered, const VXPathObserverRef& observer) {
    return !registered.owner_before(observer) && !observer.owner_before(registered);
}

// One spelling for a path however many slashes it ends in.
std::string withoutTrailingSlashes(std::string text) {
    while (text.size() > 1 && text.back() == '/')
        text.pop_back();
    return text;
}

}  // namespace

void PathWatcher::watchPath(const std::string& path, const VXPathObserverRef& observer) {
    Locked lock(mutex_);
    Observers& observers = observersByPath_[withoutTrailingSlashes(path)];
    std::erase_if(observers,
                  [&](const auto& known) { return known.expired() || isObserver(known, observer); });
    observers.push_back(observer);
}

bool PathWatcher::watchPathIsUnique(const std::string& path, const VXPathObserverRef& observer) {
    Locked lock(mutex_);
    return !findAncestor(path, [&](const auto& known) { return isObserver(known, observer); });
}

void PathWatcher::watchQuery(const std::string& query, const VXPathObserverRef& observer,
                             VXPathListRef queryScope, unsigned queryRunMode) {
    Locked lock(mutex_);
    std::erase_if(queries_, [](const auto& known) { return known.observer.expired(); });
    for (QueryRegistration& known : queries_) {
        if (known.query == query && isObserver(known.observer, observer)) {
            known.scope = std::move(queryScope);
            known.runMode = queryRunMode;
            return;
        }
    }
    queries_.push_back({query, observer, std::move(queryScope), queryRunMode});
}

std::optional<std::string> PathWatcher::watchedAncestor(const std::string& path) const {
    Locked lock(mutex_);
    return findAncestor(path, [](const auto& known) { return !known.expired(); });
}

std::vector<PathWatcher::QueryRegistration> PathWatcher::queries() const {
    Locked lock(mutex_);
    std::vector<QueryRegistration> living;
    std::copy_if(queries_.begin(), queries_.end(), std::back_inserter(living),
                 [](const auto& known) { return !known.observer.expired(); });
    return living;
}

template <typename Predicate>
std::optional<std::string> PathWatcher::findAncestor(const std::string& path, Predicate matches) const {
    for (std::string folder = withoutTrailingSlashes(path); !folder.empty();
         folder = path::withoutLastComponent(folder)) {
        const auto found = observersByPath_.find(folder);
        if (found != observersByPath_.end() &&
            std::any_of(found->second.begin(), found->second.end(), matches))
            return folder;
        if (folder == "/")
            break;
    }
    return std::nullopt;
}

}  // namespace vexo
