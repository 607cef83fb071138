// Those who want to hear of something, each for as long as its owner lives. Thread-safe.
#pragma once

#include <functional>
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
        Locked lock(mutex_);
        observers_.emplace_back(std::move(owner), std::move(observer));
    }

    // Calls each observer on this thread, outside the lock: it may add others and be called several times at
    // once.
    void notify(const Arguments&... arguments) VX_EXCLUDES(mutex_) {
        for (const Observer& observer : living())
            observer(arguments...);
    }

  private:
    std::vector<Observer> living() VX_EXCLUDES(mutex_) {
        Locked lock(mutex_);
        std::erase_if(observers_, [](const auto& entry) { return entry.first.expired(); });
        std::vector<Observer> living;
        for (const auto& [owner, observer] : observers_)
            living.push_back(observer);
        return living;
    }

    Mutex mutex_;
    std::vector<std::pair<std::weak_ptr<const void>, Observer>> observers_ VX_GUARDED_BY(mutex_);
};

}  // namespace platform
