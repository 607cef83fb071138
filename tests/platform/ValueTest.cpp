#include "platform/Value.h"

#include <gtest/gtest.h>

#include <clocale>
#include <cmath>
#include <cstdlib>
#include <limits>

#include "tests/support/TemporaryFolder.h"

using namespace platform;
using testing_support::ScopedEnvironment;
using testing_support::TemporaryFolder;

namespace {

double numberOf(const char* text) {
    return *Value(text).doubleValue();
}

}  // namespace

TEST(Value, TextCountsByTheNumberItBeginsWith) {
    EXPECT_EQ(numberOf("0.7abc"), 0.7);
    EXPECT_EQ(numberOf("abc"), 0.0);
    EXPECT_EQ(numberOf(""), 0.0);
    EXPECT_EQ(numberOf(" \t\n12 13"), 12.0);
    EXPECT_EQ(numberOf("-.5"), -0.5);
    EXPECT_EQ(numberOf("+5."), 5.0);
    EXPECT_EQ(numberOf("1e3"), 1000.0);
    EXPECT_EQ(numberOf("1e"), 1.0);
    EXPECT_EQ(numberOf("1,5"), 1.0);
    EXPECT_EQ(numberOf("+-5"), 0.0);
    EXPECT_EQ(numberOf("- 5"), 0.0);
    EXPECT_EQ(numberOf("."), 0.0);
}

TEST(Value, WordsAndHexadecimalDigitsAreNoNumbers) {
    for (const char* text : {"inf", "-inf", "nan", "infinity", "0x10", "-0x1p4", "nan(1)"})
        EXPECT_EQ(numberOf(text), 0.0) << text;
}

TEST(Value, TextBeyondTheRangeOfDoublesIsInfiniteOrZero) {
    EXPECT_EQ(numberOf("1e999"), std::numeric_limits<double>::infinity());
    EXPECT_EQ(numberOf("-1e999x"), -std::numeric_limits<double>::infinity());
    EXPECT_EQ(numberOf("1e-999"), 0.0);
    EXPECT_EQ(numberOf("4.9e-324"), 4.9e-324);
}

TEST(Value, NumbersOfTextAndSizesIgnoreTheLocale) {
    const TemporaryFolder folder;
    const std::string compile =
        "localedef -i de_DE -f UTF-8 " + folder.path("de_DE.UTF-8") + " >/dev/null 2>&1";
    if (std::system(compile.c_str()) != 0)
        GTEST_SKIP() << "needs the sources of locales";
    const ScopedEnvironment path("LOCPATH", folder.path().c_str());
    ASSERT_NE(std::setlocale(LC_ALL, "de_DE.UTF-8"), nullptr);
    ASSERT_STREQ(std::localeconv()->decimal_point, ",");
    EXPECT_EQ(numberOf("0.5"), 0.5);
    EXPECT_EQ(numberOf("1,5"), 1.0);
    EXPECT_EQ(numberOf("1.5e999"), std::numeric_limits<double>::infinity());
    EXPECT_EQ(stringFromSize({0.5, 10000}), "{0.5, 10000}");
    std::setlocale(LC_ALL, "C");
}

TEST(Value, OnlyNumbersAndTextHaveANumericValue) {
    EXPECT_EQ(Value(true).doubleValue(), 1.0);
    EXPECT_EQ(Value(-3).doubleValue(), -3.0);
    EXPECT_EQ(Value(0.25).doubleValue(), 0.25);
    for (const Value& value : {Value(Array{}), Value(Dictionary{}), Value(Data{}), Value(Size{1, 1}),
                               Value(Date::sinceReferenceDate(1))}) {
        EXPECT_EQ(value.doubleValue(), std::nullopt);
        EXPECT_EQ(value.boolValue(), std::nullopt);
    }
}

TEST(Value, WholeNumbersAreCutOffTowardZero) {
    EXPECT_EQ(Value(7.9).intValue(), 7);
    EXPECT_EQ(Value(-7.9).intValue(), -7);
    EXPECT_EQ(Value(true).intValue(), 1);
    EXPECT_EQ(Value("7.9").intValue(), 7);
    EXPECT_EQ(Value(" \t+7abc").intValue(), 7);
    EXPECT_EQ(Value("-7").intValue(), -7);
    for (const char* text : {"", "abc", "+", "-", "+-7", "- 7", ".7"})
        EXPECT_EQ(Value(text).intValue(), 0) << text;
}

