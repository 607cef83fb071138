#include "framework/queries/QueryExpression.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "platform/CalendarDate.h"
#include "tests/queries/QueriedProperties.h"
#include "tests/support/TemporaryFolder.h"

using namespace std::string_literals;
using namespace testing_support;
using namespace vexo;
using platform::Array;
using platform::Date;
using platform::Dictionary;
using platform::Value;
using testing::ElementsAre;

namespace {

constexpr double now = 1234567890.5;  // 2009-02-13 23:31:30 UTC, a Friday

bool matches(const std::string& query, const VXMetadataProperties& properties) {
    const auto result = QueryExpression::parse(query);
    if (const auto* error = std::get_if<QuerySyntaxError>(&result)) {
        ADD_FAILURE() << query << ": " << error->description();
        return false;
    }
    return std::get<QueryExpression>(result).matches(properties, *Date::since1970(now));
}

bool matches(const std::string& query, const Dictionary& values) {
    return matches(query, QueriedProperties(values));
}

std::string errorOf(const std::string& query) {
    const auto result = QueryExpression::parse(query);
    const auto* error = std::get_if<QuerySyntaxError>(&result);
    return error ? error->description() : "no error";
}

Value timeAt(double secondsSince1970) {
    return Date::since1970(secondsSince1970);
}

// What is asked of a few items, and which of them it means.
struct Row {
    const char* query;
    const char* meant;
};
void PrintTo(const Row& row, std::ostream* stream) {
    *stream << row.query;
}

const std::vector<std::pair<std::string, Dictionary>> items{
    {"beach",
     {{"name", "Day at the Beach_01.mov"},
      {"width", 1920},
      {"rate", 29.97},
      {"hidden", false},
      {"made", timeAt(now - 3600)},
      {"codecs", Array{"h264", "aac"}},
      {"sizes", Array{1, 5}}}},
    {"cafe", {{"name", "Café"}, {"width", 640}, {"hidden", true}, {"made", timeAt(now + 3600)}}},
    {"size", {{"name", "1920"}, {"width", platform::Size{1920, 1080}}, {"codecs", Array{}}}},
    {"empty", {}},
};

std::string meantBy(const std::string& query) {
    std::string names;
    for (const auto& [name, values] : items)
        if (matches(query, values))
            names += (names.empty() ? "" : " ") + name;
    return names;
}

class QueryTable : public testing::TestWithParam<Row> {};

TEST_P(QueryTable, MeansTheseItems) {
    EXPECT_EQ(meantBy(GetParam().query), GetParam().meant) << GetParam().query;
}

INSTANTIATE_TEST_SUITE_P(Numbers, QueryTable,
                         testing::Values(Row{"width = 1920", "beach"}, Row{"width == 1920.0", "beach"},
                                         Row{"width=+1.92e3", "beach"},
                                         Row{"width != 1920", "cafe size empty"}, Row{"width < 1920", "cafe"},
                                         Row{"width <= 1920", "beach cafe"}, Row{"width > 640", "beach"},
                                         Row{"width >= 640", "beach cafe"}, Row{"width > -5", "beach cafe"},
                                         Row{"rate = 29.97", "beach"}, Row{"rate < .5e2", "beach"},
                                         Row{"name = 1920", ""}, Row{"name != 1920", "beach cafe size empty"},
                                         Row{"width = '1920'", ""}));

INSTANTIATE_TEST_SUITE_P(Truth, QueryTable,
                         testing::Values(Row{"hidden = true", "cafe"}, Row{"hidden = YES", "cafe"},
                                         Row{"hidden = 1", "cafe"}, Row{"hidden = no", "beach"},
                                         Row{"hidden = False", "beach"},
                                         Row{"hidden != false", "cafe size empty"},
                                         Row{"hidden < true", "beach"}));

INSTANTIATE_TEST_SUITE_P(
    Texts, QueryTable,
    testing::Values(Row{"name = 'Café'", "cafe"}, Row{"name = \"Café\"", "cafe"},
                    Row{"name = 'Cafe\u0301'", "cafe"},  // the accent as a mark of its own
                    Row{"name = 'cafe'", ""}, Row{"name = 'CAFÉ'c", "cafe"}, Row{"name = 'Cafe'd", "cafe"},
                    Row{"name = 'cafe'd", ""}, Row{"name = 'CAFE'cd", "cafe"}, Row{"name = 'CAFE'dc", "cafe"},
                    Row{"name = '1920'", "size"}, Row{"name < 'B'", "size"}, Row{"name > 'b'", ""},
                    Row{"name > 'b'c", "beach cafe"}, Row{"name >= 'Café'", "beach cafe"},
                    Row{"name <= 'Cafe'd", "cafe size"}, Row{"name != 'Café'", "beach size empty"}));

INSTANTIATE_TEST_SUITE_P(Wildcards, QueryTable,
                         testing::Values(Row{"name = '*Beach*'", "beach"}, Row{"name = 'Day*mov'", "beach"},
                                         Row{"name = 'Day*.*v'", "beach"}, Row{"name = 'Day*mov*mov'", ""},
                                         Row{"name = '*BEACH*'c", "beach"}, Row{"name = '*e'd", "cafe"},
                                         Row{"name = '*e'", ""}, Row{"name = '1920*'", "size"},
                                         Row{"name = '19*920'", ""}, Row{"name = '19\\*'", ""},
                                         Row{"name != '*a*'", "size empty"},
                                         Row{"name > '*'", "beach cafe size"}));

INSTANTIATE_TEST_SUITE_P(Words, QueryTable,
                         testing::Values(Row{"name = 'Beach'w", "beach"}, Row{"name = 'Bea'w", ""},
                                         Row{"name = 'Bea*'w", "beach"}, Row{"name = 'beach 01'cw", "beach"},
                                         Row{"name = 'Day Beach'w", ""}, Row{"name = 'Day * the'w", "beach"},
                                         Row{"name = 'at-the'w", "beach"}, Row{"name = 'CAFE'wcd", "cafe"},
                                         Row{"name = '-'w", ""}, Row{"name = ''w", ""}));

INSTANTIATE_TEST_SUITE_P(Lists, QueryTable,
                         testing::Values(Row{"codecs = 'aac'", "beach"},
                                         Row{"codecs != 'aac'", "cafe size empty"},
                                         Row{"codecs != 'vp9'", "beach cafe size empty"},
                                         Row{"sizes > 4", "beach"}, Row{"sizes < 1", ""}));

INSTANTIATE_TEST_SUITE_P(Presence, QueryTable,
                         testing::Values(Row{"width = '*'", "beach cafe size"}, Row{"width != '*'", "empty"},
                                         Row{"codecs = '*'", "beach size"}, Row{"rate == '**'c", "beach"},
                                         Row{"* = '*'", "beach cafe size"}, Row{"* != '*'", "empty"}));

INSTANTIATE_TEST_SUITE_P(AnyKey, QueryTable,
                         testing::Values(Row{"* = 'aac'", "beach"}, Row{"* = 640", "cafe"},
                                         Row{"* != 640", "beach size empty"}, Row{"*='1920'", "size"}));

// One value of a list must lie between both ends: of 1 and 5 none is from 2 to 4.
INSTANTIATE_TEST_SUITE_P(
    Ranges, QueryTable,
    testing::Values(Row{"InRange(width, 640, 1919)", "cafe"}, Row{"InRange(width,640,1920)", "beach cafe"},
                    Row{"InRange ( rate , 29 , 30 )", "beach"}, Row{"InRange(sizes, 2, 4)", ""},
                    Row{"InRange(sizes, 2, 5)", "beach"}, Row{"InRange(name, 'C', 'D')", "cafe"},
                    Row{"InRange(name, 'Day', 'C')", ""}));

INSTANTIATE_TEST_SUITE_P(Combinations, QueryTable,
                         testing::Values(Row{"!width = 1920", "cafe size empty"},
                                         Row{"!!width = 1920", "beach"},
                                         Row{"!(width = 1920) && name = '*'", "cafe size"},
                                         Row{"width = 640 || width = 1920 && name = 'none'", "cafe"},
                                         Row{"(width = 640 || width = 1920) && name = 'Day*'", "beach"},
                                         Row{"width = 640||width = 1920||codecs = '*'", "beach cafe size"},
                                         Row{"! name = '*' || hidden = true", "cafe empty"},
                                         Row{"((\twidth\n=\r640))", "cafe"}));

INSTANTIATE_TEST_SUITE_P(
    Dates, QueryTable,
    testing::Values(Row{"made < $time.now", "beach"}, Row{"made > $time.now", "cafe"},
                    Row{"made = $time.now(-3600)", "beach"}, Row{"made > $time.now(3599.5)", "cafe"},
                    Row{"made > 1234567890", "cafe"},  // seconds from 1970
                    Row{"width < $time.now", "beach cafe"}, Row{"made != $time.now", "beach cafe size empty"},
                    Row{"InRange(made, $time.now(-7200), $time.now)", "beach"}, Row{"made = '2009*'", ""}));

// --- Times -------------------------------------------------------------------------------------------------

class QueryTimes : public testing::Test {
  protected:
    // The point in time that a text of the query language means, as it is written in Berlin.
    static std::string meaning(const std::string& time, double at = now) {
        const auto result = QueryExpression::parse("t = " + time);
        if (const auto* error = std::get_if<QuerySyntaxError>(&result))
            return error->description();
        const auto isBefore = [&](double seconds) {
            return std::get<QueryExpression>(QueryExpression::parse("t < " + time))
                .matches(QueriedProperties({{"t", timeAt(seconds)}}), *Date::since1970(at));
        };
        double low = -1e11, high = 1e11;
        while (high - low > 0.25)
            (isBefore((low + high) / 2) ? low : high) = (low + high) / 2;
        const double seconds = std::round(high) - Date::secondsFrom1970ToReferenceDate;
        const auto zone = std::get<QueryExpression>(result).matches(
            QueriedProperties({{"t", timeAt(std::round(high))}}), *Date::since1970(at));
        return platform::iso8601String(Date(seconds)) + (zone ? "" : " or so");
    }

