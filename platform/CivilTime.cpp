#include "platform/CivilTime.h"

#include <algorithm>
#include <cmath>

namespace platform {

namespace {

constexpr std::int64_t secondsPerDay = 86400;
constexpr std::int64_t daysPerEra = 146097;  // an era is the 400 years after which the calendar repeats
constexpr std::int64_t yearsPerEra = 400;
constexpr double billionYears = 1e9 * (static_cast<double>(daysPerEra) / yearsPerEra) * secondsPerDay;

struct Division {
    std::int64_t quotient;
    std::int64_t remainder;  // never negative
};

constexpr Division divide(std::int64_t dividend, std::int64_t divisor) {
    const std::int64_t remainder = (dividend % divisor + divisor) % divisor;
    return {(dividend - remainder) / divisor, remainder};
}

constexpr bool isLeapYear(std::int64_t year) {
    return year % 4 == 0 && (year % 100 != 0 || year % 400 == 0);
}

constexpr int daysInMonth(std::int64_t year, int month) {
    constexpr int days[] = {31, 28, 31, 30, 31, 30, 31, 31, 30, 31, 30, 31};
    return days[month - 1] + (month == 2 && isLeapYear(year) ? 1 : 0);
}

constexpr int daysBeforeMonth(std::int64_t year, int month) {
    constexpr int days[] = {0, 31, 59, 90, 120, 151, 181, 212, 243, 273, 304, 334};
    return days[month - 1] + (month > 2 && isLeapYear(year) ? 1 : 0);
}

// Days from the start of an era (1 January of year 0, 400, 2000, …) to that of one of its years.
constexpr std::int64_t daysBeforeYearOfEra(std::int64_t year) {
    return year == 0 ? 0 : year * 365 + (year - 1) / 4 - (year - 1) / 100 + 1;
}

constexpr std::int64_t daysBeforeYear(std::int64_t year) {
    const Division era = divide(year, yearsPerEra);
    return era.quotient * daysPerEra + daysBeforeYearOfEra(era.remainder);
}

constexpr std::int64_t referenceDay = daysBeforeYear(2001);

struct DayOfYear {
    std::int64_t year;
    int day;  // from 0
};

DayOfYear dayOfYearOf(std::int64_t day) {
    const Division era = divide(day, daysPerEra);
    // As if no year were a leap year, which is right or, in the last days of a year, one too many.
    std::int64_t year = era.remainder / 365;
    if (daysBeforeYearOfEra(year) > era.remainder)
        --year;
    return {era.quotient * yearsPerEra + year, static_cast<int>(era.remainder - daysBeforeYearOfEra(year))};
}

std::int64_t dayOf(const CivilTime& time) {
    return daysBeforeYear(time.year) + daysBeforeMonth(time.year, time.month) + time.day - 1;
}

void setDate(CivilTime& time, DayOfYear date) {
    time.year = static_cast<int>(date.year);
    time.month = date.day / 32 + 1;  // or the one after it
    while (time.month < 12 && daysBeforeMonth(date.year, time.month + 1) <= date.day)
        ++time.month;
    time.day = date.day - daysBeforeMonth(date.year, time.month) + 1;
}

bool isWithin(int value, int lowest, int highest) {
    return lowest <= value && value <= highest;
}

}  // namespace

bool isValid(const CivilTime& time) {
    return isWithin(time.month, 1, 12) && isWithin(time.day, 1, daysInMonth(time.year, time.month)) &&
           isWithin(time.hour, 0, 23) && isWithin(time.minute, 0, 59) && isWithin(time.second, 0, 60);
}

std::int64_t secondsOf(const CivilTime& time) {
    return (dayOf(time) - referenceDay) * secondsPerDay + time.hour * 3600 + time.minute * 60 + time.second;
}

CivilTime civilTimeOf(std::int64_t seconds) {
    const Division day = divide(seconds, secondsPerDay);
    CivilTime time;
    setDate(time, dayOfYearOf(referenceDay + day.quotient));
    time.hour = static_cast<int>(day.remainder / 3600);
    time.minute = static_cast<int>(day.remainder / 60 % 60);
    time.second = static_cast<int>(day.remainder % 60);
    return time;
}

int dayOfYear(const CivilTime& time) {
    return daysBeforeMonth(time.year, time.month) + time.day;
}

int dayOfWeek(const CivilTime& time) {
    constexpr std::int64_t weekdayOfDayZero = 6;  // 1 January of year 0 is a Saturday
    return static_cast<int>(divide(dayOf(time) + weekdayOfDayZero, 7).remainder);
}

CivilTime dateOfDayOfYear(int year, int day) {
    CivilTime time;
    setDate(time, dayOfYearOf(daysBeforeYear(year) + day - 1));
    return time;
}

std::optional<std::int64_t> wholeSeconds(double seconds) {
    if (std::isnan(seconds))
        return std::nullopt;
    return static_cast<std::int64_t>(std::floor(std::clamp(seconds, -billionYears, billionYears)));
}

}  // namespace platform
