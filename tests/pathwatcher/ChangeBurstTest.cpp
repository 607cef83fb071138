#include "framework/pathwatcher/ChangeBurst.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

using namespace vexo;
using namespace std::chrono_literals;
using testing::ElementsAre;
using testing::Pair;

namespace {

constexpr ChangeBurst::Time start{};

}  // namespace

TEST(ChangeBurstTest, KnowsThroughWhichWatchedPathEachChangeWasSeen) {
    ChangeBurst burst;
    burst.add("/a", "/a/x");
    burst.add("/b", "/a/x");
    burst.add("/a", "/a/y");
    EXPECT_THAT(burst.take(),
                ElementsAre(Pair("/a", ElementsAre("/a/x", "/a/y")), Pair("/b", ElementsAre("/a/x"))));
}

TEST(ChangeBurstTest, IsDueAMomentAfterTheFirstChangeHoweverManyFollow) {
    ChangeBurst burst;
    burst.timeIs(start);
    EXPECT_EQ(burst.due(), std::nullopt);
    burst.add("/a", "/a/x");
    burst.timeIs(start + 1s);
    burst.add("/a", "/a/y");
    burst.timeIs(start + 1s + 40ms);
    EXPECT_EQ(burst.due(), start + 1s + ChangeBurst::length);
    EXPECT_FALSE(burst.isDue(start + 1s + ChangeBurst::length - 1ns));
    EXPECT_TRUE(burst.isDue(start + 1s + ChangeBurst::length));
}

TEST(ChangeBurstTest, ABurstThatWasTakenIsFollowedByAnEmptyOneOfAnotherNumber) {
    ChangeBurst burst;
    burst.add("/a", "/a/x");
    burst.timeIs(start);
    const auto number = burst.number();
    burst.take();
    EXPECT_TRUE(burst.isEmpty());
    EXPECT_EQ(burst.due(), std::nullopt);
    EXPECT_NE(burst.number(), number);
    burst.add("/a", "/a/x");
    EXPECT_THAT(burst.take(), ElementsAre(Pair("/a", ElementsAre("/a/x"))));
}
