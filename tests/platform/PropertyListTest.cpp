#include "platform/PropertyList.h"

#include <gtest/gtest.h>

#include <array>
#include <bit>
#include <cmath>
#include <cstdio>
#include <cstdlib>
#include <limits>

#include "tests/platform/FileBytes.h"
#include "tests/support/TemporaryFolder.h"

using namespace platform;
using testing_support::bigEndian;
using testing_support::repeated;
using testing_support::TemporaryFolder;

namespace {

std::span<const std::byte> bytesOf(std::string_view text) {
    return std::as_bytes(std::span(text));
}

std::string textOf(std::span<const std::byte> bytes) {
    return {reinterpret_cast<const char*>(bytes.data()), bytes.size()};
}

// A binary property list of objects that are written out, the first on top, with references of one byte.
std::string binaryList(const std::vector<std::string>& objects) {
    std::string file = "bplist00";
    std::string table;
    for (const std::string& object : objects) {
        table += bigEndian(file.size(), 4);
        file += object;
    }
    const std::size_t tableOffset = file.size();
    return file + table + std::string(6, '\0') + "\x04\x01" + bigEndian(objects.size(), 8) + bigEndian(0, 8) +
           bigEndian(tableOffset, 8);
}

std::string xmlList(const std::string& content) {
    return R"(<?xml version="1.0" encoding="UTF-8"?><plist version="1.0">)" + content + "</plist>";
}

Value readFrom(std::string_view file) {
    const PropertyListResult result = propertyListWithData(bytesOf(file));
    EXPECT_EQ(result.error, "");
    return result.value.value_or("unreadable");
}

std::string errorOf(std::string_view file) {
    const PropertyListResult result = propertyListWithData(bytesOf(file));
    EXPECT_FALSE(result.value);
    return result.error;
}

std::string written(const Value& value, PropertyListFormat format) {
    return textOf(dataWithPropertyList(value, format));
}

Value afterRoundTrip(const Value& value, PropertyListFormat format) {
    return readFrom(written(value, format));
}

Value oneOfEachKind() {
    return Dictionary{{"true", true},
                      {"false", false},
                      {"integer", 42},
                      {"negative", -42},
                      {"real", 0.1},
                      {"text", "plain"},
                      {"accents", "Grüße \U0001F3AC"},
                      {"date", Date::since1970(1230767999)},
                      {"data", Data{std::byte{0}, std::byte{255}, std::byte{16}, std::byte{7}}},
                      {"array", Array{1, "two", Array{}, Dictionary{}}},
                      {"dictionary", Dictionary{{"key", "value"}, {"", ""}}},
                      {"uid", Dictionary{{"CF$UID", 70000}}}};
}

bool runs(const std::string& command) {
    return std::system((command + " >/dev/null 2>&1").c_str()) == 0;
}

std::string outputOf(const std::string& command) {
    std::string output;
    FILE* pipe = popen(command.c_str(), "r");
    std::array<char, 4096> buffer;
    for (std::size_t count; (count = fread(buffer.data(), 1, buffer.size(), pipe)) > 0;)
        output.append(buffer.data(), count);
    EXPECT_EQ(pclose(pipe), 0) << command;
    return output;
}

}  // namespace

class PropertyListInEachFormat : public testing::TestWithParam<PropertyListFormat> {
  protected:
    Value again(const Value& value) const { return afterRoundTrip(value, GetParam()); }
};

INSTANTIATE_TEST_SUITE_P(PropertyList, PropertyListInEachFormat,
                         testing::Values(PropertyListFormat::binary, PropertyListFormat::xml),
                         [](const auto& test) {
                             return test.param == PropertyListFormat::binary ? "Binary" : "XML";
                         });

TEST_P(PropertyListInEachFormat, EveryKindReadsBackAsItWasWritten) {
    EXPECT_EQ(again(oneOfEachKind()), oneOfEachKind());
}

TEST_P(PropertyListInEachFormat, IntegersKeepTheirValueAtEveryWidth) {
    using Limits = std::numeric_limits<std::int64_t>;
    Array numbers{0, Limits::max(), Limits::min()};
    for (const int bits : {7, 8, 15, 16, 31, 32, 47, 62}) {
        const std::int64_t power = std::int64_t{1} << bits;
        for (const std::int64_t number : {power - 1, power, -power, -power - 1})
            numbers.push_back(number);
    }
    EXPECT_EQ(again(numbers), Value(numbers));
}

