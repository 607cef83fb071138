#include "platform/Date.h"

#include <fmt/format.h>

#include <cstdlib>

#include "platform/CivilTime.h"

namespace platform {

namespace {

std::string_view signOf(int year) {
    if (year < 0)
        return "-";
    return year > 9999 ? "+" : "";
}

}  // namespace

int yearInCurrentCalendar(const Date& date, const LocalZone& zone) {
    const auto seconds = wholeSeconds(date.secondsSinceReferenceDate());
    return seconds ? civilTimeOf(*seconds + zone.secondsFromGMT(*seconds)).year : 0;
}

std::string iso8601String(const Date& date) {
    const auto seconds = wholeSeconds(date.secondsSinceReferenceDate());
    if (!seconds)
        return {};
    const CivilTime time = civilTimeOf(*seconds);
    return fmt::format("{}{:04}-{:02}-{:02}T{:02}:{:02}:{:02}Z", signOf(time.year), std::abs(time.year),
                       time.month, time.day, time.hour, time.minute, time.second);
}

}  // namespace platform
