// Somebody who does one thing after another, by chance: with the files of a library, or with a host.
//
// The chance is seeded: with the same seed an actor makes the same choices, as long as it finds the same.
// What it finds depends on how the acts of several actors fall between each other.
#pragma once

#include <cstddef>
#include <cstdint>
#include <map>
#include <string>

#include "platform/ThreadSafety.h"
#include "tests/pathwatcher/RandomSource.h"

namespace soak {

// How often something was done, by its name. Thread-safe.
class Tally {
  public:
    using Counts = std::map<std::string, std::uint64_t>;

    void count(const std::string& deed) VX_EXCLUDES(mutex_) {
        platform::Locked lock(mutex_);
        ++counts_[deed];
    }
    Counts counts() const VX_EXCLUDES(mutex_) {
        platform::Locked lock(mutex_);
        return counts_;
    }

  private:
    mutable platform::Mutex mutex_;
    Counts counts_ VX_GUARDED_BY(mutex_);
};

class Actor {
  public:
    explicit Actor(unsigned seed) : chance(seed) {}
    virtual ~Actor() = default;
    Actor(const Actor&) = delete;
    Actor& operator=(const Actor&) = delete;

    virtual std::string name() const = 0;
    // Does one thing. What cannot be done is left alone, as people do.
    virtual void act() = 0;
    // The last act: undoes what a fresh load could not be compared with.
    virtual void leave() {}

    Tally::Counts counts() const { return tally_.counts(); }

  protected:
    // Answers whether it could be done.
    template <typename Self>
    struct Deed {
        const char* name;
        bool (Self::*perform)();
    };
    template <typename Self, std::size_t count>
    void doOneOf(Self& self, const Deed<Self> (&deeds)[count]) {
        const Deed<Self>& deed = deeds[chance.below(count)];
        if ((self.*deed.perform)())
            tally_.count(deed.name);
    }
    void count(const std::string& deed) { tally_.count(deed); }

    testing_support::RandomSource chance;

  private:
    Tally tally_;
};

}  // namespace soak