TEST_P(PropertyListInEachFormat, RealsReadBackExactlyAndAsReals) {
    using Limits = std::numeric_limits<double>;
    const Array numbers{0.0,
                        1.0,
                        -3.0,
                        0.1,
                        1.0 / 3,
                        1e300,
                        Limits::min(),
                        1e16,
                        Limits::max(),
                        123456789.125,
                        Limits::infinity(),
                        4.9e-324,
                        -1e-7,
                        2e22,
                        -Limits::infinity()};
    EXPECT_EQ(again(numbers), Value(numbers));
    EXPECT_TRUE(std::signbit(*again(-0.0).real()));
    EXPECT_TRUE(std::isnan(*again(Limits::quiet_NaN()).real()));
}

TEST_P(PropertyListInEachFormat, KeysThatAreNoUTF8GetReplacementCharacters) {
    EXPECT_EQ(again(Dictionary{{"k\xC3", 1}}), Value(Dictionary{{"k\uFFFD", 1}}));
}

TEST_P(PropertyListInEachFormat, LineEndsAndMarkupInTextSurvive) {
    const Value text(" <a&b>\r\n\t]]> \"'é ");
    EXPECT_EQ(again(text), text);
}

TEST_P(PropertyListInEachFormat, LongContentsSurvive) {
    Array array;
    Dictionary dictionary;
    for (int i = 0; i < 70000; ++i)
        array.push_back(i);
    for (int i = 0; i < 300; ++i)
        dictionary.emplace("key" + std::to_string(i), std::string(static_cast<std::size_t>(i), 'x'));
    const Value value(Dictionary{{"array", array},
                                 {"dictionary", dictionary},
                                 {"text", std::string(200000, 'x')},
                                 {"accents", repeated("é", 70000)},
                                 {"data", Data(100000, std::byte{3})}});
    EXPECT_EQ(again(value), value);
}

TEST_P(PropertyListInEachFormat, SizesAreWrittenAsTheirText) {
    EXPECT_EQ(again(Size{1920, 1080}), Value("{1920, 1080}"));
}

TEST_P(PropertyListInEachFormat, FiveHundredAndTwelveLevelsAreReadAndNoMore) {
    Value nested = 1;
    for (int level = 0; level < 512; ++level)
        nested = Array{nested};
    EXPECT_EQ(again(nested), nested);
    EXPECT_EQ(errorOf(written(Array{nested}, GetParam())), "nested too deeply or within itself");
}

TEST(PropertyListDates, KeepFractionsInTheBinaryForm) {
    const Value date(Date::sinceReferenceDate(-1234567.875));
    EXPECT_EQ(afterRoundTrip(date, PropertyListFormat::binary), date);
}

TEST(PropertyListDates, AreWholeSecondsOfFourDigitYearsInXML) {
    const auto again = [](double seconds) {
        return afterRoundTrip(Date::since1970(seconds), PropertyListFormat::xml).date()->secondsSince1970();
    };
    EXPECT_EQ(again(-0.5), -1);
    EXPECT_EQ(again(1e30), 253402300799);
    EXPECT_EQ(again(-std::numeric_limits<double>::infinity()), -62135596800);
    EXPECT_EQ(again(std::numeric_limits<double>::quiet_NaN()), 0);
}

TEST(BinaryPropertyList, ReadsEveryKindOfObject) {
    const std::string reals = std::string("\x22") + bigEndian(std::bit_cast<std::uint32_t>(1.5f), 4);
    const std::string wide = "\x14" + bigEndian(0, 8) + bigEndian(7, 8);
    const std::string wideNegative = "\x14" + bigEndian(~0ull, 8) + bigEndian(~0ull, 8);
    const std::string tooWide = "\x14" + bigEndian(0, 8) + bigEndian(std::uint64_t{1} << 63, 8);
    EXPECT_EQ(readFrom(binaryList({std::string("\xAC\x01\x02\x03\x04\x05\x06\x07\x08\x09\x0A\x0B\x0C", 13),
                                   "\x08", "\x09", "\x10\xFF", wide, wideNegative, tooWide, reals, "\x52hi",
                                   std::string("\x62\x00\xE9\xD8\x00", 5), "\x83" + bigEndian(70000, 4),
                                   "\xC1\x02", "\xB1\x01"})),
              Value(Array{false, true, 255, 7, -1, 9223372036854775808.0, 1.5, "hi", "é\uFFFD",
                          Dictionary{{"CF$UID", 70000}}, Array{true}, Array{false}}));
}

