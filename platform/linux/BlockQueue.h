// Blocks in the order in which they are due; those due at the same time in the order in which they came.
// Not thread-safe: whoever owns a queue guards it.
#pragma once

#include <algorithm>
#include <chrono>
#include <map>
#include <optional>
#include <utility>

#include "platform/Dispatcher.h"

namespace platform {

class BlockQueue {
  public:
    // Monotonic: setting the machine's clock moves no block.
    using Clock = std::chrono::steady_clock;
    using Time = Clock::time_point;

    // When a block is due that was handed over now. Delays are cut to what the clock can count.
    static Time dueAfter(Dispatcher::Delay delay) {
        constexpr Dispatcher::Delay longest = std::chrono::hours(24 * 365 * 100);
        return Clock::now() + std::clamp(delay, Dispatcher::Delay::zero(), longest);
    }

    void add(Time due, Dispatcher::Block block) { blocks_.emplace(due, std::move(block)); }

    bool empty() const { return blocks_.empty(); }
    Time nextDue() const { return blocks_.begin()->first; }  // Requires: not empty

    std::optional<Dispatcher::Block> takeDue(Time now) {
        if (blocks_.empty() || nextDue() > now)
            return std::nullopt;
        return std::move(blocks_.extract(blocks_.begin()).mapped());
    }

  private:
    std::multimap<Time, Dispatcher::Block> blocks_;
};

}  // namespace platform
