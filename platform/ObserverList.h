// Those who want to hear of something, each for as long as its owner lives. Thread-safe.
#pragma once

#include <algorithm>
#include <functional>
#include <iterator>
#include <memory>
#include <utility>
#include <vector>

#include "platform/ThreadSafety.h"

namespace platform {

template <typename... Arguments>
class ObserverList {
  public:
    using Observer = std::function<void(const Arguments&...)>;

    void add(std::weak_ptr<const void> owner, Observer observer) VX_EXCLUDES(mutex_) {
        // Freed after the lock is left: what an observer holds may do anything when it goes.
        Entries forgotten;
        Locked lock(mutex_);
        forgotten = takeExpired();
        observers_.emplace_back(std::move(owner), std::move(observer));
    }

    // Calls each observer on this thread, outside the lock: it may add others and be called several times at
    // once. Its owner lives until it has returned.
    void notify(const Arguments&... arguments) VX_EXCLUDES(mutex_) {
        for (const auto& [owner, observer] : living()) {
            if (const auto alive = owner.lock())
                observer(arguments...);
        }
    }

  private:
    using Entries = std::vector<std::pair<std::weak_ptr<const void>, Observer>>;

    Entries living() VX_EXCLUDES(mutex_) {
        Entries forgotten;
        Locked lock(mutex_);
        forgotten = takeExpired();
        return observers_;
    }

    Entries takeExpired() VX_REQUIRES(mutex_) {
        const auto firstExpired = std::stable_partition(
            observers_.begin(), observers_.end(), [](const auto& entry) { return !entry.first.expired(); });
        Entries expired(std::make_move_iterator(firstExpired), std::make_move_iterator(observers_.end()));
        observers_.erase(firstExpired, observers_.end());
        return expired;
    }

    Mutex mutex_;
    Entries observers_ VX_GUARDED_BY(mutex_);
};

}  // namespace platform