TEST(BinaryPropertyList, TextMarkedAsASCIIMayBeUTF8) {
    EXPECT_EQ(readFrom(binaryList({"\x52é"})), Value("é"));
    EXPECT_EQ(readFrom(binaryList({"\x51\xE9"})), Value("\uFFFD"));
}

TEST(BinaryPropertyList, TextThatIsNoUTF8IsWrittenWithReplacementCharacters) {
    EXPECT_EQ(afterRoundTrip("a\xFFz", PropertyListFormat::binary), Value("a\uFFFDz"));
}

TEST(BinaryPropertyList, NullsAreLeftOut) {
    EXPECT_EQ(readFrom(binaryList({"\xA3\x01\x02\x03", std::string("\0", 1), "\x0F", "\x09"})),
              Value(Array{true}));
    EXPECT_EQ(readFrom(binaryList({"\xD1\x01\x02", "\x51k", std::string("\0", 1)})), Value(Dictionary{}));
    EXPECT_EQ(errorOf(binaryList({std::string("\0", 1)})), "there is no value");
}

TEST(BinaryPropertyList, TheFirstOfTwoEqualKeysCounts) {
    EXPECT_EQ(readFrom(binaryList({"\xD2\x01\x01\x02\x03", "\x51k", "\x09", "\x08"})),
              Value(Dictionary{{"k", true}}));
}

TEST(BinaryPropertyList, DictionariesOfOneUIDAreWrittenAsUIDs) {
    const std::string file = written(Dictionary{{"CF$UID", 300}}, PropertyListFormat::binary);
    EXPECT_EQ(file.substr(8, 3), "\x81\x01\x2C");
    EXPECT_EQ(written(Dictionary{{"CF$UID", -1}}, PropertyListFormat::binary)[8], '\xD1');
}

TEST(BinaryPropertyList, EqualTextsAreWrittenOnce) {
    const std::string text(1000, 'x');
    const std::string once = written(Array{text}, PropertyListFormat::binary);
    const std::string thrice =
        written(Array{text, text, Dictionary{{text, text}}}, PropertyListFormat::binary);
    EXPECT_LT(thrice.size(), once.size() + 20);
}

TEST(BinaryPropertyList, SharedObjectsThatGrowWithoutBoundAreRejected) {
    std::vector<std::string> doubling;
    for (char next = 1; next <= 60; ++next)
        doubling.push_back(std::string("\xA2") + next + next);
    doubling.push_back("\x09");
    EXPECT_EQ(errorOf(binaryList(doubling)), "too many values");

    const std::string longData = "\x4F\x12" + bigEndian(1 << 20, 4) + std::string(1 << 20, 'x');
    const std::string manyTimes = "\xAF\x10\xC8" + std::string(200, '\1');
    EXPECT_EQ(errorOf(binaryList({manyTimes, longData})), "too much text");
}

