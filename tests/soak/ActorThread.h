// An actor on a thread of its own, from when it is made until it is told to leave.
#pragma once

#include <chrono>
#include <condition_variable>
#include <memory>
#include <string>
#include <thread>

#include "platform/ThreadSafety.h"
#include "tests/soak/Actor.h"

namespace soak {

class ActorThread {
  public:
    // Between two acts it rests, up to twice as long as `meanRest`.
    ActorThread(std::unique_ptr<Actor> actor, std::chrono::microseconds meanRest, unsigned seed);
    ~ActorThread();

    // Waits for the act in progress, then has the actor leave. Later calls do nothing.
    void end();

    std::string name() const { return actor_->name(); }
    Tally::Counts counts() const { return actor_->counts(); }
    // What the actor raised, empty for nothing. Requires: it has ended.
    const std::string& failure() const { return failure_; }

  private:
    void actUntilOver();
    bool rest() VX_EXCLUDES(mutex_);

    const std::unique_ptr<Actor> actor_;
    const std::chrono::microseconds meanRest_;
    testing_support::RandomSource chance_;  // the thread's own
    std::string failure_;                   // the thread's own, until it has ended

    platform::Mutex mutex_;
    std::condition_variable_any changed_;
    bool isOver_ VX_GUARDED_BY(mutex_) = false;

    std::thread thread_;
};

}  // namespace soak
