// Remembers who watches which paths and queries.
#pragma once

#include <map>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "host/VXPathWatcher.h"
#include "platform/ThreadSafety.h"

namespace vexo {

class PathWatcher final : public VXPathWatcher {
  public:
    void watchPath(const std::string& path, const VXPathObserverRef& observer) override VX_EXCLUDES(mutex_);
    bool watchPathIsUnique(const std::string& path, const VXPathObserverRef& observer) override
        VX_EXCLUDES(mutex_);
    void watchQuery(const std::string& query, const VXPathObserverRef& observer, VXPathListRef queryScope,
                    unsigned queryRunMode) override VX_EXCLUDES(mutex_);

    // The path through which `path` is watched for any living observer: itself or a folder above it; nil when
    // nobody watches it.
    std::optional<std::string> watchedAncestor(const std::string& path) const VX_EXCLUDES(mutex_);

    struct QueryRegistration {
        std::string query;
        std::weak_ptr<VXPathObserver> observer;
        VXPathListRef scope;
        unsigned runMode;
    };
    // The queries of living observers, in the order of registration.
    std::vector<QueryRegistration> queries() const VX_EXCLUDES(mutex_);

  private:
    using Observers = std::vector<std::weak_ptr<VXPathObserver>>;

    template <typename Predicate>
    std::optional<std::string> findAncestor(const std::string& path, Predicate matches) const
        VX_REQUIRES(mutex_);

    mutable platform::Mutex mutex_;
    std::map<std::string, Observers> observersByPath_ VX_GUARDED_BY(mutex_);
    std::vector<QueryRegistration> queries_ VX_GUARDED_BY(mutex_);
};

}  // namespace vexo