TEST(BinaryPropertyList, DamageIsAnError) {
    const std::string trueObject = "\x09";
    const std::string good = binaryList({trueObject});
    const auto withTrailer = [&](std::size_t offset, const std::string& bytes) {
        std::string file = good;
        return file.replace(file.size() - 32 + offset, bytes.size(), bytes);
    };
    const struct {
        std::string file;
        std::string error;
    } cases[] = {
        {"bplist00", "too short for a binary property list"},
        {"bplist16" + good.substr(8), "not a binary property list of a known version"},
        {good.substr(0, good.size() - 1), "the trailer is damaged"},
        {withTrailer(6, std::string(1, '\0')), "the trailer is damaged"},
        {withTrailer(7, "\x09"), "the trailer is damaged"},
        {withTrailer(8, bigEndian(2, 8)), "the table of objects is outside the file"},
        {withTrailer(8, bigEndian(~0ull, 8)), "the table of objects is outside the file"},
        {withTrailer(8, bigEndian(0, 8)), "a reference leads to no object"},
        {withTrailer(16, bigEndian(1, 8)), "a reference leads to no object"},
        {withTrailer(24, bigEndian(~0ull, 8)), "the table of objects is outside the file"},
        {withTrailer(24, bigEndian(7, 8)), "the table of objects is outside the file"},
        {binaryList({std::string("\xA1\x00", 2)}), "nested too deeply or within itself"},
        {binaryList({std::string("\xA2\x00\x00", 3)}), "nested too deeply or within itself"},
        {binaryList({"\xA1\x01"}), "a reference leads to no object"},
        {binaryList({"\xA5\x00"}), "an object is outside the file"},
        {binaryList({"\xAF\x13" + bigEndian(~0ull, 8)}), "an object is outside the file"},
        {binaryList({"\xDF\x13" + bigEndian(std::uint64_t{1} << 63, 8)}), "an object is outside the file"},
        {binaryList({"\x6F\x13" + bigEndian(std::uint64_t{1} << 63, 8)}), "an object is outside the file"},
        {binaryList({std::string(10000, '\x5F')}), "a count is no number"},
        {binaryList({"\x5F"}), "an object is outside the file"},
        {binaryList({"\x5F\x14" + std::string(16, '\0')}), "a count is no number"},
        {binaryList({"\x15" + std::string(32, '\0')}), "a number has an unknown size"},
        {binaryList({"\x21xx"}), "a number has an unknown size"},
        {binaryList({"\x32xxxx"}), "a number has an unknown size"},
        {binaryList({"\x8F" + std::string(16, '\0')}), "a number has an unknown size"},
        {binaryList({"\x87" + bigEndian(~0ull, 8)}), "a UID is too large"},
        {binaryList({"\x13x"}), "an object is outside the file"},
        {binaryList({"\x70"}), "an object is of an unknown kind"},
        {binaryList({"\x01"}), "an object is of an unknown kind"},
        {binaryList({"\xD1\x01\x01", "\x09"}), "a dictionary's key is no text"},
    };
    for (const auto& [file, error] : cases)
        EXPECT_EQ(errorOf(file), error) << testing::PrintToString(file.substr(0, 40));
}

TEST(BinaryPropertyList, EveryBeginningOfAFileIsAnError) {
    const std::string file = written(oneOfEachKind(), PropertyListFormat::binary);
    for (std::size_t length = 0; length < file.size(); ++length)
        EXPECT_FALSE(propertyListWithData(bytesOf(file.substr(0, length))).value) << length;
}

TEST(XMLPropertyList, ReadsHandwrittenForms) {
    EXPECT_EQ(
        readFrom("\xEF\xBB\xBF<!DOCTYPE plist PUBLIC '-//D//DTD' 'http://unreachable.invalid/x.dtd'>\n"
                 "<plist><!-- a comment --><array>\n"
                 "<integer> +0x1F </integer><integer>-12</integer><integer>18446744073709551615</integer>"
                 "<real>+1.5e3</real><real>nAn</real><real>-Infinity</real>"
                 "<string> a<![CDATA[<b>]]>&amp;&#233; </string><string/><true></true>"
                 "<data>\n\tAAEC\n\tAw==\n</data><data/><date> 2008-12-31T23:59:59Z </date>"
                 "</array></plist>\n")
            .array()
            ->size(),
        12u);
    EXPECT_EQ(readFrom(xmlList("<integer> +0x1F </integer>")), Value(31));
    EXPECT_EQ(readFrom(xmlList("<integer>18446744073709551615</integer>")), Value(18446744073709551615.0));
    EXPECT_EQ(readFrom(xmlList("<string> a<![CDATA[<b>]]>&amp;&#233; </string>")), Value(" a<b>&é "));
    EXPECT_EQ(readFrom(xmlList("<data>\n\tAAEC\n\tAw==\n</data>")),
              Value(Data{std::byte{0}, std::byte{1}, std::byte{2}, std::byte{3}}));
    EXPECT_EQ(readFrom(xmlList("<date> 2008-12-31T23:59:59Z </date>")), Value(Date::since1970(1230767999)));
}

TEST(XMLPropertyList, UTF16IsRead) {
    std::string file = "\xFE\xFF";
    for (const char c : std::string("<plist><string>x</string></plist>"))
        file += std::string(1, '\0') + c;
    EXPECT_EQ(readFrom(file), Value("x"));
}

TEST(XMLPropertyList, TheFirstOfTwoEqualKeysCounts) {
    EXPECT_EQ(readFrom(xmlList("<dict><key>k</key><true/><key>k</key><false/></dict>")),
              Value(Dictionary{{"k", true}}));
}

TEST(XMLPropertyList, MarkupLongerThanAPieceIsRead) {
    EXPECT_EQ(readFrom(xmlList("<!--" + std::string(1000000, 'x') + "--><true/>")), Value(true));
}

