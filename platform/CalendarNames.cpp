#include "platform/CalendarNames.h"

#include <unicode/dtfmtsym.h>
#include <unicode/gregocal.h>
#include <unicode/normalizer2.h>
#include <unicode/smpdtfmt.h>
#include <unicode/utf8.h>

#include <array>
#include <limits>
#include <vector>

#include "platform/CalendarDate.h"
#include "platform/Date.h"

namespace platform {

namespace {

using icu::UnicodeString;

// No form of any locale comes near it. Keeps hostile text from being read over and over.
constexpr std::size_t longestForm = 512;

struct Name {
    std::string text;
    UnicodeString key;  // folded and decomposed; texts with equal keys are the same name
};
using Names = std::vector<Name>;

std::string utf8(const UnicodeString& text) {
    std::string bytes;
    return text.toUTF8String(bytes);
}

UnicodeString keyOf(const UnicodeString& text) {
    UErrorCode status = U_ZERO_ERROR;
    const icu::Normalizer2* decomposing = icu::Normalizer2::getNFDInstance(status);
    if (U_FAILURE(status))
        return UnicodeString(text).foldCase();
    const UnicodeString folded = decomposing->normalize(text, status).foldCase();
    return decomposing->normalize(folded, status);
}

Names namesOf(const UnicodeString* texts, int first, int end) {
    Names names;
    for (int i = first; i < end; ++i)
        names.push_back({utf8(texts[i]), keyOf(texts[i])});
    return names;
}

// How many bytes of `text` spell the key; 0 when it begins with something else.
std::size_t lengthOfMatch(const UnicodeString& key, std::string_view text) {
    std::size_t length = 0;
    for (int32_t matched = 0; matched < key.length();) {
        if (length == text.size())
            return 0;
        UChar32 character;
        U8_NEXT_OR_FFFD(text.data(), length, text.size(), character);
        const UnicodeString next = keyOf(UnicodeString(character));
        if (key.compare(matched, next.length(), next) != 0)
            return 0;
        matched += next.length();
    }
    return length;
}

// How many bytes of `text` make its first `units` units of UTF-16.
std::size_t bytesOfUnits(std::string_view text, int32_t units) {
    std::size_t length = 0;
    while (units > 0 && length < text.size()) {
        UChar32 character;
        U8_NEXT_OR_FFFD(text.data(), length, text.size(), character);
        units -= U16_LENGTH(character);
    }
    return length;
}

// Where nobody knows the language, there are numbers in place of names: "M07".
bool hasNames(const icu::Locale& locale) {
    UErrorCode status = U_ZERO_ERROR;
    const icu::Locale found = icu::DateFormatSymbols(locale, status).getLocale(ULOC_VALID_LOCALE, status);
    return U_SUCCESS(status) && *found.getLanguage() != '\0';
}

icu::Locale gregorianLocale(const Locale& locale) {
    icu::Locale gregorian(locale.identifier.c_str());
    UErrorCode status = U_ZERO_ERROR;
    gregorian.setKeywordValue("calendar", "gregorian", status);
    if (U_FAILURE(status) || gregorian.isBogus() || !hasNames(gregorian))
        return icu::Locale("en_US_POSIX");
    return gregorian;
}

// The Gregorian calendar for all times, on a clock without a zone.
std::unique_ptr<icu::GregorianCalendar> civilCalendar(const icu::Locale& locale) {
    UErrorCode status = U_ZERO_ERROR;
    auto calendar = std::make_unique<icu::GregorianCalendar>(*icu::TimeZone::getGMT(), locale, status);
    calendar->setGregorianChange(-std::numeric_limits<UDate>::max(), status);
    calendar->clear();
    return calendar;
}

std::unique_ptr<const icu::DateFormat> formatFor(LocaleForm form, const icu::Locale& locale) {
    using icu::DateFormat;
    const auto date = form == LocaleForm::time ? DateFormat::kNone : DateFormat::kMedium;
    const auto time = form == LocaleForm::date ? DateFormat::kNone : DateFormat::kMedium;
    std::unique_ptr<DateFormat> format(DateFormat::createDateTimeInstance(date, time, locale));
    if (format)
        format->adoptCalendar(civilCalendar(locale).release());
    return format;
}

// nil when the fields are no date or time.
std::optional<CivilTime> civilTimeOf(const icu::Calendar& calendar) {
    UErrorCode status = U_ZERO_ERROR;
    CivilTime time;
    time.year = calendar.get(UCAL_EXTENDED_YEAR, status);
    time.month = calendar.get(UCAL_MONTH, status) + 1;
    time.day = calendar.get(UCAL_DATE, status);
    time.hour = calendar.get(UCAL_HOUR_OF_DAY, status);
    time.minute = calendar.get(UCAL_MINUTE, status);
    time.second = calendar.get(UCAL_SECOND, status);
    return U_SUCCESS(status) ? std::optional(time) : std::nullopt;
}

}  // namespace

struct CalendarNames::Tables {
    explicit Tables(const icu::Locale& locale);

