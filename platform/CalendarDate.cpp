#include "platform/CalendarDate.h"

#include <cmath>
#include <cstdlib>

#include "platform/CalendarParser.h"
#include "platform/CalendarPrinter.h"
#include "platform/CivilTime.h"

namespace platform {

namespace {

constexpr int millisecondsPerSecond = 1000;

std::string firstSetVariable(std::initializer_list<const char*> names) {
    for (const char* name : names) {
        const char* value = std::getenv(name);
        if (value && *value)
            return value;
    }
    return {};
}

bool isGMT(std::string_view zoneAbbreviation) {
    return zoneAbbreviation == "GMT" || zoneAbbreviation == "UTC" || zoneAbbreviation == "Z";
}

// nil for a zone abbreviation that means nothing at that time.
std::optional<ZonedTime> zonedTime(std::int64_t civilSeconds, const ParsedFields& fields,
                                   const LocalZone& zone) {
    if (fields.secondsFromGMT)
        return ZonedTime{civilSeconds - *fields.secondsFromGMT, *fields.secondsFromGMT};
    const LocalTimes times = zone.timesOfClock(civilSeconds);
    if (fields.zoneAbbreviation.empty() || zone.abbreviation(times.first.seconds) == fields.zoneAbbreviation)
        return times.first;
    if (times.second && zone.abbreviation(times.second->seconds) == fields.zoneAbbreviation)
        return times.second;
    return isGMT(fields.zoneAbbreviation) ? std::optional(ZonedTime{civilSeconds, 0}) : std::nullopt;
}

// The nearest, except that they never make a full second.
int millisecondsOf(double seconds) {
    const double fraction = std::isfinite(seconds) ? seconds - std::floor(seconds) : 0;
    return std::min(millisecondsPerSecond - 1,
                    static_cast<int>(std::lround(fraction * millisecondsPerSecond)));
}

}  // namespace

Locale Locale::current() {
    const std::string value = firstSetVariable({"LC_ALL", "LC_TIME", "LANG"});
    const std::string name = value.substr(0, value.find_first_of(".@"));
    const bool isPlain = name.empty() || name == "C" || name == "POSIX";
    return Locale{isPlain ? "en_US_POSIX" : name};
}

CalendarDate::CalendarDate(double secondsSinceReferenceDate, int secondsFromGMT)
    : Date(secondsSinceReferenceDate), secondsFromGMT_(secondsFromGMT) {}

CalendarDateRef CalendarDate::dateWithString(std::string_view string, const CalendarFormat& calendarFormat,
                                             const LocalZone& zone) {
    const auto fields = CalendarParser(string).parse(calendarFormat);
    const auto civilTime = fields ? fields->civilTime() : std::nullopt;
    const auto zoned = civilTime ? zonedTime(secondsOf(*civilTime), *fields, zone) : std::nullopt;
    if (!zoned)
        return nullptr;
    const double fraction = static_cast<double>(fields->millisecond) / millisecondsPerSecond;
    return std::make_shared<CalendarDate>(static_cast<double>(zoned->seconds) + fraction,
                                          zoned->secondsFromGMT);
}

std::string CalendarDate::descriptionWithCalendarFormat(const CalendarFormat& format,
                                                        const Locale& locale) const {
    const auto seconds = wholeSeconds(secondsSinceReferenceDate());
    if (!seconds)
        return {};
    return CalendarPrinter(*seconds, millisecondsOf(secondsSinceReferenceDate()), secondsFromGMT_, locale)
        .print(format);
}

int CalendarDate::yearOfCommonEra() const {
    const auto seconds = wholeSeconds(secondsSinceReferenceDate());
    return seconds ? civilTimeOf(*seconds + secondsFromGMT_).year : 0;
}

}  // namespace platform
