// The local time zone: what TZ, else the machine's own setting, says. Without TZ, a new setting of the
// machine's counts within a second.
//
// Callable from any thread, as long as no thread changes the environment meanwhile.
#pragma once

#include <cstdint>
#include <ctime>
#include <optional>
#include <string>

namespace platform {

// A point in time together with the offset of the zone in which it is meant.
struct ZonedTime {
    std::int64_t seconds;  // from 2001-01-01 00:00:00 UTC
    int secondsFromGMT;
};

// The points in time at which a clock shows the same, the earlier first.
struct LocalTimes {
    ZonedTime first;
    std::optional<ZonedTime> second;  // nil but where the clock is put back
};

// To look at the setting costs more than to look at a time by it, so one zone does for dates that are read
// one after another. When the setting changes, zones made before may go by the old one or by the new.
class LocalZone {
  public:
    // By what TZ is at this moment, and without it by the machine's setting.
    static LocalZone current();

    // Points in time are seconds from 2001-01-01 00:00:00 UTC.
    int secondsFromGMT(std::int64_t seconds) const;
    std::string abbreviation(std::int64_t seconds) const;  // "CET"

    // The points in time at which the clock shows `civilSeconds` (from 2001-01-01 00:00:00 on that clock).
    // Where the clock is put forward past them, it is the one at which a clock that had not been put forward
    // would show them.
    LocalTimes timesOfClock(std::int64_t civilSeconds) const;

  private:
    class QuietStretches;

    LocalZone() = default;
    bool operator==(const LocalZone&) const = default;

    // localtime_r, which has looked at the setting where that is needed; nil for years that no int can hold.
    std::optional<std::tm> fieldsAt(std::int64_t seconds) const;
    ZonedTime zonedTime(std::int64_t seconds) const;

    std::optional<std::string> TZ_;
    // Without TZ, when the zone was made: the machine's setting is looked at once a second.
    std::time_t second_ = -1;
};

}  // namespace platform
