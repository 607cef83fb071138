// What a clock and a calendar on the wall show, without a zone. The calendar is the Gregorian one, also for
// the time before its introduction; the year before year 1 is year 0.
//
// Pure arithmetic; callable from any thread.
#pragma once

#include <cstdint>
#include <optional>

namespace platform {

struct CivilTime {
    int year = 2001;
    int month = 1;   // 1 to 12
    int day = 1;     // 1 to 31
    int hour = 0;    // 0 to 23
    int minute = 0;  // 0 to 59
    int second = 0;  // 0 to 60; 60 is the leap second and counts as the next minute's first

    bool operator==(const CivilTime&) const = default;
};

// False for a day or a time that does not exist, such as 30 February.
bool isValid(const CivilTime& time);

// Seconds from 2001-01-01 00:00:00 on the same clock, and back.
// Requires: `time` is valid; `seconds` is no farther away than a billion years and a few days.
std::int64_t secondsOf(const CivilTime& time);
CivilTime civilTimeOf(std::int64_t seconds);

int dayOfYear(const CivilTime& time);          // 1 to 366
int dayOfWeek(const CivilTime& time);          // 0 (Sunday) to 6
CivilTime dateOfDayOfYear(int year, int day);  // midnight of day 1 to 366 of a year

// `seconds` rounded down. What is more than a billion years away counts as that far, and as nil what is no
// number, so that no date can overflow the arithmetic.
std::optional<std::int64_t> wholeSeconds(double seconds);

}  // namespace platform
