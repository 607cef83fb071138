#include "framework/BundleStrings.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <filesystem>
#include <thread>

#include "framework/FrameworkResources.h"
#include "tests/support/HostEnvironment.h"
#include "tests/support/TemporaryFolder.h"

namespace vexo {
namespace {

using testing::HasSubstr;
using testing::IsEmpty;
using testing::Optional;
using testing_support::ScopedEnvironment;

constexpr std::string_view sample =
    "[Strings]\n"
    "Greeting=Hello\n"
    "Greeting[de]=Hallo\n"
    "Greeting[pt_BR]=Oi\n"
    "Greeting[sr@latin]=Zdravo\n"
    "Prefix=clip\n"
    "Foreign[de]=Fremd\n";

// The environment that says which languages the user reads.
class BundleStringsTest : public testing::Test {
  protected:
    static std::optional<std::string> greeting() {
        return BundleStrings::withData(sample, "sample").stringForKey("Greeting");
    }

  private:
    const ScopedEnvironment language_{"LANGUAGE", nullptr};
    const ScopedEnvironment all_{"LC_ALL", nullptr};
    const ScopedEnvironment messages_{"LC_MESSAGES", nullptr};
    const ScopedEnvironment lang_{"LANG", nullptr};
};

TEST_F(BundleStringsTest, AreEnglishWhereNoLanguageIsSet) {
    EXPECT_THAT(greeting(), Optional(std::string("Hello")));
}

TEST_F(BundleStringsTest, FollowTheLanguageOfTheEnvironment) {
    const ScopedEnvironment lang("LANG", "de_AT.UTF-8");
    EXPECT_THAT(greeting(), Optional(std::string("Hallo")));
}

TEST_F(BundleStringsTest, NeedNoInstalledLocale) {
    const ScopedEnvironment lang("LANG", "pt_BR.ISO-8859-99");
    EXPECT_THAT(greeting(), Optional(std::string("Oi")));
}

TEST_F(BundleStringsTest, KnowLanguagesByTheirModifier) {
    const ScopedEnvironment lang("LANG", "sr_RS@latin");
    EXPECT_THAT(greeting(), Optional(std::string("Zdravo")));
}

TEST_F(BundleStringsTest, ARegionsTranslationIsNotForOtherRegions) {
    const ScopedEnvironment lang("LANG", "pt_PT.UTF-8");
    EXPECT_THAT(greeting(), Optional(std::string("Hello")));
}

TEST_F(BundleStringsTest, TheMoreSpecificVariableWins) {
    const ScopedEnvironment lang("LANG", "fr_FR.UTF-8");
    const ScopedEnvironment messages("LC_MESSAGES", "pt_BR.UTF-8");
    EXPECT_THAT(greeting(), Optional(std::string("Oi")));
    const ScopedEnvironment all("LC_ALL", "sr@latin");
    EXPECT_THAT(greeting(), Optional(std::string("Zdravo")));
    const ScopedEnvironment language("LANGUAGE", "de");
    EXPECT_THAT(greeting(), Optional(std::string("Hallo")));
}

TEST_F(BundleStringsTest, TakeTheFirstLanguageThatHasATranslation) {
    const ScopedEnvironment language("LANGUAGE", "fr:pt_BR:de");
    EXPECT_THAT(greeting(), Optional(std::string("Oi")));
}

TEST_F(BundleStringsTest, EnglishInTheListOfLanguagesComesBeforeThoseAfterIt) {
    const ScopedEnvironment language("LANGUAGE", "fr:en_GB:de");
    EXPECT_THAT(greeting(), Optional(std::string("Hello")));
}

TEST_F(BundleStringsTest, FollowAChangeOfLanguageAfterTheyWereLoaded) {
    const BundleStrings strings = BundleStrings::withData(sample, "sample");
    EXPECT_THAT(strings.stringForKey("Greeting"), Optional(std::string("Hello")));
    const ScopedEnvironment lang("LANG", "de_DE.UTF-8");
    EXPECT_THAT(strings.stringForKey("Greeting"), Optional(std::string("Hallo")));
}

TEST_F(BundleStringsTest, ATextWithoutTranslationIsTheSameInEveryLanguage) {
    const ScopedEnvironment lang("LANG", "de_DE.UTF-8");
    EXPECT_THAT(BundleStrings::withData(sample, "sample").stringForKey("Prefix"),
                Optional(std::string("clip")));
}

TEST_F(BundleStringsTest, AMissingKeyHasNoText) {
    const BundleStrings strings = BundleStrings::withData(sample, "sample");
    EXPECT_EQ(strings.stringForKey("Missing"), std::nullopt);
    EXPECT_EQ(strings.stringForKey(""), std::nullopt);
    EXPECT_EQ(strings.stringForKey("Greeting[de]"), std::nullopt);
    EXPECT_THAT(strings.warning(), IsEmpty());
}

TEST_F(BundleStringsTest, AKeyWithoutEnglishTextIsMissingInEveryLanguage) {
    const BundleStrings strings = BundleStrings::withData(sample, "sample");
    EXPECT_EQ(strings.stringForKey("Foreign"), std::nullopt);
    const ScopedEnvironment lang("LANG", "de_DE.UTF-8");
    EXPECT_EQ(strings.stringForKey("Foreign"), std::nullopt);
}

TEST_F(BundleStringsTest, EscapesStandForTheirCharacters) {
    const auto strings = BundleStrings::withData("[Strings]\nLines=one\\ntwo\\s\n", "sample");
    EXPECT_THAT(strings.stringForKey("Lines"), Optional(std::string("one\ntwo ")));
}

TEST_F(BundleStringsTest, WhatIsNoKeyFileHasNoTextAndAWarning) {
    using namespace std::string_view_literals;
    for (std::string_view data :
         {""sv, "Greeting=Hello\n"sv, "[Other]\nGreeting=Hello\n"sv, "\0\0\0"sv, "[Strings\n"sv}) {
        const BundleStrings strings = BundleStrings::withData(data, "broken.ini");
        EXPECT_EQ(strings.stringForKey("Greeting"), std::nullopt) << data;
        EXPECT_THAT(strings.warning(), HasSubstr("broken.ini")) << data;
    }
}

TEST_F(BundleStringsTest, ADamagedTextIsMissingAndWarnedOfAndTheOthersStay) {
    const auto strings =
        BundleStrings::withData("[Strings]\nBad=\xff\xfe\nEscape=\\q\nGood=fine\n", "sample.ini");
    EXPECT_EQ(strings.stringForKey("Bad"), std::nullopt);
    EXPECT_EQ(strings.stringForKey("Escape"), std::nullopt);
    EXPECT_THAT(strings.stringForKey("Good"), Optional(std::string("fine")));
    EXPECT_EQ(strings.warning(), "sample.ini: the text of Bad is damaged");
}

TEST_F(BundleStringsTest, AreReadFromAFile) {
    const testing_support::HostEnvironment host;
    const testing_support::TemporaryFolder& folder = host.home;
    const auto strings = BundleStrings::withContentsOfFile(folder.writeFile("Strings.ini", sample));
    EXPECT_THAT(strings.stringForKey("Greeting"), Optional(std::string("Hello")));
    EXPECT_THAT(strings.warning(), IsEmpty());
}

TEST_F(BundleStringsTest, AFileThatCannotBeReadHasNoTextAndAWarning) {
    const testing_support::HostEnvironment host;
    const testing_support::TemporaryFolder& folder = host.home;
    const std::string huge = folder.writeFile("huge.ini", sample);
    std::filesystem::resize_file(huge, 1024 * 1024 + 1);
    for (const std::string& path :
         {folder.path("missing.ini"), folder.makeFolder("folder.ini"), folder.makeFifo("pipe.ini"), huge}) {
        const BundleStrings strings = BundleStrings::withContentsOfFile(path);
        EXPECT_EQ(strings.stringForKey("Greeting"), std::nullopt) << path;
        EXPECT_THAT(strings.warning(), HasSubstr(path));
    }
}

TEST_F(BundleStringsTest, AreReadOnManyThreadsAtOnce) {
    const ScopedEnvironment lang("LANG", "de_DE.UTF-8");
    const BundleStrings strings = BundleStrings::withData(sample, "sample");
    std::vector<std::thread> threads;
    for (int i = 0; i < 4; ++i) {
        threads.emplace_back([&] {
            for (int repeat = 0; repeat < 200; ++repeat)
                EXPECT_EQ(strings.stringForKey("Greeting"), "Hallo");
        });
    }
    for (auto& thread : threads)
        thread.join();
}

TEST_F(BundleStringsTest, TheFrameworksOwnDurationIsMinutesAndTwoDigitsOfSeconds) {
    EXPECT_THAT(frameworkStrings().warning(), IsEmpty());
    EXPECT_THAT(frameworkStrings().stringForKey("DurationString"), Optional(std::string("%ld:%02ld")));
}

}  // namespace
}  // namespace vexo
