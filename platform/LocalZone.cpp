#include "platform/LocalZone.h"

#include <atomic>
#include <cstdlib>

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

std::optional<std::string> environmentTZ() {
    const char* const TZ = std::getenv("TZ");
    return TZ ? std::optional<std::string>(TZ) : std::nullopt;
}

bool clockShows(const ZonedTime& time, std::int64_t civilSeconds) {
    return time.seconds + time.secondsFromGMT == civilSeconds;
}

}  // namespace

// A time without changes of the clock around the last date that a thread asked for. Most dates are near the
// one before them: the clips of an event are of one day.
class LocalZone::QuietTime {
  public:
    // nil where the clock may change.
    std::optional<ZonedTime> timeOfClock(std::int64_t civilSeconds, const LocalZone& zone) const {
        const bool isNear = firstCivil_ <= civilSeconds && civilSeconds <= lastCivil_;
        if (!isNear || zone_ != zone)
            return std::nullopt;
        return ZonedTime{civilSeconds - secondsFromGMT_, secondsFromGMT_};
    }

    void set(std::int64_t civilSeconds, const LocalZone& zone, int secondsFromGMT) {
        firstCivil_ = civilSeconds - nearby;
        lastCivil_ = civilSeconds + nearby;
        zone_ = zone;
        secondsFromGMT_ = secondsFromGMT;
    }

  private:
    std::int64_t firstCivil_ = 0;
    std::int64_t lastCivil_ = -1;
    LocalZone zone_;
    int secondsFromGMT_ = 0;
};

LocalZone LocalZone::current() {
    LocalZone zone;
    zone.TZ_ = environmentTZ();
    if (!zone.TZ_) {
        timespec now{};
        clock_gettime(CLOCK_MONOTONIC_COARSE, &now);
        zone.second_ = now.tv_sec;
    }
    return zone;
}

int LocalZone::secondsFromGMT(std::int64_t seconds) const {
    const auto fields = fieldsAt(seconds);
    return fields ? static_cast<int>(fields->tm_gmtoff) : 0;
}

std::string LocalZone::abbreviation(std::int64_t seconds) const {
    const auto fields = fieldsAt(seconds);
    if (!fields)
        return "UTC";
    return fields->tm_zone ? fields->tm_zone : "";
}

// What holds before and after holds in between, too.
LocalTimes LocalZone::timesOfClock(std::int64_t civilSeconds) const {
    thread_local QuietTime quiet;
    if (const auto time = quiet.timeOfClock(civilSeconds, *this))
        return {*time, std::nullopt};
    const int offsetBefore = secondsFromGMT(civilSeconds - aroundAnyChange);
    const int offsetAfter = secondsFromGMT(civilSeconds + aroundAnyChange);
    if (offsetBefore == offsetAfter) {
        if (TZ_ == environmentTZ())  // else the offset need not be this zone's
            quiet.set(civilSeconds, *this, offsetBefore);
        return {{civilSeconds - offsetBefore, offsetBefore}, std::nullopt};
    }
    const ZonedTime byOffsetBefore = zonedTime(civilSeconds - offsetBefore);
    const ZonedTime byOffsetAfter = zonedTime(civilSeconds - offsetAfter);
    const bool isShownAfter = clockShows(byOffsetAfter, civilSeconds);
    if (!clockShows(byOffsetBefore, civilSeconds))
        return {isShownAfter ? byOffsetAfter : byOffsetBefore, std::nullopt};
    const bool isShownTwice = isShownAfter && byOffsetAfter.seconds != byOffsetBefore.seconds;
    return {byOffsetBefore, isShownTwice ? std::optional(byOffsetAfter) : std::nullopt};
}

// localtime_r need not notice that the setting has changed.
std::optional<std::tm> LocalZone::fieldsAt(std::int64_t seconds) const {
    static std::atomic<std::time_t> lastLookWithoutTZ = -1;  // -1 when the last look found TZ
    if (TZ_ || lastLookWithoutTZ < second_) {
        tzset();
        lastLookWithoutTZ = environmentTZ() ? -1 : second_;
    }
    const std::time_t time = seconds + secondsTo1970;
    std::tm fields{};
    return localtime_r(&time, &fields) ? std::optional(fields) : std::nullopt;
}

ZonedTime LocalZone::zonedTime(std::int64_t seconds) const {
    return {seconds, secondsFromGMT(seconds)};
}

}  // namespace platform
