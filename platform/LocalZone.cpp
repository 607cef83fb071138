#include "platform/LocalZone.h"

#include <atomic>
#include <cstdlib>
#include <ctime>
#include <utility>

#include "platform/Date.h"

namespace platform {

namespace {

constexpr auto secondsTo1970 = static_cast<std::int64_t>(Date::secondsFrom1970ToReferenceDate);

constexpr std::int64_t hour = 3600;
constexpr std::int64_t beyondAnyOffset = 26 * hour;  // farther than any zone is from GMT
constexpr std::int64_t nearby = 10 * hour;
// In twice that time no zone changes more than once: in the tz database no two changes are less than 95 hours
// apart (Freetown in 1939).
constexpr std::int64_t aroundAnyChange = beyondAnyOffset + nearby;

// By the zone that was last looked up.
ZonedTime zoneAt(std::int64_t seconds) {
    const std::time_t time = seconds + secondsTo1970;
    std::tm fields{};
    if (!localtime_r(&time, &fields))
        return {seconds, 0, "UTC"};  // only for years that no int can hold
    return {seconds, static_cast<int>(fields.tm_gmtoff), fields.tm_zone ? fields.tm_zone : ""};
}

// What says the zone: TZ; without it the machine's own setting, as it was in one second, because a look at it
// is a call to the system.
struct ZoneSetting {
    const char* TZ;
    std::time_t second;

    static ZoneSetting current() {
        timespec now{-1, 0};
        const char* const TZ = std::getenv("TZ");
        if (!TZ)
            clock_gettime(CLOCK_MONOTONIC_COARSE, &now);
        return {TZ, now.tv_sec};
    }
};

// localtime_r need not notice that the zone has changed. What threads share here is not written where nothing
// has.
void lookUp(const ZoneSetting& setting) {
    static std::atomic<std::time_t> lastLookWithoutTZ = -1;
    const bool hasLooked = lastLookWithoutTZ == setting.second;
    if (setting.TZ || !hasLooked)
        tzset();
    if (!hasLooked)
        lastLookWithoutTZ = setting.second;
}

// A time without changes of the zone around the last date that a thread asked for. Most dates are near the
// one before them: the clips of an event are of one day.
class QuietTime {
  public:
    // nil where the clock may change.
    std::optional<ZonedTime> timeOfClock(std::int64_t civilSeconds, const ZoneSetting& setting) const {
        const bool isNear = firstCivil_ <= civilSeconds && civilSeconds <= lastCivil_;
        if (!isNear || second_ != setting.second || (setting.TZ && TZ_ != setting.TZ))
            return std::nullopt;
        return ZonedTime{civilSeconds - zone_.secondsFromGMT, zone_.secondsFromGMT, zone_.abbreviation};
    }

    void set(std::int64_t civilSeconds, const ZoneSetting& setting, ZonedTime zone) {
        firstCivil_ = civilSeconds - nearby;
        lastCivil_ = civilSeconds + nearby;
        TZ_ = setting.TZ ? setting.TZ : "";
        second_ = setting.second;
        zone_ = std::move(zone);
    }

  private:
    std::int64_t firstCivil_ = 0;
    std::int64_t lastCivil_ = -1;
    std::string TZ_;
    std::time_t second_ = -1;  // what ZoneSetting has with TZ
    ZonedTime zone_{};
};

bool isSameZone(const ZonedTime& time, const ZonedTime& other) {
    return time.secondsFromGMT == other.secondsFromGMT && time.abbreviation == other.abbreviation;
}

bool clockShows(const ZonedTime& time, std::int64_t civilSeconds) {
    return time.seconds + time.secondsFromGMT == civilSeconds;
}

}  // namespace

ZonedTime localZoneAt(std::int64_t seconds) {
    lookUp(ZoneSetting::current());
    return zoneAt(seconds);
}

// What holds before and after holds in between, too.
LocalTimes timesOfLocalClock(std::int64_t civilSeconds) {
    thread_local QuietTime quiet;
    const ZoneSetting setting = ZoneSetting::current();
    if (auto time = quiet.timeOfClock(civilSeconds, setting))
        return {*std::move(time), std::nullopt};
    lookUp(setting);
    ZonedTime before = zoneAt(civilSeconds - aroundAnyChange);
    const ZonedTime after = zoneAt(civilSeconds + aroundAnyChange);
    if (isSameZone(before, after)) {
        before.seconds = civilSeconds - before.secondsFromGMT;
        quiet.set(civilSeconds, setting, before);
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
