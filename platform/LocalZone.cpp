#include "platform/LocalZone.h"

#include <atomic>
#include <cstdlib>
#include <ctime>
#include <utility>

#include "platform/Date.h"

namespace platform {

namespace {

constexpr auto secondsTo1970 = static_cast<std::int64_t>(Date::secondsFrom1970ToReferenceDate);

// Farther than any zone is from GMT; in twice that time no zone changes more than once.
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

bool isSameZone(const ZonedTime& time, const ZonedTime& other) {
    return time.secondsFromGMT == other.secondsFromGMT && time.abbreviation == other.abbreviation;
}

bool clockShows(const ZonedTime& time, std::int64_t civilSeconds) {
    return time.seconds + time.secondsFromGMT == civilSeconds;
}

}  // namespace

ZonedTime localZoneAt(std::int64_t seconds) {
    lookUpZone();
    return zoneAt(seconds);
}

// What holds before and after holds in between, too.
LocalTimes timesOfLocalClock(std::int64_t civilSeconds) {
    lookUpZone();
    ZonedTime before = zoneAt(civilSeconds - beyondAnyOffset);
    const ZonedTime after = zoneAt(civilSeconds + beyondAnyOffset);
    if (isSameZone(before, after)) {
        before.seconds = civilSeconds - before.secondsFromGMT;
        return {std::move(before), std::nullopt};
    }
    const ZonedTime byOffsetBefore = zoneAt(civilSeconds - before.secondsFromGMT);
    const ZonedTime byOffsetAfter = zoneAt(civilSeconds - after.secondsFromGMT);
    const bool isShownAfter = clockShows(byOffsetAfter, civilSeconds);
    if (!clockShows(byOffsetBefore, civilSeconds))
        return {isShownAfter ? byOffsetAfter : byOffsetBefore, std::nullopt};
    const bool isShownTwice = isShownAfter && byOffsetAfter.seconds != byOffsetBefore.seconds;
    return {byOffsetBefore, isShownTwice ? std::optional(byOffsetAfter) : std::nullopt};
}

}  // namespace platform
