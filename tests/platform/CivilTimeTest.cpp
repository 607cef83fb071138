#include "platform/CivilTime.h"

#include <gtest/gtest.h>

#include <chrono>
#include <random>

namespace platform {
namespace {

namespace chrono = std::chrono;

constexpr chrono::sys_days referenceDay = chrono::year{2001} / 1 / 1;

CivilTime civil(chrono::sys_seconds time) {
    const auto days = chrono::floor<chrono::days>(time);
    const chrono::year_month_day date(days);
    const chrono::hh_mm_ss clock(time - days);
    return {static_cast<int>(date.year()),
            static_cast<int>(static_cast<unsigned>(date.month())),
            static_cast<int>(static_cast<unsigned>(date.day())),
            static_cast<int>(clock.hours().count()),
            static_cast<int>(clock.minutes().count()),
            static_cast<int>(clock.seconds().count())};
}

constexpr bool isLeapYear(int year) {
    return year % 4 == 0 && (year % 100 != 0 || year % 400 == 0);
}

constexpr CivilTime dayAfter(CivilTime time) {
    constexpr int lengths[] = {31, 28, 31, 30, 31, 30, 31, 31, 30, 31, 30, 31};
    const int length = time.month == 2 && isLeapYear(time.year) ? 29 : lengths[time.month - 1];
    if (++time.day > length) {
        time.day = 1;
        ++time.month;
    }
    return time.month > 12 ? CivilTime{.year = time.year + 1} : time;
}

TEST(CivilTimeTest, DaysFollowEachOtherOverAllYearsOfTheCycle) {
    constexpr std::int64_t secondsPerDay = 86400;
    CivilTime time{.year = -401};
    int weekday = 5;  // as 1 January 1999, six times 400 years later, a Friday
    int dayOfThisYear = 1;
    for (std::int64_t seconds = secondsOf(time); time.year < 2401; seconds += secondsPerDay) {
        ASSERT_EQ(civilTimeOf(seconds), time) << seconds;
        ASSERT_EQ(secondsOf(time), seconds);
        ASSERT_EQ(dayOfWeek(time), weekday) << seconds;
        ASSERT_EQ(dayOfYear(time), dayOfThisYear) << seconds;
        ASSERT_EQ(dateOfDayOfYear(time.year, dayOfThisYear), time) << seconds;
        const CivilTime next = dayAfter(time);
        dayOfThisYear = next.year == time.year ? dayOfThisYear + 1 : 1;
        weekday = (weekday + 1) % 7;
        time = next;
    }
    EXPECT_EQ(secondsOf({}), 0);
}

TEST(CivilTimeTest, AgreesWithTheStandardLibraryAtAnySecond) {
    std::mt19937_64 random(20090329);
    std::uniform_int_distribution<std::int64_t> anySecond(-900'000'000'000, 900'000'000'000);
    for (int i = 0; i < 50'000; ++i) {
        const std::int64_t seconds = anySecond(random);
        ASSERT_EQ(civilTimeOf(seconds), civil(referenceDay + chrono::seconds(seconds))) << seconds;
    }
}

TEST(CivilTimeTest, FarYearsComeBack) {
    std::mt19937_64 random(1);
    std::uniform_int_distribution<std::int64_t> anySecond(-31'000'000'000'000'000, 31'000'000'000'000'000);
    for (int i = 0; i < 50'000; ++i) {
        const std::int64_t seconds = anySecond(random);
        const CivilTime time = civilTimeOf(seconds);
        ASSERT_TRUE(isValid(time)) << seconds;
        ASSERT_EQ(secondsOf(time), seconds);
    }
}

TEST(CivilTimeTest, DaysThatDoNotExistAreNotValid) {
    const auto isValidDate = [](int year, int month, int day) {
        return isValid({.year = year, .month = month, .day = day});
    };
    EXPECT_TRUE(isValidDate(2008, 2, 29));
    EXPECT_TRUE(isValidDate(2000, 2, 29));
    EXPECT_FALSE(isValidDate(2009, 2, 29));
    EXPECT_FALSE(isValidDate(1900, 2, 29));
    EXPECT_FALSE(isValidDate(2008, 4, 31));
    EXPECT_FALSE(isValidDate(2008, 0, 1));
    EXPECT_FALSE(isValidDate(2008, 13, 1));
    EXPECT_FALSE(isValidDate(2008, 1, 0));
}

TEST(CivilTimeTest, TimesThatDoNotExistAreNotValid) {
    EXPECT_TRUE(isValid({.hour = 23, .minute = 59, .second = 60}));
    EXPECT_FALSE(isValid({.hour = 24}));
    EXPECT_FALSE(isValid({.minute = 60}));
    EXPECT_FALSE(isValid({.second = 61}));
    EXPECT_FALSE(isValid({.hour = -1}));
}

TEST(CivilTimeTest, TheLeapSecondIsTheNextMinutesFirst) {
    EXPECT_EQ(secondsOf({.year = 2000, .month = 12, .day = 31, .hour = 23, .minute = 59, .second = 60}), 0);
}

}  // namespace
}  // namespace platform
