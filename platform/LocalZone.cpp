#include "platform/LocalZone.h"

#include <array>
#include <atomic>
#include <cstdlib>

#include "platform/Date.h"

namespace platform {

namespace {

constexpr auto secondsTo1970 = static_cast<std::int64_t>(Date::secondsFrom1970ToReferenceDate);

constexpr std::int64_t hour = 3600;
constexpr std::int64_t beyondAnyOffset = 26 * hour;  // farther than any zone is from GMT
// With what is beyond any offset before and after it, such a stretch of time has one change at most: in the
// tz database no two changes are less than 95 hours apart (Freetown in 1939).
constexpr std::int64_t stretch = 20 * hour;

std::int64_t beginOfStretch(std::int64_t seconds) {
    const std::int64_t sinceBegin = seconds % stretch;
    return seconds - sinceBegin - (sinceBegin < 0 ? stretch : 0);
}

std::optional<std::string> environmentTZ() {
    const char* const TZ = std::getenv("TZ");
    return TZ ? std::optional<std::string>(TZ) : std::nullopt;
}

bool clockShows(const ZonedTime& time, std::int64_t civilSeconds) {
    return time.seconds + time.secondsFromGMT == civilSeconds;
}

}  // namespace

// The stretches without a change of the clock that a thread has come to know. Most dates are near others that
// were asked for before: the clips of an event are of some days, and are listed in any order.
class LocalZone::QuietStretches {
  public:
    // How far the zone is from GMT; nil where that isn't known or changes.
    std::optional<int> secondsFromGMT(std::int64_t begin, const LocalZone& zone) const {
        const Stretch& kept = kept_[placeOf(begin)];
        return kept.begin == begin && zone_ == zone ? std::optional(kept.secondsFromGMT) : std::nullopt;
    }

    void keep(std::int64_t begin, const LocalZone& zone, int secondsFromGMT) {
        if (zone_ != zone)
            kept_.fill({});
        zone_ = zone;
        kept_[placeOf(begin)] = {begin, secondsFromGMT};
    }

  private:
    struct Stretch {
        std::int64_t begin = 1;  // where none begins
        int secondsFromGMT = 0;
    };
    static constexpr std::size_t count = 512;  // more than a year

    static std::size_t placeOf(std::int64_t begin) {
        return static_cast<std::size_t>(begin / stretch) % count;
    }

    std::array<Stretch, count> kept_;
    LocalZone zone_;
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
    thread_local QuietStretches quiet;
    const std::int64_t begin = beginOfStretch(civilSeconds);
    if (const auto offset = quiet.secondsFromGMT(begin, *this))
        return {{civilSeconds - *offset, *offset}, std::nullopt};
    const int offsetBefore = secondsFromGMT(begin - beyondAnyOffset);
    const int offsetAfter = secondsFromGMT(begin + stretch + beyondAnyOffset);
    if (offsetBefore == offsetAfter) {
        if (TZ_ == environmentTZ())  // else the offset need not be this zone's
            quiet.keep(begin, *this, offsetBefore);
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
