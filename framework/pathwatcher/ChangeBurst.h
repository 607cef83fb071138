// What was seen to change since observers were last told, by the watched path that it was seen through. A
// path that changed again and again may be there several times.
//
// Changes come in crowds: one saved project is dozens of events. So they are kept for a moment, counted from
// the first, and then given out together. Knows no clock: the time is told.
#pragma once

#include <chrono>
#include <cstdint>
#include <map>
#include <optional>
#include <string>
#include <vector>

namespace vexo {

class ChangeBurst {
  public:
    using Time = std::chrono::steady_clock::time_point;
    using Paths = std::vector<std::string>;
    using Changes = std::map<std::string, Paths>;

    static constexpr std::chrono::milliseconds length{50};

    void add(const std::string& watchedPath, std::string changedPath);
    // To be told after changes were added: those that had no time yet happened now.
    void timeIs(Time now);

    // A number that no other burst has.
    std::uint64_t number() const { return number_; }
    bool isEmpty() const { return changes_.empty(); }
    // nil for an empty burst.
    std::optional<Time> due() const { return due_; }
    bool isDue(Time now) const { return due_ && *due_ <= now; }

    // Hands out the changes and begins the next burst.
    Changes take();

  private:
    std::uint64_t number_ = 1;
    Changes changes_;
    Changes::value_type* latest_ = nullptr;  // whose watched path most likely comes again
    std::optional<Time> due_;
};

}  // namespace vexo
