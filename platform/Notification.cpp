#include "platform/Notification.h"

#include <exception>
#include <iterator>

namespace platform {

void NotificationCenter::addObserver(std::weak_ptr<const void> observer, std::string_view name,
                                     Handler handler) {
    // Freed after the lock is left: what a handler holds may do anything when it goes.
    std::vector<Registration> forgotten;
    Locked lock(mutex_);
    forgotten = takeExpired();
    registrations_.push_back({std::move(observer), std::string(name), std::move(handler)});
}

// All hear of it before what the first of them raised goes on.
void NotificationCenter::post(const Notification& notification) {
    std::exception_ptr failure;
    for (const Registration& registration : registrationsFor(notification.name)) {
        // Asked only now: a handler before may have ended this observer's life.
        const auto alive = registration.observer.lock();
        try {
            if (alive)
                registration.handler(notification);
        } catch (...) {
            failure = failure ? failure : std::current_exception();
        }
    }
    if (failure)
        std::rethrow_exception(failure);
}

std::vector<NotificationCenter::Registration> NotificationCenter::registrationsFor(const std::string& name) {
    std::vector<Registration> forgotten;
    std::vector<Registration> found;
    Locked lock(mutex_);
    forgotten = takeExpired();
    std::copy_if(registrations_.begin(), registrations_.end(), std::back_inserter(found),
                 [&](const Registration& registration) { return registration.name == name; });
    return found;
}

std::vector<NotificationCenter::Registration> NotificationCenter::takeExpired() {
    const auto firstExpired = std::stable_partition(
        registrations_.begin(), registrations_.end(),
        [](const Registration& registration) { return !registration.observer.expired(); });
    std::vector<Registration> expired(std::make_move_iterator(firstExpired),
                                      std::make_move_iterator(registrations_.end()));
    registrations_.erase(firstExpired, registrations_.end());
    return expired;
}

}  // namespace platform
