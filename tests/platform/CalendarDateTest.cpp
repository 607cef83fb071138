#include "platform/CalendarDate.h"

#include <gtest/gtest.h>

#include <array>
#include <cmath>
#include <ctime>
#include <fstream>
#include <limits>
#include <random>
#include <thread>

#include "tests/support/TemporaryFolder.h"

namespace platform {

namespace {

using testing_support::ScopedEnvironment;

constexpr std::string_view clipDateFormat = "%Y-%m-%d %H;%M;%S";
// Zones as rules, which need no zone files.
constexpr const char* berlin = "CET-1CEST,M3.5.0,M10.5.0/3";
constexpr const char* newYork = "EST5EDT,M3.2.0,M11.1.0";
constexpr const char* lordHowe = "<+1030>-10:30<+11>-11,M10.1.0,M4.1.0";  // moves by half an hour
constexpr const char* kolkata = "IST-5:30";

const Locale english{"en_US_POSIX"};

// A zone and a locale of the user's.
class CalendarDateTest : public testing::Test {
  protected:
    void useZone(const char* zone) { setenv("TZ", zone, 1); }
    void useLocale(const char* name) { setenv("LC_ALL", name, 1); }

    // What the text means in UTC, "nil" when it does not match.
    static std::string read(std::string_view text, std::string_view format = clipDateFormat) {
        const CalendarDateRef date = CalendarDate::dateWithString(text, format);
        return date ? iso8601String(*date) : "nil";
    }
    static std::string print(double seconds, std::string_view format, const Locale& locale = english,
                             int secondsFromGMT = 0) {
        return CalendarDate(seconds, secondsFromGMT).descriptionWithCalendarFormat(format, locale);
    }

