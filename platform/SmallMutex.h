// A lock of four bytes, for objects of which there are hundreds of thousands: ten times as many fit beside
// one another as with platform::Mutex. Everything else uses that.
//
// Taking it twice on one thread is an error. Threads that find it held sleep.
#pragma once

#include <atomic>
#include <cstdint>

#include "platform/ThreadSafety.h"

namespace platform {

class VX_ATTRIBUTE(capability("mutex")) SmallMutex {
  public:
    SmallMutex() = default;
    SmallMutex(const SmallMutex&) = delete;
    SmallMutex& operator=(const SmallMutex&) = delete;

    void lock() VX_ATTRIBUTE(acquire_capability()) {
        State expected = free;
        if (!state_.compare_exchange_strong(expected, held))
            lockWaiting();
    }

    void unlock() VX_ATTRIBUTE(release_capability()) {
        if (state_.exchange(free) == awaited)
            state_.notify_one();
    }

  private:
    using State = std::int32_t;  // the type that the kernel waits on
    static constexpr State free = 0;
    static constexpr State held = 1;
    static constexpr State awaited = 2;  // held, and somebody may sleep until it isn't

    // Who had to wait can't know that it was the last one, so it takes the lock as awaited.
    void lockWaiting() {
        while (state_.exchange(awaited) != free)
            state_.wait(awaited);
    }

    std::atomic<State> state_ = free;
};

}  // namespace platform
