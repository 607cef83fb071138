#include "framework/pathwatcher/ChangeFollower.h"

#include <poll.h>

#include <algorithm>
#include <climits>
#include <utility>

namespace vexo {

using platform::Locked;
using std::chrono::milliseconds;

namespace {

// Where something happens, more follows at once. Taken in together it costs a fraction.
constexpr milliseconds gatheringTime{5};

// Finds nothing more once `closed` says so: a walk through a large tree, of which nobody wants to hear any
// more, ends with the folders that it knows.
class AccessUntilClosed final : public FolderAccess {
  public:
    AccessUntilClosed(std::unique_ptr<FolderAccess> access, const std::atomic<bool>& closed)
        : access_(std::move(access)), closed_(closed) {}

    PathEntry look(const std::string& path) const override { return access_->look(path); }
    FolderListing list(const std::string& folder) const override {
        return closed_ ? FolderListing{} : access_->list(folder);
    }

  private:
    const std::unique_ptr<FolderAccess> access_;
    const std::atomic<bool>& closed_;
};

WatchSeams endingWith(const std::atomic<bool>& closed, WatchSeams seams) {
    seams.folders = std::make_unique<AccessUntilClosed>(std::move(seams.folders), closed);
    return seams;
}

int pollTimeout(milliseconds time) {
    if (time == ChangeFollower::forever)
        return -1;
    return static_cast<int>(std::clamp<milliseconds::rep>(time.count(), 0, INT_MAX));
}

}  // namespace

ChangeFollower::ChangeFollower(WatchSeams seams, std::shared_ptr<const WakeSignal> wake,
                               std::shared_ptr<const WatchRegistrations> registrations,
                               std::shared_ptr<ChangeDelivery> delivery, WarningHandler warn)
    : wake_(std::move(wake)),
      registrations_(std::move(registrations)),
      delivery_(std::move(delivery)),
      warn_(std::move(warn)),
      paths_(endingWith(closed_, std::move(seams))) {}

void ChangeFollower::watch(const std::string& path) {
    if (!path.starts_with('/'))
        return;
    Locked lock(mutex_);
    paths_.add(path);
    wake_->raise();  // there may be a queue to wait for now, and a change to tell of
}

bool ChangeFollower::step(milliseconds atMost) {
    const News news = wait(atMost);
    if (closed_)
        return false;
    handOut(takeIn(news));
    return !closed_;
}

bool ChangeFollower::keepsChanges() const {
    Locked lock(mutex_);
    return !paths_.burst().isEmpty();
}

void ChangeFollower::close() {
    closed_ = true;
    wake_->raise();
    Locked lock(mutex_);
    paths_.close();
}

ChangeFollower::News ChangeFollower::wait(milliseconds atMost) {
    pollfd requests[] = {{wake_->descriptor(), POLLIN, 0}, {-1, POLLIN, 0}, {-1, POLLPRI, 0}};
    {
        Locked lock(mutex_);
        requests[1].fd = paths_.seams().events->descriptor();
        requests[2].fd = paths_.seams().mounts->descriptor();
    }
    const int timeout = pollTimeout(std::min(atMost, untilDue()));
    if (closed_ || poll(requests, std::size(requests), timeout) <= 0)
        return {};
    if (requests[0].revents != 0)
        wake_->clear();
    else if (requests[1].revents != 0)
        letEventsGather();
    return {requests[1].revents != 0, (requests[2].revents & (POLLPRI | POLLERR)) != 0};
}

milliseconds ChangeFollower::untilDue() const {
    Locked lock(mutex_);
    const auto due = paths_.burst().due();
    return due ? std::chrono::ceil<milliseconds>(*due - Clock::now()) : forever;
}

// Ends early when somebody wants something.
void ChangeFollower::letEventsGather() const {
    pollfd request{wake_->descriptor(), POLLIN, 0};
    poll(&request, 1, pollTimeout(gatheringTime));
}

ChangeBurst::Changes ChangeFollower::takeIn(const News& news) {
    Locked lock(mutex_);
    if (news.mounts)
        paths_.mountsChanged();
    if (news.events)
        paths_.takeEvents();
    paths_.takePollReports();
    ChangeBurst& burst = paths_.burst();
    burst.timeIs(Clock::now());
    return burst.isDue(Clock::now()) ? burst.take() : ChangeBurst::Changes();
}

// The last subscriber gets the paths themselves; mostly there is but one.
void ChangeFollower::handOut(ChangeBurst::Changes changes) {
    for (auto& [watchedPath, changedPaths] : changes) {
        std::vector<Subscriber> subscribers = registrations_->subscribersOf(watchedPath);
        if (subscribers.empty()) {
            forgetUnwanted(watchedPath);
            continue;
        }
        const Subscriber last = std::move(subscribers.back());
        subscribers.pop_back();
        for (const Subscriber& subscriber : subscribers)
            delivery_->add(subscriber, changedPaths);
        delivery_->add(last, std::move(changedPaths));
    }
    delivery_->begin();
    for (const std::string& warning : takeWarnings())
        warn_(warning);
}

// Asked again under the lock, because it may have been registered anew meanwhile.
void ChangeFollower::forgetUnwanted(const std::string& path) {
    Locked lock(mutex_);
    if (registrations_->subscribersOf(path).empty())
        paths_.remove(path);
}

std::vector<std::string> ChangeFollower::takeWarnings() {
    Locked lock(mutex_);
    return paths_.takeWarnings();
}

WatchState ChangeFollower::stateOf(const std::string& watchedPath, const std::string& path) const {
    Locked lock(mutex_);
    if (!paths_.contains(watchedPath))
        return {WatchState::How::none, "it is no absolute path"};
    return paths_.stateOf(watchedPath, path);
}

std::vector<std::string> ChangeFollower::watchedFolders() const {
    Locked lock(mutex_);
    return paths_.watchedFolders();
}

}  // namespace vexo
