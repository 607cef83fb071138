#include "platform/Date.h"

#include <gtest/gtest.h>

#include <cmath>
#include <limits>

#include "tests/platform/OddNumbers.h"
#include "tests/support/TemporaryFolder.h"

namespace platform {
namespace {

using testing_support::infinity;
using testing_support::notANumber;
using testing_support::ScopedEnvironment;

constexpr double day = 86400;

std::string iso(double secondsSinceReferenceDate) {
    return iso8601String(*Date::sinceReferenceDate(secondsSinceReferenceDate));
}

int year(double secondsSinceReferenceDate) {
    return yearInCurrentCalendar(*Date::sinceReferenceDate(secondsSinceReferenceDate));
}

TEST(DateTest, TheReferenceDateIsTheStartOf2001) {
    EXPECT_EQ(iso(0), "2001-01-01T00:00:00Z");
    EXPECT_EQ(Date::since1970(0)->secondsSinceReferenceDate(), -978307200);
    EXPECT_EQ(iso8601String(*Date::since1970(0)), "1970-01-01T00:00:00Z");
    EXPECT_EQ(Date::sinceReferenceDate(12)->secondsSince1970(), 978307212);
}

TEST(DateTest, EqualDatesCompareEqualAndAreTwoObjects) {
    const DateRef a = Date::sinceReferenceDate(5);
    const DateRef b = Date::sinceReferenceDate(5);
    EXPECT_NE(a, b);
    EXPECT_TRUE(a->compare(*b) == 0);
    EXPECT_TRUE(a->compare(*Date::sinceReferenceDate(6)) < 0);
    EXPECT_TRUE(a->compare(*Date::sinceReferenceDate(notANumber)) == std::partial_ordering::unordered);
}

TEST(DateTest, Iso8601RoundsDownToWholeSeconds) {
    EXPECT_EQ(iso(0.999), "2001-01-01T00:00:00Z");
    EXPECT_EQ(iso(-0.001), "2000-12-31T23:59:59Z");
    EXPECT_EQ(iso(252460799.5), "2008-12-31T23:59:59Z");
}

TEST(DateTest, Iso8601KnowsLeapYears) {
    EXPECT_EQ(iso(-307 * day), "2000-02-29T00:00:00Z");
    EXPECT_EQ(iso(-306 * day), "2000-03-01T00:00:00Z");
    EXPECT_EQ(iso(36218 * day), "2100-03-01T00:00:00Z");
    EXPECT_EQ(iso(36217 * day), "2100-02-28T00:00:00Z");
}

TEST(DateTest, Iso8601MarksYearsThatHaveNoFourDigits) {
    EXPECT_EQ(iso(-730485 * day), "0001-01-01T00:00:00Z");
    EXPECT_EQ(iso(-730486 * day), "0000-12-31T00:00:00Z");
    EXPECT_EQ(iso(-730485 * day - 366 * day - 1), "-0001-12-31T23:59:59Z");
    EXPECT_EQ(iso(2921574 * day - 1), "9999-12-31T23:59:59Z");
    EXPECT_EQ(iso(2921574 * day), "+10000-01-01T00:00:00Z");
}

TEST(DateTest, NoDateIsTooFarAwayToPrint) {
    EXPECT_EQ(iso(infinity), iso(1e300));
    EXPECT_EQ(iso(-infinity), iso(-std::numeric_limits<double>::max()));
    EXPECT_EQ(iso(infinity).substr(0, 6), "+10000");
    EXPECT_EQ(iso(-infinity).substr(0, 6), "-99999");
    EXPECT_EQ(iso(std::numeric_limits<double>::denorm_min()), "2001-01-01T00:00:00Z");
    EXPECT_EQ(iso(notANumber), "");
}

TEST(DateTest, TheYearIsThatOfTheLocalZone) {
    const double newYear = 252460800;  // 2009-01-01 00:00:00 UTC
    {
        const ScopedEnvironment zone("TZ", "UTC0");
        EXPECT_EQ(year(newYear - 1), 2008);
        EXPECT_EQ(year(newYear), 2009);
    }
    {
        const ScopedEnvironment zone("TZ", "CET-1");
        EXPECT_EQ(year(newYear - 3601), 2008);
        EXPECT_EQ(year(newYear - 3600), 2009);
    }
    {
        const ScopedEnvironment zone("TZ", "EST5");
        EXPECT_EQ(year(newYear + 5 * 3600 - 1), 2008);
        EXPECT_EQ(year(newYear + 5 * 3600), 2009);
    }
}

TEST(DateTest, EveryNumberHasAYear) {
    const ScopedEnvironment zone("TZ", "CET-1CEST,M3.5.0,M10.5.0/3");
    EXPECT_EQ(year(infinity), year(1e300));
    EXPECT_GT(year(infinity), 999'999'999);
    EXPECT_LT(year(-infinity), -999'990'000);
    EXPECT_EQ(year(notANumber), 0);
}

}  // namespace
}  // namespace platform
