#include "framework/queries/QueryTime.h"

#include "platform/CivilTime.h"
#include "platform/LocalZone.h"

namespace vexo {
namespace {

using platform::CivilTime;

constexpr std::int64_t secondsPerDay = 86400;
constexpr int monthsPerYear = 12;

CivilTime midnightOf(const platform::Date& now) {
    const std::int64_t seconds = platform::wholeSeconds(now.secondsSinceReferenceDate()).value_or(0);
    CivilTime time = platform::civilTimeOf(seconds + platform::LocalZone::current().secondsFromGMT(seconds));
    time.hour = time.minute = time.second = 0;
    return time;
}

CivilTime addingDays(const CivilTime& time, std::int64_t days) {
    return platform::civilTimeOf(platform::secondsOf(time) + days * secondsPerDay);
}

int daysSinceMonday(const CivilTime& time) {
    return (platform::dayOfWeek(time) + 6) % 7;
}

CivilTime monthFrom(const CivilTime& time, int months) {
    const std::int64_t month = std::int64_t{time.year} * monthsPerYear + time.month - 1 + months;
    const std::int64_t year = (month < 0 ? month - (monthsPerYear - 1) : month) / monthsPerYear;
    CivilTime first;
    first.year = static_cast<int>(year);
    first.month = static_cast<int>(month - year * monthsPerYear) + 1;
    return first;
}

CivilTime yearFrom(const CivilTime& time, int years) {
    CivilTime first;
    first.year = time.year + years;
    return first;
}

CivilTime beginning(QueryTimeUnit unit, int amount, const CivilTime& today) {
    switch (unit) {
        case QueryTimeUnit::yesterday:
            return addingDays(today, std::int64_t{amount} - 1);
        case QueryTimeUnit::thisWeek:
            return addingDays(today, std::int64_t{amount} * 7 - daysSinceMonday(today));
        case QueryTimeUnit::thisMonth:
            return monthFrom(today, amount);
        case QueryTimeUnit::thisYear:
            return yearFrom(today, amount);
        default:
            return addingDays(today, amount);
    }
}

}  // namespace

double QueryTime::secondsSince1970(const platform::Date& now) const {
    if (unit == QueryTimeUnit::fixed)
        return amount;
    if (unit == QueryTimeUnit::now)
        return now.secondsSince1970() + amount;
    const CivilTime time = beginning(unit, static_cast<int>(amount), midnightOf(now));
    const auto seconds = platform::LocalZone::current().timesOfClock(platform::secondsOf(time)).first.seconds;
    return static_cast<double>(seconds) + platform::Date::secondsFrom1970ToReferenceDate;
}

}  // namespace vexo