TEST(XMLPropertyList, TextThatXMLCannotCarryIsDataOfItsBytes) {
    const std::string texts[] = {"a\xFFz",   "\xED\xA0\x80", "\x01",     "a\x1F",
                                 "x\uFFFEy", "\uFFFF",       "line\x0B", std::string("a\0b", 3)};
    for (const std::string& text : texts) {
        const std::span bytes = bytesOf(text);
        EXPECT_EQ(afterRoundTrip(Array{text}, PropertyListFormat::xml),
                  Value(Array{Data(bytes.begin(), bytes.end())}))
            << testing::PrintToString(text);
    }
}

TEST(XMLPropertyList, TextWithEveryCharacterThatXMLCarriesStaysText) {
    for (const std::string text : {"\t", "\n", "\r", " ", "\x7F", "\u0085", "\uFFFD", "\uE000", "\U0010FFFF"})
        EXPECT_EQ(afterRoundTrip(text, PropertyListFormat::xml), Value(text)) << testing::PrintToString(text);
}

TEST(XMLPropertyList, CharactersOfKeysThatXMLCannotCarryBecomeReplacementCharacters) {
    const std::string key("a\0b\x1F\uFFFE\uFFFFz", 11);
    EXPECT_EQ(afterRoundTrip(Dictionary{{key, 1}}, PropertyListFormat::xml),
              Value(Dictionary{{"a\uFFFDb\uFFFD\uFFFD\uFFFDz", 1}}));
}

TEST(XMLPropertyList, IsWrittenWithoutADocumentType) {
    EXPECT_EQ(written(Dictionary{{"a<", Array{1, 1.5, 2.0, true, "x"}}}, PropertyListFormat::xml),
              R"(<?xml version="1.0" encoding="UTF-8"?>
<plist version="1.0">
<dict>
	<key>a&lt;</key>
	<array>
		<integer>1</integer>
		<real>1.5</real>
		<real>2</real>
		<true/>
		<string>x</string>
	</array>
</dict>
</plist>
)");
}

TEST(XMLPropertyList, DamageIsAnError) {
    const struct {
        std::string file;
        std::string error;
    } cases[] = {
        {"", "there is no value"},
        {"rubbish", "line 1: syntax error"},
        {xmlList(""), "there is no value"},
        {xmlList("<true/><true/>"), "there is more than one value"},
        {"<dict/>", "the element dict is in the wrong place"},
        {xmlList("<plist/>"), "the element plist is in the wrong place"},
        {xmlList("<string><true/></string>"), "the element true is in the wrong place"},
        {xmlList("<true><true/></true>"), "the element true is in the wrong place"},
        {xmlList("<true>x</true>"), "there is text between the elements"},
        {xmlList("<array>x</array>"), "there is text between the elements"},
        {xmlList("<set/>"), "the element set is unknown"},
        {xmlList("<dict><true/></dict>"), "a value has no key"},
        {xmlList("<dict><key>k</key></dict>"), "a key has no value"},
        {xmlList("<dict><key>k</key><key>l</key></dict>"), "a key is in the wrong place"},
        {xmlList("<array><key>k</key></array>"), "a key is in the wrong place"},
        {xmlList("<key>k</key>"), "a key is in the wrong place"},
        {xmlList("<integer>12x</integer>"), "an integer is no number"},
        {xmlList("<integer/>"), "a real is no number"},
        {xmlList("<integer>1-2</integer>"), "a real is no number"},
        {xmlList("<real>1,5</real>"), "a real is no number"},
        {xmlList("<real>0x10</real>"), "a real is no number"},
        {xmlList("<data>*</data>"), "data is not in base 64"},
        {xmlList("<date>2008-12-31</date>"), "a date is malformed"},
        {xmlList("<date>2009-02-29T00:00:00Z</date>"), "a date is malformed"},
        {xmlList("<date>2009-02-28T24:00:00Z</date>"), "a date is malformed"},
        {xmlList("<date>2009-02-28T00:00:00Zx</date>"), "a date is malformed"},
        {xmlList("<date>-009-02-28T00:00:00Z</date>"), "a date is malformed"},
        {xmlList("<date/>"), "a date is malformed"},
        {xmlList("<string>&unknown;</string>"), "line 1: undefined entity"},
        {"<!DOCTYPE plist SYSTEM 'x.dtd'><plist><string>a&unknown;b</string></plist>",
         "the entity unknown is unknown"},
        {"<!DOCTYPE plist [<!ENTITY a 'b'>]><plist><string>&a;</string></plist>", "the entity a is declared"},
        {"<!DOCTYPE plist [<!ENTITY a SYSTEM 'file:///etc/hostname'>]><plist><string>&a;</string></plist>",
         "the entity a is declared"},
        {xmlList("<true/>") + "<x/>", "line 1: junk after document element"},
        {xmlList(repeated("<array>", 10000)), "nested too deeply or within itself"},
        {xmlList("<array>" + repeated("<true/>", (1 << 20) + 1) + "</array>"), "too many values"},
        {xmlList("<" + std::string(100, 'x') + "/>"), "the element " + std::string(40, 'x') + " is unknown"},
    };
    for (const auto& [file, error] : cases)
        EXPECT_EQ(errorOf(file), error) << file.substr(0, 100);
}