    const Names& names(NameKind kind) const { return namesByKind[static_cast<std::size_t>(kind)]; }
    const icu::DateFormat* format(LocaleForm form) const {
        return formats[static_cast<std::size_t>(form)].get();
    }

    std::array<Names, 5> namesByKind;  // in the order of NameKind
    std::array<std::unique_ptr<const icu::DateFormat>, 3>
        formats;                                             // in the order of LocaleForm; any may be nil
    std::unique_ptr<icu::GregorianCalendar> strictCalendar;  // refuses fields that are out of range
};

CalendarNames::Tables::Tables(const icu::Locale& locale)
    : formats{formatFor(LocaleForm::dateAndTime, locale), formatFor(LocaleForm::date, locale),
              formatFor(LocaleForm::time, locale)},
      strictCalendar(civilCalendar(locale)) {
    strictCalendar->setLenient(false);
    UErrorCode status = U_ZERO_ERROR;
    const icu::DateFormatSymbols symbols(locale, status);
    int32_t count = 0;
    const auto counted = [&](const UnicodeString* texts, int first = 0) {
        return namesOf(texts, first, count);
    };
    constexpr int sunday = UCAL_SUNDAY;  // there is no day 0
    namesByKind = {counted(symbols.getMonths(count)), counted(symbols.getShortMonths(count)),
                   counted(symbols.getWeekdays(count), sunday),
                   counted(symbols.getShortWeekdays(count), sunday), counted(symbols.getAmPmStrings(count))};
}

std::shared_ptr<const CalendarNames> CalendarNames::ofLocale(const Locale& locale) {
    struct Last {
        std::string identifier;
        std::shared_ptr<const CalendarNames> names;
    };
    thread_local Last last;
    if (!last.names || last.identifier != locale.identifier) {
        last.names.reset(new CalendarNames(locale));
        last.identifier = locale.identifier;
    }
    return last.names;
}

CalendarNames::CalendarNames(const Locale& locale)
    : tables_(std::make_unique<const Tables>(gregorianLocale(locale))) {}

CalendarNames::~CalendarNames() = default;

std::string_view CalendarNames::name(NameKind kind, int index) const {
    const Names& names = tables_->names(kind);
    const auto position = static_cast<std::size_t>(index);
    return position < names.size() ? names[position].text : std::string_view();
}

std::optional<CalendarNames::Match> CalendarNames::match(NameKind kind, std::string_view text) const {
    const Names& names = tables_->names(kind);
    Match longest{0, 0};
    for (std::size_t i = 0; i < names.size(); ++i) {
        const std::size_t length = lengthOfMatch(names[i].key, text);
        if (length > longest.length)
            longest = {static_cast<int>(i), length};
    }
    return longest.length > 0 ? std::optional(longest) : std::nullopt;
}

std::string CalendarNames::print(LocaleForm form, const CivilTime& time) const {
    constexpr int lastYear = 5'000'000;  // ICU counts a few hundred thousand years more
    const icu::DateFormat* format = tables_->format(form);
    if (!format || time.year > lastYear || time.year < -lastYear)
        return {};
    UnicodeString text;
    format->format(
        (static_cast<double>(secondsOf(time)) + Date::secondsFrom1970ToReferenceDate) * U_MILLIS_PER_SECOND,
        text);
    return utf8(text);
}

std::optional<CalendarNames::FormMatch> CalendarNames::parse(LocaleForm form, std::string_view text) const {
    const icu::DateFormat* format = tables_->format(form);
    if (!format)
        return std::nullopt;
    text = text.substr(0, longestForm);
    const std::unique_ptr<icu::Calendar> calendar(tables_->strictCalendar->clone());
    icu::ParsePosition end;
    format->parse(UnicodeString::fromUTF8({text.data(), static_cast<int32_t>(text.size())}), *calendar, end);
    const std::optional<CivilTime> time = civilTimeOf(*calendar);
    if (end.getIndex() == 0 || !time)
        return std::nullopt;
    return FormMatch{*time, bytesOfUnits(text, end.getIndex())};
}

}  // namespace platform
