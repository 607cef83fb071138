#include "framework/pathwatcher/PathWatcher.h"

#include <algorithm>
#include <utility>

#include "framework/pathwatcher/SystemSeams.h"
#include "platform/Dispatcher.h"
#include "platform/Services.h"

namespace vexo {

using platform::Locked;

namespace {

constexpr double normalPriority = 0.5;

bool isObserver(const std::weak_ptr<VXPathObserver>& registered, const VXPathObserverRef& observer) {
    return !registered.owner_before(observer) && !observer.owner_before(registered);
}

void stepUntilClosed(ChangeFollower& follower) {
    while (follower.step(ChangeFollower::forever)) {
    }
}

}  // namespace

PathWatcher::PathWatcher()
    : PathWatcher([](const auto& wake) { return systemSeams(wake, usualPollInterval); }) {}

PathWatcher::PathWatcher(SeamMaker seamMaker)
    : seamMaker_(std::move(seamMaker)),
      registrations_(std::make_shared<WatchRegistrations>()),
      delivery_(std::make_shared<ChangeDelivery>()) {}

PathWatcher::~PathWatcher() {
    close();
}

void PathWatcher::watchPath(const std::string& path, const VXPathObserverRef& observer) {
    registerSubscriber(path, Subscriber(observer));
}

bool PathWatcher::watchPathIsUnique(const std::string& path, const VXPathObserverRef& observer) {
    return !registrations_->covers(path, Subscriber(observer));
}

void PathWatcher::listen(const std::string& path, const std::shared_ptr<const ChangeListener>& listener) {
    registerSubscriber(path, Subscriber(listener));
}

void PathWatcher::registerSubscriber(const std::string& path, const Subscriber& subscriber) {
    registrations_->add(path, subscriber);
    if (const auto follows = follower())
        follows->watch(WatchRegistrations::registeredForm(path));
}

void PathWatcher::watchQuery(const std::string& query, const VXPathObserverRef& observer,
                             VXPathListRef queryScope, unsigned queryRunMode) {
    rememberQuery(query, observer, queryScope, queryRunMode);
    if (const auto live = liveQueries())
        live->watchQuery(query, observer, std::move(queryScope), queryRunMode);
}

void PathWatcher::rememberQuery(const std::string& query, const VXPathObserverRef& observer,
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

void PathWatcher::start() {
    begin(Following::onThread);
}

std::shared_ptr<ChangeFollower> PathWatcher::startByHand() {
    begin(Following::byHand);
    return follower();
}

void PathWatcher::begin(Following following) {
    {
        Locked lock(mutex_);
        following_ = following;
        makeLiveQueries();
    }
    for (const std::string& path : registrations_->paths())
        if (const auto follows = follower())
            follows->watch(path);
    for (QueryRegistration& query : queries())
        if (const auto observer = query.observer.lock())
            liveQueries()->watchQuery(query.query, observer, std::move(query.scope), query.runMode);
}

void PathWatcher::makeLiveQueries() {
    liveQueries_ = std::make_shared<LiveQueries>(LiveQuerySurroundings{
        [this](const std::string& folder) { listen(folder, queryListener_); }, systemTime});
    queryListener_ = std::make_shared<const ChangeListener>(
        [queries = std::weak_ptr(liveQueries_)](const std::vector<std::string>& changedPaths) {
            if (const auto living = queries.lock())
                living->changed(changedPaths);
        });
}

std::shared_ptr<LiveQueries> PathWatcher::liveQueries() const {
    Locked lock(mutex_);
    return liveQueries_;
}

std::shared_ptr<ChangeFollower> PathWatcher::follower() {
    Locked lock(mutex_);
    if (following_ != Following::no && !follower_)
        makeFollower();
    return follower_;
}

void PathWatcher::makeFollower() {
    const auto wake = std::make_shared<const WakeSignal>();
    follower_ =
        std::make_shared<ChangeFollower>(seamMaker_(wake), wake, registrations_, delivery_, warningHandler_);
    if (following_ == Following::onThread)
        platform::services().dispatcher.detachThread("vexo-watcher", normalPriority,
                                                     [follower = follower_] { stepUntilClosed(*follower); });
}

void PathWatcher::close() {
    delivery_->close();
    if (const auto live = liveQueries())
        live->close();
    Locked lock(mutex_);
    following_ = Following::no;
    if (const auto closing = std::exchange(follower_, nullptr))
        closing->close();
}

void PathWatcher::setWarningHandler(WarningHandler handler) {
    Locked lock(mutex_);
    warningHandler_ = std::move(handler);
}

std::optional<std::string> PathWatcher::watchedAncestor(const std::string& path) const {
    return registrations_->registeredAncestor(path);
}

WatchState PathWatcher::watchStateOf(const std::string& path) const {
    const auto registered = registrations_->registeredAncestor(path);
    if (!registered)
        return {WatchState::How::none, "nobody watches it"};
    std::shared_ptr<ChangeFollower> follower;
    {
        Locked lock(mutex_);
        follower = follower_;
    }
    if (!follower)
        return {WatchState::How::none, "this program does not follow changes"};
    return follower->stateOf(*registered, WatchRegistrations::registeredForm(path));
}

std::vector<PathWatcher::QueryRegistration> PathWatcher::queries() const {
    Locked lock(mutex_);
    std::vector<QueryRegistration> living;
    std::copy_if(queries_.begin(), queries_.end(), std::back_inserter(living),
                 [](const auto& known) { return !known.observer.expired(); });
    return living;
}

}  // namespace vexo
