#include "platform/LocalZone.h"

#include <gtest/gtest.h>

#include "tests/support/TemporaryFolder.h"

namespace platform {
namespace {

using testing_support::ScopedEnvironment;

constexpr int hour = 3600;

class LocalZoneTest : public testing::Test {
  protected:
    static LocalZone zoneOf(const char* TZ) {
        const ScopedEnvironment environment("TZ", TZ);
        return LocalZone::current();
    }
    static int offset(const LocalZone& zone) { return zone.secondsFromGMT(0); }
    static int offsetOfClock(const LocalZone& zone) { return zone.timesOfClock(0).first.secondsFromGMT; }
};

TEST_F(LocalZoneTest, IsWhatTheEnvironmentSaysAtThatMoment) {
    for (const auto& [TZ, offsetOfZone] :
         {std::pair("UTC0", 0), {"CET-1", hour}, {"EST5", -5 * hour}, {"CET-1", hour}}) {
        const ScopedEnvironment environment("TZ", TZ);
        EXPECT_EQ(offset(LocalZone::current()), offsetOfZone) << TZ;
        EXPECT_EQ(offsetOfClock(LocalZone::current()), offsetOfZone) << TZ;
    }
}

// A zone that is kept may go by the old setting or by the new; those made later go by theirs.
TEST_F(LocalZoneTest, ZonesThatAreKeptSpoilNoneThatAreMadeLater) {
    for (const char* kept : {"CET-1", static_cast<const char*>(nullptr)}) {
        for (const char* later : {"CET-1", "EST5", static_cast<const char*>(nullptr)}) {
            const ScopedEnvironment without("TZ", nullptr);
            const int machines = offset(LocalZone::current());
            const LocalZone old = zoneOf(kept);
            {
                const ScopedEnvironment other("TZ", "EST5");
                EXPECT_EQ(offset(LocalZone::current()), -5 * hour);
                EXPECT_EQ(offsetOfClock(LocalZone::current()), -5 * hour);
                offset(old);
                offsetOfClock(old);
            }
            const ScopedEnvironment environment("TZ", later);
            const int expected = !later ? machines : later == std::string("CET-1") ? hour : -5 * hour;
            EXPECT_EQ(offsetOfClock(LocalZone::current()), expected);
            EXPECT_EQ(offset(LocalZone::current()), expected);
        }
    }
}

// Whether a thread has asked for it before or not, and for what else.
TEST_F(LocalZoneTest, DatesInAnyOrderAreThoseOfTheirOwnTime) {
    const ScopedEnvironment environment("TZ", "CET-1CEST,M3.5.0,M10.5.0/3");
    const LocalZone zone = LocalZone::current();
    // More than three years; a prime, so that each step comes to all of them.
    constexpr std::int64_t hours = 30'011;
    for (const std::int64_t step : {1, -1, 9973}) {
        for (std::int64_t i = 0; i < hours; ++i) {
            const std::int64_t clock = (step * i % hours - hours / 2) * hour;  // before 2001 and after
            const ZonedTime time = zone.timesOfClock(clock).first;
            const bool isPutForward = zone.secondsFromGMT(time.seconds - hour) < time.secondsFromGMT;
            const std::int64_t shown = time.seconds + time.secondsFromGMT;
            ASSERT_EQ(zone.secondsFromGMT(time.seconds), time.secondsFromGMT) << clock;
            ASSERT_TRUE(shown == clock || (isPutForward && shown == clock + hour)) << clock;
        }
    }
}

TEST_F(LocalZoneTest, AClockThatIsPutBackShowsATimeTwice) {
    const ScopedEnvironment environment("TZ", "CET-1CEST,M3.5.0,M10.5.0/3");
    constexpr std::int64_t october25In2009 = 278'130'600;  // 02:30 by the clock
    const LocalTimes times = LocalZone::current().timesOfClock(october25In2009);
    EXPECT_EQ(times.first.seconds, october25In2009 - 2 * hour);
    ASSERT_TRUE(times.second);
    EXPECT_EQ(times.second->seconds, october25In2009 - hour);
    EXPECT_EQ(LocalZone::current().abbreviation(times.first.seconds), "CEST");
    EXPECT_EQ(LocalZone::current().abbreviation(times.second->seconds), "CET");
}

}  // namespace
}  // namespace platform
