// One query of one observer, kept up to date: gathers in silence first, then tells the observer of each
// change.
//
// The work is done by the background queue, at most one block at a time; what arrives meanwhile is put
// together for the next round. The observer is called in the background, outside all locks; what it raises
// becomes a warning. Thread-safe.
#pragma once

#include <functional>
#include <memory>
#include <optional>
#include <set>
#include <string>
#include <string_view>
#include <vector>

#include "framework/queries/MetadataQuery.h"
#include "host/VXPathWatcher.h"

namespace vexo {

// In the user information of each kMDQueryDidUpdateNotification: arrays of real paths, sorted, which may be
// empty.
inline constexpr std::string_view kMDQueryUpdateAddedItems = "kMDQueryUpdateAddedItems";
inline constexpr std::string_view kMDQueryUpdateChangedItems = "kMDQueryUpdateChangedItems";
inline constexpr std::string_view kMDQueryUpdateRemovedItems = "kMDQueryUpdateRemovedItems";

// What live queries need of others. Both are called in the background.
struct LiveQuerySurroundings {
    // Asks for the changes below a folder, which may be missing.
    std::function<void(const std::string& folder)> watchFolder;
    std::function<platform::DateRef()> now;
};

class LiveQuery : public std::enable_shared_from_this<LiveQuery> {
  public:
    LiveQuery(std::string text, std::unique_ptr<MetadataQuery> query, const VXPathObserverRef& observer,
              LiveQuerySurroundings surroundings);

    bool isOf(const std::string& text, const VXPathObserverRef& observer) const;
    bool hasObserver() const { return !observer_.expired(); }

    void setScope(VXPathListRef scope) { query_->setScope(std::move(scope)); }
    // Has everything that may have changed looked at: what the scope has more or fewer than before, and what
    // lies at and below the paths. The first call makes it gather.
    void update(const std::vector<std::string>& changedPaths) VX_EXCLUDES(mutex_);
    // Ends the work in progress at its next item, and does no more.
    void close() { query_->cancel(); }

  private:
    void work() VX_EXCLUDES(mutex_);
    // nil when nothing is to be done any more.
    std::optional<std::vector<std::string>> takeChangedPaths() VX_EXCLUDES(mutex_);
    void lookAt(const std::vector<std::string>& changedPaths);
    void watchNewFolders();
    void report(const QueryChange& change);

    const std::string text_;
    const std::unique_ptr<MetadataQuery> query_;
    const std::weak_ptr<VXPathObserver> observer_;
    const LiveQuerySurroundings surroundings_;

    // The working block's own.
    std::set<std::string> watchedFolders_;
    bool hasGathered_ = false;

    platform::Mutex mutex_;
    std::set<std::string> changedPaths_ VX_GUARDED_BY(mutex_);
    bool isDue_ VX_GUARDED_BY(mutex_) = false;
    bool isWorking_ VX_GUARDED_BY(mutex_) = false;
};

}  // namespace vexo
