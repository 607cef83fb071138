// The local time zone: what TZ, else the machine's own setting, says at the moment of the call.
// Without TZ, a new setting of the machine's counts within a second.
//
// Callable from any thread, as long as no thread changes the environment meanwhile.
#pragma once

#include <cstdint>
#include <optional>
#include <string>

namespace platform {

// A point in time together with the zone in which it is meant.
struct ZonedTime {
    std::int64_t seconds;  // from 2001-01-01 00:00:00 UTC
    int secondsFromGMT;
    std::string abbreviation;  // "CET"
};

// The zone's offset and abbreviation at a point in time, in seconds from 2001-01-01 00:00:00 UTC.
ZonedTime localZoneAt(std::int64_t seconds);

// The points in time at which a clock shows the same, the earlier first.
struct LocalTimes {
    ZonedTime first;
    std::optional<ZonedTime> second;  // nil but where the clock is put back
};

// The points in time at which the clock shows `civilSeconds` (from 2001-01-01 00:00:00 on that clock). Where
// the clock is put forward past them, it is the one at which a clock that had not been put forward would show
// them.
LocalTimes timesOfLocalClock(std::int64_t civilSeconds);

}  // namespace platform
