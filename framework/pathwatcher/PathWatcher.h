// Watches paths in the file system, for plug-ins and for the framework itself. Thread-safe.
//
// Registrations are only remembered until `start`, so a program that reads the libraries once pays nothing.
// From then on each path is watched, whatever is there and whatever becomes of it, and observers hear, a
// moment after it happened (ChangeBurst::length) and on any thread:
// - when something appeared, vanished, was renamed or got other attributes: the folder in which it happened;
// - when the content of a file changed: the file, or its folder where the content tells of other files;
// - of anything inside a package: the package, except for the content of a movie, which is reported itself;
// - when the watched path itself appeared, vanished or leads elsewhere, when its events were lost, and when
//   it is a file that changed: the watched path.
// Paths below a registered one are named by it, through whatever links it leads. Links below it are not
// entered. Where the kernel sends no events, folders are polled; what changed is then the folder.
//
// Out of sight of the kernel, and so of this: what is written through a memory mapping until the file is
// closed, and what is written to a file by another of its hard links in an unwatched folder.
#pragma once

#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "framework/pathwatcher/ChangeFollower.h"
#include "framework/pathwatcher/Subscriber.h"
#include "framework/pathwatcher/WatchState.h"
#include "framework/queries/LiveQueries.h"
#include "host/VXPathWatcher.h"
#include "platform/ThreadSafety.h"

namespace vexo {

class PathWatcher final : public VXPathWatcher {
  public:
    using WarningHandler = ChangeFollower::WarningHandler;
    // Makes what stands for the world; it raises `wake` when the polling has news.
    using SeamMaker = std::function<WatchSeams(const std::shared_ptr<const WakeSignal>& wake)>;

    PathWatcher();
    explicit PathWatcher(SeamMaker seamMaker);
    ~PathWatcher() override;

    void watchPath(const std::string& path, const VXPathObserverRef& observer) override VX_EXCLUDES(mutex_);
    bool watchPathIsUnique(const std::string& path, const VXPathObserverRef& observer) override;
    void watchQuery(const std::string& query, const VXPathObserverRef& observer, VXPathListRef queryScope,
                    unsigned queryRunMode) override VX_EXCLUDES(mutex_);

    // For the framework's own purposes: the listener hears what an observer of the path would, a whole burst
    // in one call. The registration ends when the listener goes.
    void listen(const std::string& path, const std::shared_ptr<const ChangeListener>& listener)
        VX_EXCLUDES(mutex_);

    // Begins to follow changes, on a thread that is started with the first path, and to keep queries up to
    // date. Called once. Requires: the platform's and the host's services are in place until the watcher is
    // closed.
    void start() VX_EXCLUDES(mutex_);
    // Ends the thread, the queries and all reports; a report in progress goes on. Requires: called before the
    // dispatcher goes, which waits for the thread, while the watcher itself goes after it.
    void close() VX_EXCLUDES(mutex_);
    // Hears of what keeps changes from being followed at once, each text once. To be set before the start;
    // called on any thread.
    void setWarningHandler(WarningHandler handler) VX_EXCLUDES(mutex_);

    // The path through which `path` is watched for anybody living: itself or a folder above it; nil when
    // nobody watches it.
    std::optional<std::string> watchedAncestor(const std::string& path) const;
    WatchState watchStateOf(const std::string& path) const VX_EXCLUDES(mutex_);

    // The start without a thread: the caller takes steps of the follower itself.
    std::shared_ptr<ChangeFollower> startByHand() VX_EXCLUDES(mutex_);

    struct QueryRegistration {
        std::string query;
        std::weak_ptr<VXPathObserver> observer;
        VXPathListRef scope;
        unsigned runMode;
    };
    // The queries of living observers, in the order of registration.
    std::vector<QueryRegistration> queries() const VX_EXCLUDES(mutex_);

  private:
    enum class Following { no, onThread, byHand };

    void rememberQuery(const std::string& query, const VXPathObserverRef& observer, VXPathListRef queryScope,
                       unsigned queryRunMode) VX_EXCLUDES(mutex_);
    void makeLiveQueries() VX_REQUIRES(mutex_);
    std::shared_ptr<LiveQueries> liveQueries() const VX_EXCLUDES(mutex_);  // nil while none are followed
    void begin(Following following) VX_EXCLUDES(mutex_);
    void registerSubscriber(const std::string& path, const Subscriber& subscriber) VX_EXCLUDES(mutex_);
    // Made when it is first wanted; nil while changes are not followed.
    std::shared_ptr<ChangeFollower> follower() VX_EXCLUDES(mutex_);
    void makeFollower() VX_REQUIRES(mutex_);

    const SeamMaker seamMaker_;
    const std::shared_ptr<WatchRegistrations> registrations_;
    const std::shared_ptr<ChangeDelivery> delivery_;

    mutable platform::Mutex mutex_;
    Following following_ VX_GUARDED_BY(mutex_) = Following::no;
    std::shared_ptr<ChangeFollower> follower_ VX_GUARDED_BY(mutex_);
    WarningHandler warningHandler_ VX_GUARDED_BY(mutex_) = [](const std::string&) {};
    std::vector<QueryRegistration> queries_ VX_GUARDED_BY(mutex_);
    std::shared_ptr<LiveQueries> liveQueries_ VX_GUARDED_BY(mutex_);

    std::shared_ptr<const ChangeListener> queryListener_;  // constant once the queries are followed
};

}  // namespace vexo
