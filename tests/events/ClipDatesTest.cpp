#include "events/ClipDates.h"

#include "tests/events/EventsTest.h"

namespace testing_support {
namespace {

constexpr std::string_view fixedFormat = "%Y-%m-%d %H;%M;%S";

class ClipDatesTest : public EventsTest {
  protected:
    // The date in a file's attribute "date", printed; "nil" for none.
    std::string dateInAttribute(std::string_view value) {
        const std::string clip = home().writeFile("clip.mov");
        setExtendedAttribute(clip, "user.date", value);
        return printed(plugin()._dateFromExtendedFileAttributeAtPath(clip));
    }
    std::string dateInName(const std::string& name) {
        return printed(reelix::PathDate::_vxMBCalendarDateFromFileName(name, plugin()));
    }
    static std::string printed(const platform::CalendarDateRef& date) {
        return date ? date->descriptionWithCalendarFormat(fixedFormat, {"en_US_POSIX"}) : "nil";
    }
};

std::string padded(std::string value, std::size_t size) {
    value.resize(size, 'x');
    return value;
}

using namespace std::string_literals;

TEST_F(ClipDatesTest, AttributeAnswersItsDateAndTime) {
    EXPECT_EQ(dateInAttribute("2009-07-04 18;30;05"), "2009-07-04 18;30;05");
}

TEST_F(ClipDatesTest, AttributeIsInTheLocalTimeZone) {
    const ScopedEnvironment zone("TZ", "TEST-2");  // two hours ahead of Greenwich
    const std::string clip = addClip("Trip/a.mov", "2009-07-04 18;30;05");
    const auto date = plugin()._dateFromExtendedFileAttributeAtPath(clip);
    ASSERT_TRUE(date);
    EXPECT_EQ(date->secondsFromGMT(), 2 * 3600);
    EXPECT_EQ(platform::iso8601String(*date), "2009-07-04T16:30:05Z");
}

TEST_F(ClipDatesTest, AttributeFormatIsFixed) {
    EXPECT_EQ(dateInAttribute("2009-07-04 18:30:05"), "nil");
    EXPECT_EQ(dateInAttribute("2009-07-04"), "nil");
    EXPECT_EQ(dateInAttribute("2009-07-04 18;30;05 "), "nil");
    EXPECT_EQ(dateInAttribute(" 2009-07-04 18;30;05"), "nil");
    EXPECT_EQ(dateInAttribute("2009-02-30 18;30;05"), "nil");
    environment.bundle->replacedStrings["ReelixClipNameFormat"] = "%d.%m.%Y";
    EXPECT_EQ(dateInAttribute("04.07.2009"), "nil");
}

TEST_F(ClipDatesTest, AttributeEndsAtItsNULOrAtItsEnd) {
    EXPECT_EQ(dateInAttribute("2009-07-04 18;30;05\0"s), "2009-07-04 18;30;05");
    EXPECT_EQ(dateInAttribute("2009-07-04 18;30;05\0more\xff"s), "2009-07-04 18;30;05");
    EXPECT_EQ(dateInAttribute("\0"s
                              "2009-07-04 18;30;05"s),
              "nil");
}

TEST_F(ClipDatesTest, AttributeOfMoreThan200BytesAnswersNil) {
    const std::string dateAndNUL = "2009-07-04 18;30;05\0"s;
    EXPECT_EQ(dateInAttribute(padded(dateAndNUL, 199)), "2009-07-04 18;30;05");
    EXPECT_EQ(dateInAttribute(padded(dateAndNUL, 200)), "2009-07-04 18;30;05");
    EXPECT_EQ(dateInAttribute(padded(dateAndNUL, 201)), "nil");
    EXPECT_EQ(dateInAttribute(padded(dateAndNUL, 1000)), "nil");
}

TEST_F(ClipDatesTest, LongAttributeWithoutNULAnswersNil) {
    for (const std::size_t size : {199, 200, 201, 1000}) {
        EXPECT_EQ(dateInAttribute(padded("2009-07-04 18;30;05", size)), "nil") << size;
        EXPECT_EQ(dateInAttribute(std::string(size, '9')), "nil") << size;
    }
}

TEST_F(ClipDatesTest, AttributeThatIsNotUTF8AnswersNil) {
    EXPECT_EQ(dateInAttribute("\xff\xfe"), "nil");
    EXPECT_EQ(dateInAttribute("2009-07-04 18;30;05\xc3"), "nil");
}

TEST_F(ClipDatesTest, EmptyAttributeAnswersNilWithoutASecondRead) {
    EXPECT_EQ(dateInAttribute(""), "nil");
    EXPECT_THAT(files.attributeReads, testing::ElementsAre(0u));
}

TEST_F(ClipDatesTest, MissingAttributeAnswersNilWithoutASecondRead) {
    const std::string clip = addClip("Trip/a.mov");
    EXPECT_EQ(plugin()._dateFromExtendedFileAttributeAtPath(clip), nullptr);
    EXPECT_EQ(plugin()._dateFromExtendedFileAttributeAtPath(home().path("missing.mov")), nullptr);
    EXPECT_THAT(files.attributeReads, testing::ElementsAre(0u, 0u));
}

TEST_F(ClipDatesTest, AttributeIsReadIntoABufferOf200Bytes) {
    dateInAttribute("2009-07-04 18;30;05");
    EXPECT_THAT(files.attributeReads, testing::ElementsAre(0u, 200u));
}

TEST_F(ClipDatesTest, AttributeOfALinksTargetCounts) {
    const std::string clip = addClip("Trip/a.mov", "2009-07-04 18;30;05");
    const std::string link = home().makeLink("link.mov", clip);
    EXPECT_EQ(printed(plugin()._dateFromExtendedFileAttributeAtPath(link)), "2009-07-04 18;30;05");
}

TEST_F(ClipDatesTest, YearOfAnAttributeIsNotChecked) {
    for (const std::string year : {"0000", "1899", "2101", "9999", "10000", "12000"})
        EXPECT_EQ(dateInAttribute(year + "-01-02 03;04;05"), year + "-01-02 03;04;05");
    EXPECT_EQ(dateInAttribute("-0001-01-02 03;04;05"), "nil");
}

TEST_F(ClipDatesTest, NameAnswersTheDateAfterThePrefix) {
    EXPECT_EQ(dateInName("clip-2009-07-04 18;30;05.mov"), "2009-07-04 18;30;05");
    EXPECT_EQ(dateInName("clip-2009-07-04 18;30;05"), "2009-07-04 18;30;05");
}

TEST_F(ClipDatesTest, OnlyTheLastExtensionOfANameIsRemoved) {
    EXPECT_EQ(dateInName("clip-2009-07-04 18;30;05.tar.mov"), "nil");
}

TEST_F(ClipDatesTest, NameWithoutThePrefixAnswersNil) {
    EXPECT_EQ(dateInName("2009-07-04 18;30;05.mov"), "nil");
    EXPECT_EQ(dateInName("clip2009-07-04 18;30;05.mov"), "nil");
    EXPECT_EQ(dateInName("my clip-2009-07-04 18;30;05.mov"), "nil");
    EXPECT_EQ(dateInName(".mov"), "nil");
    EXPECT_EQ(dateInName(""), "nil");
}

TEST_F(ClipDatesTest, PrefixInOtherCaseAnswersNil) {
    EXPECT_EQ(dateInName("Clip-2009-07-04 18;30;05.mov"), "nil");
    EXPECT_EQ(dateInName("CLIP-2009-07-04 18;30;05.mov"), "nil");
}

TEST_F(ClipDatesTest, PrefixAloneAnswersNil) {
    EXPECT_EQ(dateInName("clip-.mov"), "nil");
    EXPECT_EQ(dateInName("clip.mov"), "nil");
}

TEST_F(ClipDatesTest, NamesOfTheYears1900To2100Count) {
    for (const std::string year : {"1900", "2009", "2100"})
        EXPECT_EQ(dateInName("clip-" + year + "-01-02 03;04;05.mov"), year + "-01-02 03;04;05");
    for (const std::string year : {"-1", "0000", "1899", "2101", "9999", "10000", "12000"})
        EXPECT_EQ(dateInName("clip-" + year + "-01-02 03;04;05.mov"), "nil") << year;
    EXPECT_EQ(dateInName("clip-1899-12-31 23;59;59.mov"), "nil");
    EXPECT_EQ(dateInName("clip-2100-12-31 23;59;59.mov"), "2100-12-31 23;59;59");
}

TEST_F(ClipDatesTest, PrefixAndFormatOfNamesAreTheBundlesTexts) {
    environment.bundle->replacedStrings["ReelixClipNamePrefix"] = "película";
    environment.bundle->replacedStrings["ReelixClipNameFormat"] = "%d.%m.%Y";
    EXPECT_EQ(dateInName("película-04.07.2009.mov"), "2009-07-04 00;00;00");
    EXPECT_EQ(dateInName("clip-2009-07-04 18;30;05.mov"), "nil");
}

TEST_F(ClipDatesTest, BundleWithoutTheTextsAnswersNil) {
    environment.bundle->replacedStrings["ReelixClipNamePrefix"] = std::nullopt;
    environment.bundle->replacedStrings["ReelixClipNameFormat"] = std::nullopt;
    EXPECT_EQ(dateInName("clip-2009-07-04 18;30;05.mov"), "nil");
    EXPECT_EQ(dateInName("-2009-07-04 18;30;05.mov"), "nil");
}

TEST(NonCalendarDate, OfNilIsNil) {
    EXPECT_EQ(ExposedPlugin::_nonCalendarDateFromDate(nullptr), nullptr);
}

TEST(NonCalendarDate, OfAPlainDateIsTheSameObject) {
    const platform::DateRef plain = platform::Date::sinceReferenceDate(12.5);
    EXPECT_EQ(ExposedPlugin::_nonCalendarDateFromDate(plain), plain);
}

TEST(NonCalendarDate, OfACalendarDateIsAPlainDateOfTheSameTime) {
    const platform::DateRef calendar = std::make_shared<platform::CalendarDate>(12.5, 3600);
    const platform::DateRef plain = ExposedPlugin::_nonCalendarDateFromDate(calendar);
    ASSERT_TRUE(plain);
    EXPECT_NE(plain, calendar);
    EXPECT_EQ(std::dynamic_pointer_cast<const platform::CalendarDate>(plain), nullptr);
    EXPECT_EQ(plain->secondsSinceReferenceDate(), 12.5);
}

}  // namespace
}  // namespace testing_support
