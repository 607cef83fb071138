#include "platform/LocalZone.h"

#include <atomic>
#include <cstdlib>
#include <ctime>

#include "platform/Date.h"

namespace platform {

namespace {

constexpr auto secondsTo1970 = static_cast<std::int64_t>(Date::secondsFrom1970ToReferenceDate);

// Farther than any zone is from GMT, and nearer than any two changes of a zone are to each other.
constexpr std::int64_t beyondAnyOffset = 26 * 3600;

// By the zone that was last looked up.
ZonedTime zoneAt(std::int64_t seconds) {
    const std::time_t time = seconds + secondsTo1970;
    std::tm fields{};
    if (!localtime_r(&time, &fields))
        return {seconds, 0, "UTC"};  // only for years that no int can hold
    return {seconds, static_cast<int>(fields.tm_gmtoff), fields.tm_zone ? fields.tm_zone : ""};
}

// localtime_r need not notice that the zone has changed. Without TZ each look is a call to the system, so
// many dates in one second look once.
void lookUpZone() {
    static std::atomic<std::time_t> lastLookWithoutTZ = -1;
    timespec now{-1, 0};
    if (!std::getenv("TZ"))
        clock_gettime(CLOCK_MONOTONIC_COARSE, &now);
    if (now.tv_sec < 0 || lastLookWithoutTZ != now.tv_sec)
        tzset();
    lastLookWithoutTZ = now.tv_sec;
}

bool clockShows(const ZonedTime& time, std::int64_t civilSeconds) {
    return time.seconds + time.secondsFromGMT == civilSeconds;
}

}  // namespace

ZonedTime localZoneAt(std::int64_t seconds) {
    lookUpZone();
    return zoneAt(seconds);
}

std::vector<ZonedTime> timesOfLocalClock(std::int64_t civilSeconds) {
    lookUpZone();
    const int offsetBefore = zoneAt(civilSeconds - beyondAnyOffset).secondsFromGMT;
    const int offsetAfter = zoneAt(civilSeconds + beyondAnyOffset).secondsFromGMT;
    const ZonedTime byOffsetBefore = zoneAt(civilSeconds - offsetBefore);

    std::vector<ZonedTime> times;
    if (clockShows(byOffsetBefore, civilSeconds))
        times.push_back(byOffsetBefore);
    if (offsetAfter != offsetBefore) {
        const ZonedTime byOffsetAfter = zoneAt(civilSeconds - offsetAfter);
        if (clockShows(byOffsetAfter, civilSeconds))
            times.push_back(byOffsetAfter);
    }
    if (times.empty())
        times.push_back(byOffsetBefore);
    return times;
}

}  // namespace platform