TEST(Value, WholeNumbersAreKeptWithinTheirType) {
    constexpr auto least = std::numeric_limits<std::int64_t>::min();
    constexpr auto largest = std::numeric_limits<std::int64_t>::max();
    EXPECT_EQ(Value(largest).intValue(), largest);
    EXPECT_EQ(Value("9223372036854775807").intValue(), largest);
    EXPECT_EQ(Value("9223372036854775808").intValue(), largest);
    EXPECT_EQ(Value("-9223372036854775809").intValue(), least);
    EXPECT_EQ(Value(1e300).intValue(), largest);
    EXPECT_EQ(Value(-1e300).intValue(), least);
    EXPECT_EQ(Value(std::nan("")).intValue(), 0);
}

TEST(Value, OnlyNumbersAndTextHaveAWholeNumber) {
    EXPECT_EQ(Value(Array{7}).intValue(), std::nullopt);
    EXPECT_EQ(Value(Size{7, 7}).intValue(), std::nullopt);
}

TEST(Value, TruthComesFromNumbersAndFromTextThatAffirms) {
    for (const Value& value : {Value(true), Value(2), Value(-0.5), Value("YES"), Value("y"), Value(" true"),
                               Value("T"), Value("1"), Value("0.5"), Value("-1")})
        EXPECT_EQ(value.boolValue(), true);
    for (const Value& value : {Value(false), Value(0), Value(-0.0), Value("no"), Value("false"), Value(""),
                               Value("0"), Value("0.0"), Value("nay")})
        EXPECT_EQ(value.boolValue(), false);
}

TEST(Value, EachKindIsReadAsItselfAlone) {
    const Value text("a");
    EXPECT_EQ(*text.string(), "a");
    EXPECT_EQ(text.boolean(), nullptr);
    EXPECT_EQ(text.integer(), nullptr);
    EXPECT_EQ(text.real(), nullptr);
    EXPECT_EQ(text.size(), nullptr);
    EXPECT_EQ(text.date(), nullptr);
    EXPECT_EQ(text.data(), nullptr);
    EXPECT_EQ(text.array(), nullptr);
    EXPECT_EQ(text.dictionary(), nullptr);

    EXPECT_EQ(*Value(Size{1, 2}).size(), (Size{1, 2}));
    EXPECT_EQ(Value(Date::sinceReferenceDate(5)).date()->secondsSinceReferenceDate(), 5);
    const Value data(Data{std::byte{7}});
    EXPECT_EQ(*data.data(), Data{std::byte{7}});
}

TEST(Value, CopiesShareTheirContainer) {
    const Value array(Array{1, 2});
    const Value copy = array;
    EXPECT_EQ(copy.array(), array.array());
}

TEST(Value, ContainersAndDatesCompareByContent) {
    const auto make = [](double time) {
        return Value(Dictionary{{"list", Array{1, "two", Date::sinceReferenceDate(time)}}});
    };
    EXPECT_EQ(make(3), make(3));
    EXPECT_NE(make(3), make(4));
    EXPECT_EQ(Value(Data{std::byte{1}}), Value(Data{std::byte{1}}));
}

TEST(Value, ValuesOfDifferentKindsDiffer) {
    EXPECT_NE(Value(1), Value(1.0));
    EXPECT_NE(Value(1), Value(true));
    EXPECT_NE(Value("1"), Value(1));
    EXPECT_NE(Value(Array{}), Value(Dictionary{}));
}

TEST(Value, FindAnswersNilForAMissingKey) {
    const Dictionary dictionary{{"a", 1}};
    EXPECT_EQ(*find(dictionary, "a"), Value(1));
    EXPECT_EQ(find(dictionary, "b"), nullptr);
}

TEST(Value, SizesArePrintedWithAsFewDigitsAsTellThemApart) {
    EXPECT_EQ(stringFromSize({1920, 1080}), "{1920, 1080}");
    EXPECT_EQ(stringFromSize({12.5, 3}), "{12.5, 3}");
    EXPECT_EQ(stringFromSize({0.1, -1.0 / 3}), "{0.1, -0.3333333333333333}");
    EXPECT_EQ(stringFromSize({1e6, 1e20}), "{1000000, 1e+20}");
    EXPECT_EQ(stringFromSize({}), "{0, 0}");
}
