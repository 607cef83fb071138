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

TEST(CivilTimeTest, AgreesWithTheStandardLibraryOverAllYearsOfTheCycle) {
    for (chrono::sys_days days = chrono::year{-401} / 1 / 1; days < chrono::year{2401} / 1 / 1;
         days += chrono::days(1)) {
        const auto seconds = chrono::seconds(days - referenceDay).count();
        const CivilTime time = civilTimeOf(seconds);
        ASSERT_EQ(time, civil(days)) << seconds;
        ASSERT_EQ(secondsOf(time), seconds);
        ASSERT_EQ(dayOfWeek(time), static_cast<int>(chrono::weekday(days).c_encoding())) << seconds;
        ASSERT_EQ(dateOfDayOfYear(time.year, dayOfYear(time)), time) << seconds;
    }
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