  private:
    const ScopedEnvironment zone_{"TZ", "UTC0"};
    const ScopedEnvironment locale_{"LC_ALL", "C"};
};

// 2009-03-05 17:08:09.25 UTC, a Thursday.
constexpr double thursday = 257965689.25;

TEST_F(CalendarDateTest, ReadsAClipDateInTheLocalZone) {
    EXPECT_EQ(read("2008-12-31 23;59;59"), "2008-12-31T23:59:59Z");
    useZone(berlin);
    EXPECT_EQ(read("2008-12-31 23;59;59"), "2008-12-31T22:59:59Z");
    EXPECT_EQ(read("2008-07-31 23;59;59"), "2008-07-31T21:59:59Z");
    useZone(newYork);
    EXPECT_EQ(read("2008-12-31 23;59;59"), "2009-01-01T04:59:59Z");
    useZone(kolkata);
    EXPECT_EQ(read("2008-12-31 23;59;59"), "2008-12-31T18:29:59Z");
}

TEST_F(CalendarDateTest, ADateKeepsTheOffsetItWasReadWith) {
    useZone(newYork);
    const CalendarDateRef date = CalendarDate::dateWithString("2008-12-31 23;59;59", clipDateFormat);
    useZone(berlin);
    EXPECT_EQ(date->secondsFromGMT(), -5 * 3600);
    EXPECT_EQ(date->yearOfCommonEra(), 2008);
    EXPECT_EQ(yearInCurrentCalendar(*date), 2009);
    EXPECT_EQ(date->descriptionWithCalendarFormat(clipDateFormat, english), "2008-12-31 23;59;59");
}

TEST_F(CalendarDateTest, TheWholeTextMustMatch) {
    EXPECT_EQ(read(""), "nil");
    EXPECT_EQ(read("2008-12-31 23;59;5"), "2008-12-31T23:59:05Z");
    EXPECT_EQ(read("2008-12-31 23;59;"), "nil");
    EXPECT_EQ(read("2008-12-31 23;59;590"), "nil");
    EXPECT_EQ(read("2008-12-31 23;59;59 "), "nil");
    EXPECT_EQ(read(" 2008-12-31 23;59;59"), "nil");
    EXPECT_EQ(read("2008-12-31  23;59;59"), "nil");
    EXPECT_EQ(read("2008-12-31 23:59:59"), "nil");
    EXPECT_EQ(read("2008-12-31"), "nil");
    EXPECT_EQ(read(std::string_view("2008-12-31 23;59;59\0", 20)), "nil");
    EXPECT_EQ(read("", ""), "2001-01-01T00:00:00Z");
    EXPECT_EQ(read("x", ""), "nil");
}

TEST_F(CalendarDateTest, BlanksMatchOnlyThemselves) {
    EXPECT_EQ(read("2008\t1", "%Y\t%m"), "2008-01-01T00:00:00Z");
    EXPECT_EQ(read("2008 1", "%Y\t%m"), "nil");
    EXPECT_EQ(read("20081", "%Y %m"), "nil");
}

TEST_F(CalendarDateTest, FieldsOutOfRangeDoNotMatch) {
    for (const char* text :
         {"2008-00-01 00;00;00", "2008-13-01 00;00;00", "2008-01-00 00;00;00", "2008-01-32 00;00;00",
          "2008-02-30 00;00;00", "2009-02-29 00;00;00", "2008-06-31 00;00;00", "2008-01-01 24;00;00",
          "2008-01-01 00;60;00", "2008-01-01 00;00;61", "-008-01-01 00;00;00", "+2008-01-01 00;00;00",
          "2008--1-01 00;00;00", "2008-01-01 -1;00;00", "2008-01-01 00;00;-1"})
        EXPECT_EQ(read(text), "nil") << text;
    EXPECT_EQ(read("2008-02-29 23;59;60"), "2008-03-01T00:00:00Z");
}

TEST_F(CalendarDateTest, FieldsThatTheFormatLeavesOutAreThoseOfTheReferenceDate) {
    EXPECT_EQ(read("2008", "%Y"), "2008-01-01T00:00:00Z");
    EXPECT_EQ(read("07", "%m"), "2001-07-01T00:00:00Z");
    EXPECT_EQ(read("17:05", "%H:%M"), "2001-01-01T17:05:00Z");
}

TEST_F(CalendarDateTest, AYearTakesAllItsDigits) {
    EXPECT_EQ(read("1", "%Y"), "0001-01-01T00:00:00Z");
    EXPECT_EQ(read("0000", "%Y"), "0000-01-01T00:00:00Z");
    EXPECT_EQ(read("12000-1-2", "%Y-%m-%d"), "+12000-01-02T00:00:00Z");
    EXPECT_EQ(read("123456789", "%Y"), "+123456789-01-01T00:00:00Z");
    EXPECT_EQ(CalendarDate::dateWithString("999999999", "%Y")->yearOfCommonEra(), 999'999'999);
    EXPECT_EQ(read("1000000000", "%Y"), "nil");
    EXPECT_EQ(read("99999999999999999999999", "%Y"), "nil");
    EXPECT_EQ(read("0000000002008", "%Y"), "nil");
    EXPECT_EQ(read("-44", "%Y"), "nil");
}

TEST_F(CalendarDateTest, AYearThatRunsIntoMoreDigitsHasFour) {
    EXPECT_EQ(read("20080229", "%Y%m%d"), "2008-02-29T00:00:00Z");
    EXPECT_EQ(read("20087", "%Y7"), "2008-01-01T00:00:00Z");
    EXPECT_EQ(read("2008March", "%Y%B"), "2008-03-01T00:00:00Z");
    EXPECT_EQ(read("12008%", "%Y%%"), "+12008-01-01T00:00:00Z");
    EXPECT_EQ(read("12008%q", "%Y%q"), "+12008-01-01T00:00:00Z");
    EXPECT_EQ(read("200", "%Y%m"), "nil");
    EXPECT_EQ(read("800-2", "%Y%m"), "nil");
}

TEST_F(CalendarDateTest, ShortYearsMeanTheNearestCenturies) {
    EXPECT_EQ(read("00", "%y"), "2000-01-01T00:00:00Z");
    EXPECT_EQ(read("68", "%y"), "2068-01-01T00:00:00Z");
    EXPECT_EQ(read("69", "%y"), "1969-01-01T00:00:00Z");
    EXPECT_EQ(read("99", "%y"), "1999-01-01T00:00:00Z");
    EXPECT_EQ(read("100", "%y"), "nil");
}

TEST_F(CalendarDateTest, ReadsHoursOfHalfDays) {
    EXPECT_EQ(read("12:05 AM", "%I:%M %p"), "2001-01-01T00:05:00Z");
    EXPECT_EQ(read("12:05 pm", "%I:%M %p"), "2001-01-01T12:05:00Z");
    EXPECT_EQ(read("pm 11", "%p %I"), "2001-01-01T23:00:00Z");
    EXPECT_EQ(read("11", "%I"), "2001-01-01T11:00:00Z");
    EXPECT_EQ(read("0 AM", "%I %p"), "nil");
    EXPECT_EQ(read("13 AM", "%I %p"), "nil");
    EXPECT_EQ(read("1 XM", "%I %p"), "nil");
    EXPECT_EQ(read("13 5 PM", "%H %I %p"), "2001-01-01T13:00:00Z");
}

TEST_F(CalendarDateTest, ReadsDaysOfTheYear) {
    EXPECT_EQ(read("2008 366", "%Y %j"), "2008-12-31T00:00:00Z");
    EXPECT_EQ(read("2009 366", "%Y %j"), "nil");
    EXPECT_EQ(read("2009 060", "%Y %j"), "2009-03-01T00:00:00Z");
    EXPECT_EQ(read("2009 0", "%Y %j"), "nil");
    EXPECT_EQ(read("2009 060 7", "%Y %j %m"), "2009-07-01T00:00:00Z");
}

TEST_F(CalendarDateTest, ReadsMilliseconds) {
    EXPECT_EQ(CalendarDate::dateWithString("59.250", "%S.%F")->secondsSinceReferenceDate(), 59.25);
    EXPECT_EQ(CalendarDate::dateWithString("59.5", "%S.%F")->secondsSinceReferenceDate(), 59.005);
}

TEST_F(CalendarDateTest, ReadsNamesInAnyCase) {
    EXPECT_EQ(read("Thursday, 5 March 2009", "%A, %e %B %Y"), "2009-03-05T00:00:00Z");
    EXPECT_EQ(read("thu 05 MAR 2009", "%a %d %b %Y"), "2009-03-05T00:00:00Z");
    EXPECT_EQ(read("4", "%w"), "2001-01-01T00:00:00Z");
    EXPECT_EQ(read("7", "%w"), "nil");
    EXPECT_EQ(read("Mar", "%B"), "nil");
    EXPECT_EQ(read("March", "%b"), "nil");
    EXPECT_EQ(read("Marchy", "%B"), "nil");
    EXPECT_EQ(read("Brumaire", "%B"), "nil");
}

TEST_F(CalendarDateTest, NamesAreThoseOfTheUsersLocale) {
    useLocale("de_DE.UTF-8");
    EXPECT_EQ(read("5. März 2009", "%e. %B %Y"), "2009-03-05T00:00:00Z");
    EXPECT_EQ(read("5. MÄRZ 2009", "%e. %B %Y"), "2009-03-05T00:00:00Z");
    EXPECT_EQ(read("5. March 2009", "%e. %B %Y"), "nil");
    useLocale("fr_FR.UTF-8");
    EXPECT_EQ(read("5 février 2009", "%e %B %Y"), "2009-02-05T00:00:00Z");
}

TEST_F(CalendarDateTest, NamesMatchHoweverTheirAccentsAreComposed) {
    useLocale("fr_FR.UTF-8");
    EXPECT_EQ(read("5 fe\u0301vrier 2009", "%e %B %Y"), "2009-02-05T00:00:00Z");
    EXPECT_EQ(read("5 FE\u0301VRIER 2009", "%e %B %Y"), "2009-02-05T00:00:00Z");
}

TEST_F(CalendarDateTest, PrintsEveryConversion) {
    const std::pair<const char*, const char*> expected[] = {
        {"%Y", "2009"},  {"%y", "09"}, {"%m", "03"},  {"%d", "05"},    {"%e", "5"},
        {"%H", "17"},    {"%I", "05"}, {"%M", "08"},  {"%S", "09"},    {"%F", "250"},
        {"%j", "064"},   {"%p", "PM"}, {"%a", "Thu"}, {"%b", "Mar"},   {"%A", "Thursday"},
        {"%B", "March"}, {"%w", "4"},  {"%%", "%"},   {"%z", "+0000"}, {"%Z", "UTC"},
    };
    for (const auto& [format, text] : expected)
        EXPECT_EQ(print(thursday, format), text) << format;
}

TEST_F(CalendarDateTest, PrintsByTheLocaleThatIsAskedFor) {
    EXPECT_EQ(print(thursday, "%A, %e. %B", {"de_DE"}), "Donnerstag, 5. März");
    EXPECT_EQ(print(thursday, "%A %B", {"fr_FR"}), "jeudi mars");
    EXPECT_EQ(print(thursday, "%A", {"en_US"}), "Thursday");
    EXPECT_EQ(print(thursday, "%x %X", {"de_DE"}), "05.03.2009 17:08:09");
    EXPECT_EQ(print(thursday, "%Y", {"th_TH"}), "2009");
    EXPECT_NE(print(thursday, "%x", {"th_TH"}).find("2009"), std::string::npos) << "a Buddhist year";
}

TEST_F(CalendarDateTest, UnknownLocalesStillPrint) {
    for (const char* identifier : {"", "!!!", "xx_YY", "en_US_POSIX_AND_MORE", "\xFF\xFE"})
        EXPECT_FALSE(print(thursday, "%B %c", {identifier}).empty()) << identifier;
    EXPECT_FALSE(print(thursday, "%B %c", {std::string(100'000, 'a')}).empty());
}

TEST_F(CalendarDateTest, EachHourOfTheDayHasItsHourOfTheHalf) {
    const char* expected[] = {"12AM", "01AM", "02AM", "03AM", "04AM", "05AM", "06AM", "07AM",
                              "08AM", "09AM", "10AM", "11AM", "12PM", "01PM", "02PM", "03PM",
                              "04PM", "05PM", "06PM", "07PM", "08PM", "09PM", "10PM", "11PM"};
    for (int hour = 0; hour < 24; ++hour)
        EXPECT_EQ(print(hour * 3600, "%I%p"), expected[hour]);
}

TEST_F(CalendarDateTest, PrintsInTheDatesOwnZone) {
    useZone(newYork);
    EXPECT_EQ(print(thursday, "%H:%M %z", english, 19800), "22:38 +0530");
    EXPECT_EQ(print(thursday, "%d %H:%M %z", english, -12600), "05 13:38 -0330");
    EXPECT_EQ(print(thursday, "%z", english, 3208), "+005328");
}

TEST_F(CalendarDateTest, AZoneIsNamedWhenItIsTheLocalOne) {
    useZone(newYork);
    EXPECT_EQ(print(thursday, "%Z", english, -5 * 3600), "EST");
    EXPECT_EQ(print(thursday, "%Z", english, -4 * 3600), "-0400");
    EXPECT_EQ(print(thursday + 60 * 86400, "%Z", english, -4 * 3600), "EDT");
}

TEST_F(CalendarDateTest, YearsWithoutFourDigitsPrintWhole) {
    EXPECT_EQ(print(-730485 * 86400.0, "%Y-%m-%d"), "0001-01-01");
    EXPECT_EQ(print(-730486 * 86400.0, "%Y-%m-%d"), "0000-12-31");
    EXPECT_EQ(print(-730852 * 86400.0, "%Y-%m-%d %y"), "-0001-12-31 99");
    EXPECT_EQ(print(2921574 * 86400.0, "%Y-%m-%d"), "10000-01-01");
}

TEST_F(CalendarDateTest, MillisecondsNeverMakeAFullSecond) {
    EXPECT_EQ(print(0.9999, "%S.%F"), "00.999");
    EXPECT_EQ(print(-0.25, "%S.%F"), "59.750");
    EXPECT_EQ(print(0.123, "%S.%F"), "00.123");
}

TEST_F(CalendarDateTest, WhatIsNoConversionStandsForItself) {
    EXPECT_EQ(print(thursday, "%q%%%é%"), "%q%%é%");
    EXPECT_EQ(read("%q2009%", "%q%Y%"), "2009-01-01T00:00:00Z");
    EXPECT_EQ(read("2009", "%q%Y"), "nil");
    EXPECT_EQ(read("%", "%"), "2001-01-01T00:00:00Z");
    EXPECT_EQ(read("%%", "%"), "nil");
    EXPECT_EQ(read("%é2009", "%é%Y"), "2009-01-01T00:00:00Z");
}

TEST_F(CalendarDateTest, HostileFormatsAndTextsAreHarmless) {
    const std::string_view withNul("%Y\0%", 4);
    EXPECT_EQ(print(thursday, withNul), std::string_view("2009\0%", 6));
    EXPECT_EQ(read(std::string_view("2009\0%", 6), withNul), "2009-01-01T00:00:00Z");
    EXPECT_EQ(print(thursday, "\xFF%\xFF%Y"), "\xFF%\xFF\x32\x30\x30\x39");
    EXPECT_EQ(read("\xFF\xFE", "%B"), "nil");
    EXPECT_EQ(read("\xFF\xFE", "%c"), "nil");
    EXPECT_EQ(read(std::string(1'000'000, '9'), "%Y"), "nil");
    EXPECT_EQ(read(std::string(1'000'000, 'J'), "%c"), "nil");
    EXPECT_EQ(print(thursday, "%99999999Y"), "%99999999Y");
}

TEST_F(CalendarDateTest, EveryNumberPrints) {
    constexpr double infinity = std::numeric_limits<double>::infinity();
    const std::string everything = "%Y%y%m%d%e%H%I%M%S%F%j%p%a%A%b%B%c%x%X%w%z%Z";
    for (const double seconds : {infinity, -infinity, 1e300, -1e300, 9e15, -9e15, 1e-300}) {
        for (const int offset : {0, std::numeric_limits<int>::min(), std::numeric_limits<int>::max()})
            EXPECT_FALSE(print(seconds, everything, english, offset).empty());
    }
    const CalendarDate none(std::nan(""), 0);
    EXPECT_EQ(none.descriptionWithCalendarFormat("%Y x", english), "");
    EXPECT_EQ(none.yearOfCommonEra(), 0);
}

TEST_F(CalendarDateTest, AZoneInTheTextTakesTheLocalOnesPlace) {
    useZone(berlin);
    EXPECT_EQ(read("12:00 +0530", "%H:%M %z"), "2001-01-01T06:30:00Z");
    EXPECT_EQ(read("12:00 -03:30", "%H:%M %z"), "2001-01-01T15:30:00Z");
    EXPECT_EQ(read("12:00 +005328", "%H:%M %z"), "2001-01-01T11:06:32Z");
    EXPECT_EQ(read("12:00 Z", "%H:%M %z"), "2001-01-01T12:00:00Z");
    EXPECT_EQ(read("12:00 GMT", "%H:%M %Z"), "2001-01-01T12:00:00Z");
    EXPECT_EQ(read("12:00 CET", "%H:%M %Z"), "2001-01-01T11:00:00Z");
    EXPECT_EQ(read("12:00 CEST", "%H:%M %Z"), "nil");
    EXPECT_EQ(read("12:00 XYZ", "%H:%M %Z"), "nil");
    for (const char* text : {"", "+", "+x", "+24", "+0160", "0100", "+01000000"})
        EXPECT_EQ(read(text, "%z"), "nil") << text;
}

TEST_F(CalendarDateTest, ATimeThatTheClockSkipsMovesForwardByTheGap) {
    useZone(berlin);
    EXPECT_EQ(read("2009-03-29 01;59;59"), "2009-03-29T00:59:59Z");
    EXPECT_EQ(read("2009-03-29 02;30;00"), "2009-03-29T01:30:00Z");  // 03:30 on the clock
    EXPECT_EQ(read("2009-03-29 03;00;00"), "2009-03-29T01:00:00Z");
    const CalendarDateRef skipped = CalendarDate::dateWithString("2009-03-29 02;30;00", clipDateFormat);
    EXPECT_EQ(skipped->descriptionWithCalendarFormat(clipDateFormat, english), "2009-03-29 03;30;00");

    useZone(newYork);
    EXPECT_EQ(read("2009-03-08 02;30;00"), "2009-03-08T07:30:00Z");
    useZone(lordHowe);
    EXPECT_EQ(read("2009-10-04 02;15;00"), "2009-10-03T15:45:00Z");  // 02:45 on the clock
}

TEST_F(CalendarDateTest, ATimeThatOccursTwiceIsTheEarlier) {
    useZone(berlin);
    EXPECT_EQ(read("2009-10-25 02;30;00"), "2009-10-25T00:30:00Z");
    EXPECT_EQ(read("2009-10-25 03;00;00"), "2009-10-25T02:00:00Z");
    EXPECT_EQ(read("2009-10-25 02:30 CEST", "%Y-%m-%d %H:%M %Z"), "2009-10-25T00:30:00Z");
    EXPECT_EQ(read("2009-10-25 02:30 CET", "%Y-%m-%d %H:%M %Z"), "2009-10-25T01:30:00Z");
    useZone(newYork);
    EXPECT_EQ(read("2009-11-01 01;30;00"), "2009-11-01T05:30:00Z");
    useZone(lordHowe);
    EXPECT_EQ(read("2009-04-05 01;45;00"), "2009-04-04T14:45:00Z");
}

TEST_F(CalendarDateTest, AZoneMayChangeItsNameAlone) {
    constexpr std::string_view format = "%Y-%m-%d %H:%M %Z";
    useZone("AAA-1BBB-1,M3.5.0,M10.5.0/3");
    EXPECT_EQ(read("2009-03-29 01:30 AAA", format), "2009-03-29T00:30:00Z");
    EXPECT_EQ(read("2009-03-29 02:30 BBB", format), "2009-03-29T01:30:00Z");
    EXPECT_EQ(read("2009-03-29 02:30 AAA", format), "nil");
    EXPECT_EQ(read("2009-07-01 12:00 BBB", format), "2009-07-01T11:00:00Z");
}

TEST_F(CalendarDateTest, ZonesOfTheZoneFilesWork) {
    if (!std::ifstream("/usr/share/zoneinfo/Pacific/Apia"))
        GTEST_SKIP() << "this machine has no zone files";
    useZone("Europe/Berlin");
    EXPECT_EQ(read("2009-03-29 02;30;00"), "2009-03-29T01:30:00Z");
    EXPECT_EQ(read("1800-01-01 00;00;00"), "1799-12-31T23:06:32Z");
    useZone("Pacific/Apia");  // which left out a whole day
    EXPECT_EQ(read("2011-12-29 23;59;59"), "2011-12-30T09:59:59Z");
    EXPECT_EQ(read("2011-12-30 12;00;00"), "2011-12-30T22:00:00Z");
    EXPECT_EQ(read("2011-12-31 00;00;00"), "2011-12-30T10:00:00Z");
}

TEST_F(CalendarDateTest, AMalformedZoneIsGMT) {
    for (const char* zone : {"", "!!!", "No/Such/Zone", "../../etc/passwd"}) {
        useZone(zone);
        EXPECT_EQ(read("2008-12-31 23;59;59"), "2008-12-31T23:59:59Z") << zone;
    }
}

TEST_F(CalendarDateTest, TheEarlierTimeAgreesWithTheCLibraryWhereThereIsOnlyOne) {
    std::mt19937 random(7);
    std::uniform_int_distribution<std::time_t> anyTime(0, 4'000'000'000);
    for (const char* zone : {berlin, newYork, lordHowe, kolkata}) {
        useZone(zone);
        for (int i = 0; i < 2000; ++i) {
            const std::time_t time = anyTime(random);
            std::tm fields{};
            tzset();
            localtime_r(&time, &fields);
            char text[64];
            std::strftime(text, sizeof text, "%Y-%m-%d %H;%M;%S", &fields);
            const CalendarDateRef date = CalendarDate::dateWithString(text, clipDateFormat);
            ASSERT_TRUE(date) << zone << " " << text;
            const double late = static_cast<double>(time) - date->secondsSince1970();
            // Of two times that the clock shows alike, the C library's may be the later.
            ASSERT_TRUE(late == 0 || late == 3600 || late == 1800) << zone << " " << text;
            ASSERT_EQ(date->descriptionWithCalendarFormat(clipDateFormat, english), text) << zone;
        }
    }
}

// As the clips of an event are read, from before a change of the clock to after it and back.
TEST_F(CalendarDateTest, TimesNearOneAnotherAreEachInTheirOwnZone) {
    constexpr std::time_t day = 86400, step = 1200;
    struct Change {
        const char* zone;
        std::time_t time;
    };
    for (const auto& [zone, change] :
         {Change{berlin, 1238288400}, Change{berlin, 1256432400}, Change{"Europe/Berlin", 1256432400},
          Change{"Pacific/Apia", 1325239200}, Change{lordHowe, 1238857200}}) {
        useZone(zone);
        tzset();
        const auto expectSame = [](std::time_t time) {
            std::tm fields{};
            localtime_r(&time, &fields);
            std::array<char, 64> text{};
            std::strftime(text.data(), text.size(), "%Y-%m-%d %H;%M;%S %Z", &fields);
            const CalendarDateRef date = CalendarDate::dateWithString(text.data(), "%Y-%m-%d %H;%M;%S %Z");
            ASSERT_TRUE(date) << text.data();
            ASSERT_EQ(date->secondsSince1970(), static_cast<double>(time)) << text.data();
        };
        for (std::time_t time = change - 4 * day; time < change + 4 * day; time += step)
            ASSERT_NO_FATAL_FAILURE(expectSame(time)) << zone;
        for (std::time_t time = change + 4 * day; time > change - 4 * day; time -= step)
            ASSERT_NO_FATAL_FAILURE(expectSame(time)) << zone;
    }
}

TEST_F(CalendarDateTest, AnyTimeFromYear1To20000ComesBackAsItWasPrinted) {
    constexpr double firstSecond = -730485.0 * 86400;
    constexpr double lastSecond = 6573972.0 * 86400;
    std::mt19937_64 random(42);
    std::uniform_int_distribution<std::int64_t> anyTime(static_cast<std::int64_t>(firstSecond),
                                                        static_cast<std::int64_t>(lastSecond));
    constexpr std::string_view format = "%Y-%m-%d %H;%M;%S %Z";
    for (const char* zone : {"UTC0", berlin, newYork, lordHowe, kolkata, "Europe/Berlin", "America/New_York",
                             "Asia/Kathmandu", "Pacific/Apia"}) {
        useZone(zone);
        for (int i = 0; i < 1500; ++i) {
            const auto seconds = static_cast<double>(anyTime(random));
            const std::time_t time = static_cast<std::time_t>(seconds + Date::secondsFrom1970ToReferenceDate);
            std::tm fields{};
            tzset();
            localtime_r(&time, &fields);
            const CalendarDate date(seconds, static_cast<int>(fields.tm_gmtoff));

            const std::string text = date.descriptionWithCalendarFormat(clipDateFormat, english);
            const CalendarDateRef again = CalendarDate::dateWithString(text, clipDateFormat);
            ASSERT_TRUE(again) << zone << " " << text;
            ASSERT_EQ(again->descriptionWithCalendarFormat(clipDateFormat, english), text) << zone;
            const std::string withZone = date.descriptionWithCalendarFormat(format, english);
            const CalendarDateRef exact = CalendarDate::dateWithString(withZone, format);
            ASSERT_TRUE(exact) << zone << " " << withZone;
            ASSERT_EQ(exact->secondsSinceReferenceDate(), seconds) << zone << " " << withZone;
        }
    }
}

TEST_F(CalendarDateTest, LocaleFormsComeBackInManyLanguages) {
    for (const char* name :
         {"C", "en_US", "en_GB", "de_DE", "fr_FR", "es_ES", "it_IT", "ja_JP", "zh_CN", "ru_RU", "pl_PL",
          "cs_CZ", "fi_FI", "tr_TR", "th_TH", "fa_IR", "ar_EG", "hi_IN", "ko_KR"}) {
        useLocale(name);
        const Locale locale = Locale::current();
        const double wholeSecond = std::floor(thursday);
        for (const char* format :
             {"%c", "%x %X", "%X %x", "%A %e %B %Y %I %p %M %S", "%a %d %b %Y %H %M %S"}) {
            const std::string text = print(wholeSecond, format, locale);
            EXPECT_EQ(read(text, format), "2009-03-05T17:08:09Z") << name << " " << format << " " << text;
        }
    }
}

TEST_F(CalendarDateTest, LocaleFormsWithDaysThatDoNotExistDoNotMatch) {
    EXPECT_EQ(read("Feb 29, 2008", "%x"), "2008-02-29T00:00:00Z");
    EXPECT_EQ(read("feb 29, 2008", "%x"), "2008-02-29T00:00:00Z");
    EXPECT_EQ(read("Feb 30, 2008", "%x"), "nil");
    EXPECT_EQ(read("5:61:00 PM", "%X"), "nil");
    EXPECT_EQ(read("5:06:07 PM", "%X"), "2001-01-01T17:06:07Z");
    EXPECT_EQ(read("Feb 29, 2008 and more", "%x"), "nil");
    EXPECT_EQ(read("Feb", "%x"), "nil");
}

TEST_F(CalendarDateTest, ThreadsReadAndPrintAtOnce) {
    useZone(berlin);
    std::vector<std::thread> threads;
    std::atomic<int> wrong{0};
    for (const char* language : {"de_DE", "fr_FR", "en_US", "ja_JP"}) {
        threads.emplace_back([&wrong, language] {
            for (int i = 0; i < 200; ++i) {
                const CalendarDateRef date =
                    CalendarDate::dateWithString("2009-10-25 02;30;00", clipDateFormat);
                if (!date || date->secondsFromGMT() != 7200 || print(0, "%B%c", {language}).empty())
                    ++wrong;
            }
        });
    }
    for (std::thread& thread : threads)
        thread.join();
    EXPECT_EQ(wrong, 0);
}

TEST(LocaleTest, TheFirstVariableThatSaysSomethingCounts) {
    const ScopedEnvironment all("LC_ALL", "");
    const ScopedEnvironment time("LC_TIME", nullptr);
    const ScopedEnvironment language("LANG", "fr_FR.UTF-8");
    EXPECT_EQ(Locale::current().identifier, "fr_FR");
    const ScopedEnvironment timeSet("LC_TIME", "de_DE@euro");
    EXPECT_EQ(Locale::current().identifier, "de_DE");
    const ScopedEnvironment allSet("LC_ALL", "ja_JP");
    EXPECT_EQ(Locale::current().identifier, "ja_JP");
}

TEST(LocaleTest, PlainLocalesAreEnglishPOSIX) {
    const ScopedEnvironment time("LC_TIME", nullptr);
    const ScopedEnvironment language("LANG", nullptr);
    for (const char* plain : {"C", "POSIX", "C.UTF-8", "", ".UTF-8", "@x"}) {
        const ScopedEnvironment all("LC_ALL", plain);
        EXPECT_EQ(Locale::current().identifier, "en_US_POSIX") << plain;
    }
    const ScopedEnvironment all("LC_ALL", nullptr);
    EXPECT_EQ(Locale::current().identifier, "en_US_POSIX");
}

}  // namespace
}  // namespace platform