    const ScopedEnvironment zone_{"TZ", "CET-1CEST,M3.5.0,M10.5.0/3"};
};

// Now is half past midnight of Saturday, 14 February, by the local clock.
TEST_F(QueryTimes, BeginWithTheLocalDay) {
    EXPECT_EQ(meaning("$time.today"), "2009-02-13T23:00:00Z");
    EXPECT_EQ(meaning("$time.today(-7)"), "2009-02-06T23:00:00Z");
    EXPECT_EQ(meaning("$time.today( +1 )"), "2009-02-14T23:00:00Z");
    EXPECT_EQ(meaning("$time.yesterday"), "2009-02-12T23:00:00Z");
    EXPECT_EQ(meaning("$time.yesterday(-1)"), "2009-02-11T23:00:00Z");
}

TEST_F(QueryTimes, AWeekBeginsOnMonday) {
    EXPECT_EQ(meaning("$time.this_week"), "2009-02-08T23:00:00Z");
    EXPECT_EQ(meaning("$time.this_week(-1)"), "2009-02-01T23:00:00Z");
    const double sunday = 1234701000, monday = sunday + 86400;
    EXPECT_EQ(meaning("$time.this_week", sunday), "2009-02-08T23:00:00Z");
    EXPECT_EQ(meaning("$time.this_week", monday), "2009-02-15T23:00:00Z");
}

TEST_F(QueryTimes, MonthsAndYearsAreCountedByTheCalendar) {
    EXPECT_EQ(meaning("$time.this_month"), "2009-01-31T23:00:00Z");
    EXPECT_EQ(meaning("$time.this_month(-1)"), "2008-12-31T23:00:00Z");
    EXPECT_EQ(meaning("$time.this_month(-2)"), "2008-11-30T23:00:00Z");
    EXPECT_EQ(meaning("$time.this_month(-14)"), "2007-11-30T23:00:00Z");
    EXPECT_EQ(meaning("$time.this_month(-24110)"), "-0001-11-30T23:00:00Z");
    EXPECT_EQ(meaning("$time.this_month(11)"), "2009-12-31T23:00:00Z");
    EXPECT_EQ(meaning("$time.this_year"), "2008-12-31T23:00:00Z");
    EXPECT_EQ(meaning("$time.this_year(-9)"), "1999-12-31T23:00:00Z");
}

TEST_F(QueryTimes, AChangeOfTheClockMovesNoMidnight) {
    EXPECT_EQ(meaning("$time.today(60)"), "2009-04-14T22:00:00Z");
    EXPECT_EQ(meaning("$time.this_month(5)"), "2009-06-30T22:00:00Z");
}

TEST_F(QueryTimes, AFixedTimeMayNameItsZone) {
    EXPECT_EQ(meaning("$time.iso(2008-12-31T23:59:59Z)"), "2008-12-31T23:59:59Z");
    EXPECT_EQ(meaning("$time.iso( 2008-12-31T23:59:59+01:00)"), "2008-12-31T22:59:59Z");
    EXPECT_EQ(meaning("$time.iso(2008-07-31T23:59:59)"), "2008-07-31T21:59:59Z");
    EXPECT_EQ(meaning("$time.iso(2008-12-31)"), "2008-12-30T23:00:00Z");
}

TEST_F(QueryTimes, FarTimesAreTimesAsWell) {
    const QueriedProperties today({{"t", timeAt(now)}});
    EXPECT_TRUE(matches("t < $time.this_year(100000000)", today));
    EXPECT_TRUE(matches("t > $time.this_month(-100000000)", today));
    EXPECT_TRUE(matches("t > $time.now(-1e300)", today));
}

// --- Evaluation --------------------------------------------------------------------------------------------

TEST(QueryEvaluation, StopsWhereTheAnswerIsKnown) {
    const QueriedProperties movie({{"type", "movie"}, {"width", 5}});
    EXPECT_FALSE(matches("type = 'sound' && width = 5", movie));
    EXPECT_TRUE(matches("type = 'movie' || width = 5", movie));
    EXPECT_THAT(movie.asked, ElementsAre("type", "type"));
}

TEST(QueryEvaluation, AsksForAPropertyOnce) {
    const QueriedProperties movie({{"width", 5}});
    EXPECT_TRUE(matches("width > 1 && width < 9 && height != 2 && height != 3", movie));
    EXPECT_THAT(movie.asked, ElementsAre("width", "height"));
}

TEST(QueryEvaluation, AsksForEverythingForTheSakeOfAnAsteriskOnly) {
    const QueriedProperties movie({{"width", 5}});
    EXPECT_TRUE(matches("* = 5 && * != 6", movie));
    EXPECT_THAT(movie.asked, ElementsAre("everything"));
}

TEST(QueryEvaluation, AnExpressionMayBeCopiedAndUsedAgain) {
    const auto first = std::get<QueryExpression>(QueryExpression::parse("width = 5"));
    const QueryExpression copy = first;
    for (int width : {5, 6, 5})
        EXPECT_EQ(copy.matches(QueriedProperties({{"width", width}}), Date(0)), width == 5);
}

TEST(QueryEvaluation, WildcardsCannotMakeItSlow) {
    std::string pattern;
    for (int i = 0; i < 4000; ++i)
        pattern += "a*";
    const Dictionary values{{"t", std::string(100000, 'a')}};
    EXPECT_FALSE(matches("t = '" + pattern + "b'", values));
    EXPECT_TRUE(matches("t = '" + pattern + "'", values));
}

TEST(QueryEvaluation, BytesThatAreNoUTF8Match) {
    EXPECT_TRUE(matches("t = '*\xff\xfe.mov'c", {{"t", "A\xff\xfe.MOV"}}));
    EXPECT_TRUE(matches("t = 'B'wc", {{"t",
                                       "a\xff"
                                       "b"}}));
    EXPECT_FALSE(matches("t = 'a'", {{"t", "a\xff"}}));
}

TEST(QueryEvaluation, ABackslashTakesACharacterAsItIs) {
    EXPECT_TRUE(matches(R"(t = 'it\'s \"50\*\\')", {{"t", R"(it's "50*\)"}}));
    EXPECT_TRUE(matches(R"(t = "\é*")", {{"t", "étude"}}));
    EXPECT_FALSE(matches(R"(t = '\*')", {{"t", "anything"}}));
}

TEST(QueryEvaluation, BlanksOfATextCount) {
    EXPECT_TRUE(matches("t = ' a '", {{"t", " a "}}));
    EXPECT_FALSE(matches("t = ' a '", {{"t", "a"}}));
}

// --- Errors ------------------------------------------------------------------------------------------------

struct Mistake {
    const char* query;
    const char* error;
};
void PrintTo(const Mistake& mistake, std::ostream* stream) {
    *stream << mistake.query;
}

class QueryMistakes : public testing::TestWithParam<Mistake> {};

TEST_P(QueryMistakes, AreNamedWithTheirPlace) {
    EXPECT_EQ(errorOf(GetParam().query), GetParam().error) << GetParam().query;
}

INSTANTIATE_TEST_SUITE_P(
    Conditions, QueryMistakes,
    testing::Values(Mistake{"", "expected the name of a property at position 0"},
                    Mistake{"  ", "expected the name of a property at position 2"},
                    Mistake{"&& a = 1", "expected the name of a property at position 0"},
                    Mistake{"a = 1 && ", "expected the name of a property at position 9"},
                    Mistake{"a = 1 || )", "expected the name of a property at position 9"},
                    Mistake{"'a' = 1", "expected the name of a property at position 0"},
                    Mistake{"!= 1", "expected the name of a property at position 1"},
                    Mistake{"a", "expected an operator after 'a' at position 1"},
                    Mistake{"a b", "expected an operator after 'a' at position 2"},
                    Mistake{"InRange = 1 b", "expected '&&', '||' or the end of the query at position 12"},
                    Mistake{"*a = 1", "expected an operator after '*' at position 1"},
                    Mistake{"kMDItemFSSize  = ", "expected a value after '=' at position 17"},
                    Mistake{"a = b", "expected a value after '=' at position 4"},
                    Mistake{"a === 1", "expected a value after '==' at position 4"},
                    Mistake{"a =< 1", "expected a value after '=' at position 3"},
                    Mistake{"a = 1 & b = 2", "expected '&&', '||' or the end of the query at position 6"},
                    Mistake{"a = 1 b = 2", "expected '&&', '||' or the end of the query at position 6"},
                    Mistake{"a = 1)", "expected '&&', '||' or the end of the query at position 5"},
                    Mistake{"(a = 1", "expected '&&', '||' or ')' at position 6"},
                    Mistake{"(a = 1 b", "expected '&&', '||' or ')' at position 7"}));

INSTANTIATE_TEST_SUITE_P(
    Values, QueryMistakes,
    testing::Values(Mistake{"a = 'b", "a text without a closing ' at position 4"},
                    Mistake{"a = \"b'", "a text without a closing \" at position 4"},
                    Mistake{"a = 'b\\", "a text without a closing ' at position 4"},
                    Mistake{"a = 'b\\'", "a text without a closing ' at position 4"},
                    Mistake{"a = ' b'cx", "unknown modifier 'x' at position 9"},
                    Mistake{"a = 'b'C", "unknown modifier 'C' at position 7"},
                    Mistake{"a = 'b' c", "expected '&&', '||' or the end of the query at position 8"},
                    Mistake{"a = -", "expected a value after '=' at position 4"},
                    Mistake{"a = .", "expected a value after '=' at position 4"},
                    Mistake{"a = inf", "expected a value after '=' at position 4"},
                    Mistake{"a = +nan", "expected a value after '=' at position 4"},
                    Mistake{"a = 1e999", "a number out of range at position 4"},
                    Mistake{"a = -1e-999", "a number out of range at position 4"},
                    Mistake{"a = 12b", "expected '&&', '||' or the end of the query at position 6"},
                    Mistake{"a = truely", "expected a value after '=' at position 4"}));

INSTANTIATE_TEST_SUITE_P(
    Functions, QueryMistakes,
    testing::Values(Mistake{"Range(a, 1, 2)", "expected an operator after 'Range' at position 5"},
                    Mistake{"InRange(", "expected the name of a property at position 8"},
                    Mistake{"InRange(a)", "expected ',' at position 9"},
                    Mistake{"InRange(a,", "expected a value after ',' at position 10"},
                    Mistake{"InRange(a, 1)", "expected ',' at position 12"},
                    Mistake{"InRange(a, 1, )", "expected a value after ',' at position 14"},
                    Mistake{"InRange(a, 1, 2", "expected ')' at position 15"},
                    Mistake{"InRange(a, 1, 2, 3)", "expected ')' at position 15"},
                    Mistake{"a = $", "unknown time '$' at position 4"},
                    Mistake{"a = $time.noon", "unknown time '$time.noon' at position 4"},
                    Mistake{"a = $time.now(", "expected a number at position 14"},
                    Mistake{"a = $time.now(1e999)", "expected a number at position 14"},
                    Mistake{"a = $time.now(1", "expected ')' at position 15"},
                    Mistake{"a = $time.today()", "expected a whole number at position 16"},
                    Mistake{"a = $time.today(1.5)", "expected a whole number at position 16"},
                    Mistake{"a = $time.this_year(100000001)", "expected a whole number at position 20"},
                    Mistake{"a = $time.iso", "expected '(' at position 13"},
                    Mistake{"a = $time.iso(2008-13-01T00:00:00Z)",
                            "expected a date such as 2008-12-31T23:59:59Z at position 14"},
                    Mistake{"a = $time.iso(2008-12-31",
                            "expected a date such as 2008-12-31T23:59:59Z at position 14"}));

TEST(QueryLimits, NestingIsLimited) {
    const auto nested = [](std::size_t levels) {
        return std::string(levels, '(') + "a = 1" + std::string(levels, ')');
    };
    EXPECT_EQ(errorOf(nested(200)), "no error");
    EXPECT_EQ(errorOf(nested(201)), "more than 200 levels of '(' and '!' at position 201");
    EXPECT_EQ(errorOf(std::string(200, '!') + "a = 1"), "no error");
    EXPECT_EQ(errorOf(std::string(16000, '!') + "a = 1"),
              "more than 200 levels of '(' and '!' at position 201");
    EXPECT_TRUE(matches(std::string(200, '!') + "a = 1", {{"a", 1}}));
}

TEST(QueryLimits, WhatStandsSideBySideIsNotNested) {
    std::string query = "(a = 1)";
    while (query.size() < 16000)
        query += " || (a = 1)";
    EXPECT_FALSE(matches(query, {{"a", 2}}));
}

TEST(QueryLimits, LengthIsLimited) {
    const std::string query = "a = 1";
    EXPECT_EQ(errorOf(query + std::string(16384 - query.size(), ' ')), "no error");
    EXPECT_EQ(errorOf(query + std::string(16385 - query.size(), ' ')),
              "the query is longer than 16384 bytes at position 16384");
}

}  // namespace
