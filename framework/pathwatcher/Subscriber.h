// Somebody who hears of changes: an observer of a plug-in's, or a listener of the framework's own. Held
// weakly. Thread-safe.
#pragma once

#include <functional>
#include <memory>
#include <string>
#include <vector>

#include "host/VXPathWatcher.h"

namespace vexo {

// Hears of all changes of a burst at once, in byte order.
using ChangeListener = std::function<void(const std::vector<std::string>& changedPaths)>;

class Subscriber {
  public:
    explicit Subscriber(const VXPathObserverRef& observer) : owner_(observer), observer_(observer) {}
    explicit Subscriber(const std::shared_ptr<const ChangeListener>& listener)
        : owner_(listener), listener_(listener) {}

    bool isGone() const { return owner_.expired(); }
    bool operator==(const Subscriber& other) const { return !(*this < other) && !(other < *this); }
    bool operator<(const Subscriber& other) const { return owner_.owner_before(other.owner_); }

    // Tells it, unless it is gone. What it raises becomes a warning. An observer hears of one path after the
    // other, with no flags.
    void hear(const std::vector<std::string>& changedPaths) const;

  private:
    std::weak_ptr<const void> owner_;
    // One of them is nil.
    std::weak_ptr<VXPathObserver> observer_;
    std::weak_ptr<const ChangeListener> listener_;
};

}  // namespace vexo
