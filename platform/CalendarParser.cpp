#include "platform/CalendarParser.h"

#include <algorithm>

namespace platform {

namespace {

constexpr int longestYear = 9;  // digits
constexpr int noonInHalves = 12;

bool isDigit(char byte) {
    return byte >= '0' && byte <= '9';
}

bool isLetter(char byte) {
    return (byte >= 'a' && byte <= 'z') || (byte >= 'A' && byte <= 'Z');
}

template <typename Predicate>
std::size_t countLeading(std::string_view text, Predicate&& predicate) {
    return static_cast<std::size_t>(std::find_if_not(text.begin(), text.end(), predicate) - text.begin());
}

}  // namespace

std::optional<CivilTime> ParsedFields::civilTime() const {
    CivilTime time;
    time.year = year;
    time.month = month.value_or(1);
    time.day = day.value_or(1);
    if (dayOfYear && !month && !day)
        time = dateOfDayOfYear(year, *dayOfYear);
    if (time.year != year)  // day 366 of a year that has 365
        return std::nullopt;
    time.hour = hour.value_or(hourOfHalfDay.value_or(0) % noonInHalves + (isAfternoon ? noonInHalves : 0));
    time.minute = minute;
    time.second = second;
    return isValid(time) ? std::optional(time) : std::nullopt;
}

std::optional<ParsedFields> CalendarParser::parse(const CalendarFormat& format) {
    for (const CalendarFormat::Piece& piece : format.pieces()) {
        if (!(piece.isConversion() ? readConversion(piece) : readLiteral(piece.literal)))
            return std::nullopt;
    }
    return rest_.empty() ? std::optional(fields_) : std::nullopt;
}

bool CalendarParser::readConversion(const CalendarFormat::Piece& piece) {
    std::optional<int> ignored;
    switch (piece.conversion) {
        case 'Y':
            return readYear(/*hasFourDigits=*/piece.runsOn);
        case 'y':
            return readYearOfCentury();
        case 'm':
            return readNumber(fields_.month, {2, 1, 12});
        case 'd':
        case 'e':
            return readNumber(fields_.day, {2, 1, 31});
        case 'j':
            return readNumber(fields_.dayOfYear, {3, 1, 366});
        case 'w':
            return readNumber(ignored, {1, 0, 6});
        case 'H':
            return readNumber(fields_.hour, {2, 0, 23});
        case 'I':
            return readNumber(fields_.hourOfHalfDay, {2, 1, 12});
        case 'M':
            return readNumber(fields_.minute, {2, 0, 59});
        case 'S':
            return readNumber(fields_.second, {2, 0, 60});
        case 'F':
            return readNumber(fields_.millisecond, {3, 0, 999});
        case 'z':
            return readZoneOffset();
        case 'Z':
            return readZoneName();
        default:
            return readInLocale(piece.conversion);
    }
}

bool CalendarParser::readInLocale(char letter) {
    std::optional<int> ignored;
    switch (letter) {
        case 'a':
            return readName(NameKind::shortWeekday, ignored);
        case 'A':
            return readName(NameKind::weekday, ignored);
        case 'b':
            return readMonth(NameKind::shortMonth);
        case 'B':
            return readMonth(NameKind::month);
        case 'p':
            return readHalfOfDay();
        case 'c':
            return readForm(LocaleForm::dateAndTime);
        case 'x':
            return readForm(LocaleForm::date);
        default:  // 'X'
            return readForm(LocaleForm::time);
    }
}

bool CalendarParser::readLiteral(std::string_view literal) {
    if (!rest_.starts_with(literal))
        return false;
    rest_.remove_prefix(literal.size());
    return true;
}

bool CalendarParser::readYear(bool hasFourDigits) {
    const std::size_t digits = hasFourDigits ? 4 : countLeading(rest_, isDigit);
    if (digits > longestYear || countLeading(rest_, isDigit) < digits)
        return false;
    return readNumber(fields_.year, {static_cast<int>(digits), 0, 999'999'999});
}

// As the usual tools do it: 69 to 99 are years of the 1900s.
bool CalendarParser::readYearOfCentury() {
    const std::optional<int> year = number({2, 0, 99});
    if (!year)
        return false;
    fields_.year = *year + (*year < 69 ? 2000 : 1900);
    return true;
}

bool CalendarParser::readMonth(NameKind kind) {
    std::optional<int> index;
    if (!readName(kind, index))
        return false;
    fields_.month = *index + 1;
    return true;
}

bool CalendarParser::readHalfOfDay() {
    std::optional<int> half;
    if (!readName(NameKind::halfOfDay, half))
        return false;
    fields_.isAfternoon = half == 1;
    return true;
}

bool CalendarParser::readName(NameKind kind, std::optional<int>& index) {
    const auto match = CalendarNames::ofLocale(Locale::current())->match(kind, rest_);
    if (!match)
        return false;
    rest_.remove_prefix(match->length);
    index = match->index;
    return true;
}

bool CalendarParser::readForm(LocaleForm form) {
    const auto match = CalendarNames::ofLocale(Locale::current())->parse(form, rest_);
    if (!match)
        return false;
    rest_.remove_prefix(match->length);
    if (form != LocaleForm::time) {
        fields_.year = match->time.year;
        fields_.month = match->time.month;
        fields_.day = match->time.day;
    }
    if (form != LocaleForm::date) {
        fields_.hour = match->time.hour;
        fields_.minute = match->time.minute;
        fields_.second = match->time.second;
    }
    return true;
}

bool CalendarParser::readZoneOffset() {
    if (readLiteral("Z")) {
        fields_.secondsFromGMT = 0;
        return true;
    }
    const int sign = rest_.starts_with('-') ? -1 : 1;
    if (!readLiteral("+") && !readLiteral("-"))
        return false;
    const std::optional<int> hours = number({2, 0, 23});
    const std::optional<int> minutes = sixtieths();
    const std::optional<int> seconds = sixtieths();
    if (!hours || !minutes || !seconds)
        return false;
    fields_.secondsFromGMT = sign * (*hours * 3600 + *minutes * 60 + *seconds);
    return true;
}

std::optional<int> CalendarParser::sixtieths() {
    const std::size_t colon = rest_.starts_with(':') ? 1 : 0;
    if (countLeading(rest_.substr(colon), isDigit) == 0)
        return 0;
    rest_.remove_prefix(colon);
    return number({2, 0, 59});
}

bool CalendarParser::readZoneName() {
    const std::size_t letters = countLeading(rest_, isLetter);
    if (letters == 0)
        return readZoneOffset();
    fields_.zoneAbbreviation = rest_.substr(0, letters);
    rest_.remove_prefix(letters);
    return true;
}

template <typename Field>
bool CalendarParser::readNumber(Field& field, NumberRange range) {
    const std::optional<int> value = number(range);
    if (!value)
        return false;
    field = *value;
    return true;
}

std::optional<int> CalendarParser::number(NumberRange range) {
    const std::size_t room = std::min(rest_.size(), static_cast<std::size_t>(range.digits));
    std::size_t digits = 0;
    int value = 0;
    for (; digits < room && isDigit(rest_[digits]); ++digits)
        value = 10 * value + (rest_[digits] - '0');
    if (digits == 0 || value < range.lowest || value > range.highest)
        return std::nullopt;
    rest_.remove_prefix(digits);
    return value;
}

}  // namespace platform
