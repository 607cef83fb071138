// The metadata queries that observers have registered, each kept up to date (LiveQuery says how).
//
// What happens in the file system comes in through `changed`, from whoever watches it; which folders to watch
// goes out through the surroundings. Thread-safe. Holds no observer.
#pragma once

#include <memory>
#include <string>
#include <vector>

#include "framework/queries/LiveQuery.h"
#include "platform/ThreadSafety.h"

namespace vexo {

platform::DateRef systemTime();

class LiveQueries {
  public:
    // The functions are called until the dispatcher has closed, also when the object is gone.
    explicit LiveQueries(LiveQuerySurroundings surroundings) : surroundings_(std::move(surroundings)) {}
    ~LiveQueries() { close(); }
    LiveQueries(const LiveQueries&) = delete;
    LiveQueries& operator=(const LiveQueries&) = delete;

    // As VXPathWatcher::watchQuery. All run modes are the one that gathers in silence and then reports. A
    // query that makes no sense is a warning, and never reports anything. The metadata is that of the host's
    // services.
    void watchQuery(const std::string& query, const VXPathObserverRef& observer, VXPathListRef queryScope,
                    unsigned queryRunMode) VX_EXCLUDES(mutex_);
    // Something happened in these folders, at any depth, or to these files. What happens together costs least
    // in one call.
    void changed(const std::vector<std::string>& paths) VX_EXCLUDES(mutex_);
    // Ends all work. A report that is on its way may still arrive.
    void close() VX_EXCLUDES(mutex_);

  private:
    using LiveQueryRef = std::shared_ptr<LiveQuery>;

    // The one registration of a query and observer, made where there is none yet; nil once closed.
    LiveQueryRef registered(const std::string& query, QueryExpression expression,
                            const VXPathObserverRef& observer, VXPathListRef queryScope) VX_EXCLUDES(mutex_);
    // The queries of living observers; the others are forgotten.
    std::vector<LiveQueryRef> livingQueries() VX_EXCLUDES(mutex_);

    const LiveQuerySurroundings surroundings_;

    platform::Mutex mutex_;
    std::vector<LiveQueryRef> queries_ VX_GUARDED_BY(mutex_);
    bool isClosed_ VX_GUARDED_BY(mutex_) = false;
};

}  // namespace vexo