TEST(XMLPropertyList, EveryBeginningOfAFileIsAnError) {
    const std::string file = written(oneOfEachKind(), PropertyListFormat::xml);
    for (std::size_t length = 0; length < file.size() - 1; ++length)
        EXPECT_FALSE(propertyListWithData(bytesOf(file.substr(0, length))).value) << length;
}

TEST_P(PropertyListInEachFormat, PythonReadsWhatIsWritten) {
    if (!runs("python3 -c 'import plistlib'"))
        GTEST_SKIP() << "needs Python 3";
    const TemporaryFolder folder;
    const Value value(Dictionary{{"accents", "Grüße \U0001F3AC"},
                                 {"array", Array{1, -1, std::int64_t{1} << 40, 1.0, 0.1, true, "x"}},
                                 {"data", Data{std::byte{0}, std::byte{255}}},
                                 {"date", Date::since1970(1230767999)},
                                 {"text", std::string(20, 'x')}});
    const std::string path = folder.writeFile("list.plist", written(value, GetParam()));
    EXPECT_EQ(outputOf("python3 -c 'import plistlib, sys; print(plistlib.load(open(sys.argv[1], \"rb\")))' " +
                       path),
              "{'accents': 'Grüße \U0001F3AC', 'array': [1, -1, 1099511627776, 1.0, 0.1, True, 'x'], "
              "'data': b'\\x00\\xff', 'date': datetime.datetime(2008, 12, 31, 23, 59, 59), "
              "'text': 'xxxxxxxxxxxxxxxxxxxx'}\n");
}

TEST_P(PropertyListInEachFormat, WhatPythonWritesIsRead) {
    if (!runs("python3 -c 'import plistlib'"))
        GTEST_SKIP() << "needs Python 3";
    const std::string format = GetParam() == PropertyListFormat::binary ? "FMT_BINARY" : "FMT_XML";
    const std::string file = outputOf(
        "python3 -c 'import datetime, plistlib, sys\n"
        "sys.stdout.buffer.write(plistlib.dumps({\"accents\": \"Gr\\u00fc\\u00dfe\", \"numbers\": [0, 255, "
        "65536, "
        "-1, 2**62, 2**63, 1.0, 0.1, False], \"data\": bytes(range(3)), \"date\": datetime.datetime(2008, "
        "12, 31), "
        "\"nested\": {\"a\": [{}, []]}}, fmt=plistlib." +
        format + "))'");
    EXPECT_EQ(readFrom(file), Value(Dictionary{{"accents", "Grüße"},
                                               {"numbers", Array{0, 255, 65536, -1, std::int64_t{1} << 62,
                                                                 9223372036854775808.0, 1.0, 0.1, false}},
                                               {"data", Data{std::byte{0}, std::byte{1}, std::byte{2}}},
                                               {"date", Date::since1970(1230681600)},
                                               {"nested", Dictionary{{"a", Array{Dictionary{}, Array{}}}}}}));
}

TEST_P(PropertyListInEachFormat, AnotherConverterAgrees) {
    if (!runs("command -v plistutil"))
        GTEST_SKIP() << "needs plistutil";
    const TemporaryFolder folder;
    const std::string path = folder.writeFile("list.plist", written(oneOfEachKind(), GetParam()));
    for (const std::string format : {"bin", "xml"})
        EXPECT_EQ(readFrom(outputOf("plistutil -f " + format + " -i " + path)), oneOfEachKind()) << format;
}
