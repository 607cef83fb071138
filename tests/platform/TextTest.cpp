#include "platform/Text.h"

#include <gtest/gtest.h>

#include <random>

#include "tests/support/TemporaryFolder.h"

namespace platform {
namespace {

constexpr auto ascending = ComparisonResult::ascending;
constexpr auto same = ComparisonResult::same;
constexpr auto descending = ComparisonResult::descending;

TEST(TextTest, OppositeTurnsTheOrderRound) {
    EXPECT_EQ(opposite(ascending), descending);
    EXPECT_EQ(opposite(descending), ascending);
    EXPECT_EQ(opposite(same), same);
}

TEST(TextTest, CaseDoesNotCount) {
    EXPECT_EQ(caseInsensitiveCompare("beach", "Camping"), ascending);
    EXPECT_EQ(caseInsensitiveCompare("Camping", "beach"), descending);
    EXPECT_EQ(caseInsensitiveCompare("BEACH", "beach"), same);
    EXPECT_EQ(caseInsensitiveCompare("ÄRGER", "ärger"), same);
    EXPECT_EQ(caseInsensitiveCompare("straße", "STRASSE"), same);
    EXPECT_EQ(caseInsensitiveCompare("ΣΑΣ", "σας"), same);
}

TEST(TextTest, TheShorterOfTwoThatBeginAlikeComesFirst) {
    EXPECT_EQ(caseInsensitiveCompare("", ""), same);
    EXPECT_EQ(caseInsensitiveCompare("", "a"), ascending);
    EXPECT_EQ(caseInsensitiveCompare("Event", "event 1"), ascending);
    EXPECT_EQ(caseInsensitiveCompare("é", "É1"), ascending);
}

TEST(TextTest, LettersCompareAsTheirLowerCase) {
    EXPECT_EQ(caseInsensitiveCompare("_", "a"), ascending);
    EXPECT_EQ(caseInsensitiveCompare("_", "A"), ascending);
    EXPECT_EQ(caseInsensitiveCompare("_é", "Aé"), ascending);
    EXPECT_EQ(caseInsensitiveCompare("[", "Z"), ascending);
}

TEST(TextTest, CompositionDoesNotCount) {
    EXPECT_EQ(caseInsensitiveCompare("caf\u00E9", "cafe\u0301"), same);
    EXPECT_EQ(caseInsensitiveCompare("CAF\u00C9", "cafe\u0301"), same);
    EXPECT_EQ(caseInsensitiveCompare("\u1E69", "s\u0307\u0323"), same);
    EXPECT_EQ(caseInsensitiveCompare("\uAC01", "\u1100\u1161\u11A8"), same);
    EXPECT_EQ(caseInsensitiveCompare("cafe", "caf\u00E9"), ascending);
}

TEST(TextTest, TheLocaleDoesNotCount) {
    const testing_support::ScopedEnvironment turkish("LC_ALL", "tr_TR.UTF-8");
    EXPECT_EQ(caseInsensitiveCompare("TITLE", "title"), same);
    EXPECT_EQ(caseInsensitiveCompare("TITLE é", "title É"), same);
    EXPECT_NE(caseInsensitiveCompare("t\u0131tle", "title"), same);
    EXPECT_NE(caseInsensitiveCompare("t\u0131tle", "TITLE"), same);
}

TEST(TextTest, CharactersBeyondTheBasicPlaneComeLast) {
    EXPECT_EQ(caseInsensitiveCompare("\uFFEE", "\U00010400"), ascending);
    EXPECT_EQ(caseInsensitiveCompare("\U00010400", "\U00010428"), same);
}

TEST(TextTest, NulIsACharacter) {
    using namespace std::string_view_literals;
    EXPECT_EQ(caseInsensitiveCompare("a\0b"sv, "A\0B"sv), same);
    EXPECT_EQ(caseInsensitiveCompare("a\0b"sv, "a\0c"sv), ascending);
    EXPECT_EQ(caseInsensitiveCompare("a"sv, "a\0"sv), ascending);
    EXPECT_EQ(caseInsensitiveCompare("é\0b"sv, "É\0c"sv), ascending);
    EXPECT_EQ(caseInsensitiveCompare("é"sv, "É\0"sv), ascending);
}

TEST(TextTest, BytesThatAreNotUTF8CompareAsTheReplacementCharacter) {
    EXPECT_EQ(caseInsensitiveCompare("a\xFF", "A\uFFFD"), same);
    EXPECT_EQ(caseInsensitiveCompare("\xE4rger", "\xF6rger"), same);
    EXPECT_EQ(caseInsensitiveCompare("\xE4", "z"), descending);
}

// Characters that fold, decompose or reorder in unusual ways, and bytes that are none.
const std::vector<std::string>& unusualPieces() {
    static const std::vector<std::string> pieces = {
        "a",          "A",          "b",          "z",          "_",      "ß",      "ss",
        "\u1E9E",     "\u0301",     "\u0323",     "\u0345",     "\u1FB3", "\u03B1", "\u03B9",
        "\u0399",     "\u0390",     "\u1FD3",     "\u0130",     "\u0131", "i",      "I",
        "\u0307",     "\u00E9",     "\u00C9",     "\uFB00",     "f",      "\u1100", "\u1161",
        "\u11A8",     "\uAC00",     "\uAC01",     "\u212B",     "\u00C5", "\u00E5", "\u2126",
        "\u03C9",     "\u0F73",     "\u0F71",     "\u0F72",     "\u0344", "\u0308", "\u1F80",
        "\u1F88",     "\u1FF7",     "\u017F",     "\u1E9B",     "\uFFFD", "\xFF",   "\xED\xA0\x80",
        "\U00010400", "\U00010428", "\U0001D15E", "\U0002F800", "\u0149", "\u01F0", "\uFFFF",
    };
    return pieces;
}

std::string randomText(std::mt19937& random) {
    std::string text;
    for (unsigned pieces = random() % 6; pieces > 0; --pieces)
        text += unusualPieces()[random() % unusualPieces().size()];
    return text;
}

// Sorting with an order that contradicts itself is undefined behaviour, so this must hold for any names.
TEST(TextTest, TheOrderNeverContradictsItself) {
    std::mt19937 random(2009);
    for (int i = 0; i < 300'000; ++i) {
        const std::string a = randomText(random);
        const std::string b = randomText(random);
        const std::string c = randomText(random);
        const auto ab = caseInsensitiveCompare(a, b);
        ASSERT_EQ(caseInsensitiveCompare(a, a), same);
        ASSERT_EQ(caseInsensitiveCompare(b, a), opposite(ab)) << testing::PrintToString(std::pair(a, b));
        if (const auto bc = caseInsensitiveCompare(b, c); ab != descending && bc != descending) {
            const auto expected = ab == same ? bc : ascending;
            ASSERT_EQ(caseInsensitiveCompare(a, c), expected) << testing::PrintToString(std::tuple(a, b, c));
        }
    }
}

TEST(TextTest, PlainTextComparesAsItDoesAmongOtherText) {
    std::mt19937 random(1);
    const auto anyASCII = [&] {
        std::string text(random() % 4, ' ');
        for (char& letter : text)
            letter = static_cast<char>(random() % 128);
        return text;
    };
    for (int i = 0; i < 100'000; ++i) {
        const std::string a = anyASCII();
        const std::string b = anyASCII();
        ASSERT_EQ(caseInsensitiveCompare(a, b), caseInsensitiveCompare("\u00FC" + a, "\u00DC" + b))
            << testing::PrintToString(std::pair(a, b));
    }
}

struct NotUTF8 {
    std::string_view bytes;
    std::string_view valid;
};

TEST(TextTest, WhatIsNotUTF8IsReplaced) {
    using namespace std::string_view_literals;
    const NotUTF8 samples[] = {
        {"a\xFF"
         "b",
         "a\uFFFDb"},
        {"\xC0\xAF", "\uFFFD\uFFFD"},                      // overlong
        {"\xE0\x80\xAF", "\uFFFD\uFFFD\uFFFD"},            // overlong
        {"\xED\xA0\x80", "\uFFFD\uFFFD\uFFFD"},            // a surrogate
        {"\xF4\x90\x80\x80", "\uFFFD\uFFFD\uFFFD\uFFFD"},  // above U+10FFFF
        {"\xE2\x82", "\uFFFD"},                            // cut off
        {"\xE2\x82x", "\uFFFDx"},
        {"\x80\x80", "\uFFFD\uFFFD"},
    };
    for (const NotUTF8& sample : samples) {
        EXPECT_FALSE(isValidUTF8(sample.bytes)) << testing::PrintToString(sample.bytes);
        EXPECT_EQ(validUTF8(sample.bytes), sample.valid) << testing::PrintToString(sample.bytes);
    }
}

TEST(TextTest, WhatIsUTF8StaysAsItIs) {
    using namespace std::string_view_literals;
    for (const auto text : {""sv, "a"sv, "a\0b"sv, "é\u0301"sv, "\U0010FFFF"sv, "\uFFFF"sv, "\uFEFFx"sv}) {
        EXPECT_TRUE(isValidUTF8(text));
        EXPECT_EQ(validUTF8(text), text);
    }
}

TEST(TextTest, RandomBytesBecomeValidOnce) {
    std::mt19937 random(3);
    for (int i = 0; i < 20'000; ++i) {
        std::string bytes(random() % 12, '\0');
        for (char& byte : bytes)
            byte = static_cast<char>(random());
        const std::string valid = validUTF8(bytes);
        ASSERT_TRUE(isValidUTF8(valid)) << testing::PrintToString(bytes);
        ASSERT_EQ(valid == bytes, isValidUTF8(bytes)) << testing::PrintToString(bytes);
        ASSERT_EQ(caseInsensitiveCompare(valid, bytes), same) << testing::PrintToString(bytes);
    }
}

TEST(TextTest, AFormatTakesTwoNumbers) {
    EXPECT_EQ(stringWithFormat("%ld:%02ld", 2, 5), "2:05");
    EXPECT_EQ(stringWithFormat("%2$ld/%1$ld", 2, 5), "5/2");
    EXPECT_EQ(stringWithFormat("%ld %%", -60, 5), "-60 %");
    EXPECT_EQ(stringWithFormat("DurationString", 2, 5), "DurationString");
    EXPECT_EQ(stringWithFormat("", 2, 5), "");
}

TEST(TextTest, AFormatThatAsksForOtherValuesIsAnsweredAsItIs) {
    for (const std::string format : {"%s", "%ld:%02ld:%ld", "%ld%n", "%", "%3$ld", "%ld:%q"})
        EXPECT_EQ(stringWithFormat(format, 2, 5), format);
}

}  // namespace
}  // namespace platform
