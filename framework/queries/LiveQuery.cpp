#include "framework/queries/LiveQuery.h"

#include <utility>

#include "framework/GuardedWork.h"
#include "platform/Dispatcher.h"
#include "platform/Services.h"

namespace vexo {
namespace {

using platform::Locked;

// Beyond so many paths, looking at everything costs no more, and a flood of them takes no memory.
constexpr std::size_t mostChangedPaths = 1000;

platform::Value arrayOf(const std::vector<std::string>& paths) {
    return platform::Array(paths.begin(), paths.end());
}

platform::Dictionary userInfoOf(const QueryChange& change) {
    return {{std::string(kMDQueryUpdateAddedItems), arrayOf(change.added)},
            {std::string(kMDQueryUpdateChangedItems), arrayOf(change.changed)},
            {std::string(kMDQueryUpdateRemovedItems), arrayOf(change.removed)}};
}

}  // namespace

LiveQuery::LiveQuery(std::string text, std::unique_ptr<MetadataQuery> query,
                     const VXPathObserverRef& observer, LiveQuerySurroundings surroundings)
    : text_(std::move(text)),
      query_(std::move(query)),
      observer_(observer),
      surroundings_(std::move(surroundings)) {}

bool LiveQuery::isOf(const std::string& text, const VXPathObserverRef& observer) const {
    return text_ == text && !observer_.owner_before(observer) && !observer.owner_before(observer_);
}

void LiveQuery::update(const std::vector<std::string>& changedPaths) {
    {
        Locked lock(mutex_);
        changedPaths_.insert(changedPaths.begin(), changedPaths.end());
        if (changedPaths_.size() > mostChangedPaths)
            changedPaths_ = {"/"};
        isDue_ = true;
        if (std::exchange(isWorking_, true))
            return;
    }
    platform::services().dispatcher.asyncInBackground([self = shared_from_this()] { self->work(); });
}

void LiveQuery::work() {
    while (const auto changedPaths = takeChangedPaths())
        runGuarded([&] { lookAt(*changedPaths); });
}

std::optional<std::vector<std::string>> LiveQuery::takeChangedPaths() {
    Locked lock(mutex_);
    isWorking_ = std::exchange(isDue_, false);
    if (!isWorking_)
        return std::nullopt;
    const auto taken = std::exchange(changedPaths_, {});
    return std::vector<std::string>(taken.begin(), taken.end());
}

void LiveQuery::lookAt(const std::vector<std::string>& changedPaths) {
    // Before they are looked at, so that no change falls between.
    watchNewFolders();
    const platform::DateRef now = surroundings_.now();
    if (!hasGathered_) {
        hasGathered_ = query_->gather(*now);
        return;
    }
    const QueryChange change = query_->update(changedPaths, *now);
    if (!change.isEmpty())
        report(change);
}

void LiveQuery::watchNewFolders() {
    const VXPathListRef scope = query_->scope();
    for (const std::string& folder : scope ? scope->snapshot() : std::vector<std::string>()) {
        if (watchedFolders_.insert(folder).second)
            surroundings_.watchFolder(folder);
    }
}

void LiveQuery::report(const QueryChange& change) {
    const VXPathObserverRef observer = observer_.lock();
    if (!observer)
        return;
    const platform::Notification notification{std::string(platform::kMDQueryDidUpdateNotification), this,
                                              userInfoOf(change)};
    runGuarded([&] { observer->watchedQueryChanged(notification, query_->scope()); });
}

}  // namespace vexo
