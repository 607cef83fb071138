#include "platform/CivilTime.h"

#include <algorithm>
#include <chrono>
#include <cmath>

namespace platform {

namespace {

namespace chrono = std::chrono;

constexpr std::int64_t secondsPerDay = 86400;

// The standard library's years have 16 bits. So dates are looked up in one era, the 400 years after which the
// calendar repeats, days of the week included.
constexpr chrono::year firstYearOfEra{2000};
constexpr chrono::sys_days firstDayOfEra = firstYearOfEra / 1 / 1;
constexpr std::int64_t yearsPerEra = 400;
constexpr std::int64_t daysPerEra =
    (chrono::sys_days((firstYearOfEra + chrono::years(yearsPerEra)) / 1 / 1) - firstDayOfEra).count();
constexpr double billionYears = 1e9 * (static_cast<double>(daysPerEra) / yearsPerEra) * secondsPerDay;
constexpr std::int64_t referenceDay = (chrono::sys_days(chrono::year{2001} / 1 / 1) - firstDayOfEra).count();

struct Division {
    std::int64_t quotient;
    std::int64_t remainder;  // never negative
};

constexpr Division divide(std::int64_t dividend, std::int64_t divisor) {
    const Division division{dividend / divisor, dividend % divisor};
    return division.remainder < 0 ? Division{division.quotient - 1, division.remainder + divisor} : division;
}

// A date of the era in place of one of any year.
struct EraDate {
    std::int64_t eras;  // from the one that is looked up to the one that is meant
    chrono::year_month_day date;
};

EraDate eraDateOf(int year, int month, int day) {
    const Division era = divide(year - std::int64_t{static_cast<int>(firstYearOfEra)}, yearsPerEra);
    return {era.quotient, (firstYearOfEra + chrono::years(era.remainder)) /
                              chrono::month(static_cast<unsigned>(month)) /
                              chrono::day(static_cast<unsigned>(day))};
}

// From the era's first day.
std::int64_t dayOf(const EraDate& date) {
    return date.eras * daysPerEra + (chrono::sys_days(date.date) - firstDayOfEra).count();
}

std::int64_t dayOf(const CivilTime& time) {
    return dayOf(eraDateOf(time.year, time.month, time.day));
}

void setDate(CivilTime& time, std::int64_t day) {
    const Division era = divide(day, daysPerEra);
    const chrono::year_month_day date(firstDayOfEra + chrono::days(era.remainder));
    time.year = static_cast<int>(static_cast<int>(date.year()) + era.quotient * yearsPerEra);
    time.month = static_cast<int>(static_cast<unsigned>(date.month()));
    time.day = static_cast<int>(static_cast<unsigned>(date.day()));
}

bool isWithin(int value, int lowest, int highest) {
    return lowest <= value && value <= highest;
}

}  // namespace

bool isValid(const CivilTime& time) {
    return isWithin(time.month, 1, 12) && isWithin(time.day, 1, 31) &&
           eraDateOf(time.year, time.month, time.day).date.ok() && isWithin(time.hour, 0, 23) &&
           isWithin(time.minute, 0, 59) && isWithin(time.second, 0, 60);
}

std::int64_t secondsOf(const CivilTime& time) {
    return (dayOf(time) - referenceDay) * secondsPerDay + time.hour * 3600 + time.minute * 60 + time.second;
}

CivilTime civilTimeOf(std::int64_t seconds) {
    const Division day = divide(seconds, secondsPerDay);
    CivilTime time;
    setDate(time, referenceDay + day.quotient);
    time.hour = static_cast<int>(day.remainder / 3600);
    time.minute = static_cast<int>(day.remainder / 60 % 60);
    time.second = static_cast<int>(day.remainder % 60);
    return time;
}

int dayOfYear(const CivilTime& time) {
    return static_cast<int>(dayOf(time) - dayOf(eraDateOf(time.year, 1, 1))) + 1;
}

int dayOfWeek(const CivilTime& time) {
    const EraDate date = eraDateOf(time.year, time.month, time.day);
    return static_cast<int>(chrono::weekday(chrono::sys_days(date.date)).c_encoding());
}

CivilTime dateOfDayOfYear(int year, int day) {
    CivilTime time;
    setDate(time, dayOf(eraDateOf(year, 1, 1)) + day - 1);
    return time;
}

std::optional<std::int64_t> wholeSeconds(double seconds) {
    if (std::isnan(seconds))
        return std::nullopt;
    return static_cast<std::int64_t>(std::floor(std::clamp(seconds, -billionYears, billionYears)));
}

}  // namespace platform
