#include "platform/CalendarPrinter.h"

#include <fmt/compile.h>

#include <cstdlib>

#include "platform/CalendarNames.h"
#include "platform/LocalZone.h"

namespace platform {

namespace {

// Of a number below 100.
void appendTwoDigits(fmt::memory_buffer& text, int number) {
    text.push_back(static_cast<char>('0' + number / 10));
    text.push_back(static_cast<char>('0' + number % 10));
}

// At least four digits after the sign. Every clip's name has a year, and the library's way to print one takes
// six times as many instructions.
void appendYear(fmt::memory_buffer& text, int year) {
    if (year < 0)
        text.push_back('-');
    const int size = std::abs(year);
    if (size > 9999)
        return text.append(std::string_view(fmt::format_int(size).c_str()));
    appendTwoDigits(text, size / 100);
    appendTwoDigits(text, size % 100);
}

int yearOfCentury(int year) {
    return (year % 100 + 100) % 100;
}

}  // namespace

CalendarPrinter::CalendarPrinter(std::int64_t seconds, int milliseconds, int secondsFromGMT,
                                 const Locale& locale)
    : seconds_(seconds),
      milliseconds_(milliseconds),
      secondsFromGMT_(secondsFromGMT),
      locale_(locale),
      time_(civilTimeOf(seconds + secondsFromGMT)) {}

std::string CalendarPrinter::print(const CalendarFormat& format) const {
    fmt::memory_buffer text;
    for (const CalendarFormat::Piece& piece : format.pieces()) {
        if (piece.isConversion())
            appendConversion(text, piece.conversion);
        else
            text.append(piece.literal);
    }
    return fmt::to_string(text);
}

void CalendarPrinter::appendConversion(fmt::memory_buffer& text, char letter) const {
    const fmt::appender end(text);
    switch (letter) {
        case 'Y':
            return appendYear(text, time_.year);
        case 'y':
            return appendTwoDigits(text, yearOfCentury(time_.year));
        case 'm':
            return appendTwoDigits(text, time_.month);
        case 'd':
            return appendTwoDigits(text, time_.day);
        case 'e':
            fmt::format_to(end, FMT_COMPILE("{}"), time_.day);
            return;
        case 'j':
            fmt::format_to(end, FMT_COMPILE("{:03}"), dayOfYear(time_));
            return;
        case 'w':
            fmt::format_to(end, FMT_COMPILE("{}"), dayOfWeek(time_));
            return;
        case 'H':
            return appendTwoDigits(text, time_.hour);
        case 'I':
            return appendTwoDigits(text, (time_.hour + 11) % 12 + 1);
        case 'M':
            return appendTwoDigits(text, time_.minute);
        case 'S':
            return appendTwoDigits(text, time_.second);
        case 'F':
            fmt::format_to(end, FMT_COMPILE("{:03}"), milliseconds_);
            return;
        case 'z':
            return text.append(zoneOffset());
        case 'Z':
            return text.append(zoneName());
        default:
            appendInLocale(text, letter);
    }
}

void CalendarPrinter::appendInLocale(fmt::memory_buffer& text, char letter) const {
    const auto names = CalendarNames::ofLocale(locale_);
    switch (letter) {
        case 'a':
            return text.append(names->name(NameKind::shortWeekday, dayOfWeek(time_)));
        case 'A':
            return text.append(names->name(NameKind::weekday, dayOfWeek(time_)));
        case 'b':
            return text.append(names->name(NameKind::shortMonth, time_.month - 1));
        case 'B':
            return text.append(names->name(NameKind::month, time_.month - 1));
        case 'p':
            return text.append(names->name(NameKind::halfOfDay, time_.hour / 12));
        case 'c':
            return text.append(names->print(LocaleForm::dateAndTime, time_));
        case 'x':
            return text.append(names->print(LocaleForm::date, time_));
        default:  // 'X'
            return text.append(names->print(LocaleForm::time, time_));
    }
}

// "+0100"; with seconds where the offset has some, as those before standard time do: "+005328".
std::string CalendarPrinter::zoneOffset() const {
    const std::int64_t size = std::abs(std::int64_t{secondsFromGMT_});
    std::string text = fmt::format(FMT_COMPILE("{}{:02}{:02}"), secondsFromGMT_ < 0 ? '-' : '+', size / 3600,
                                   size / 60 % 60);
    return size % 60 == 0 ? text : text + fmt::format(FMT_COMPILE("{:02}"), size % 60);
}

// A date knows its offset only; the local zone has a name for it when it is the local one.
std::string CalendarPrinter::zoneName() const {
    const LocalZone zone = LocalZone::current();
    return zone.secondsFromGMT(seconds_) == secondsFromGMT_ ? zone.abbreviation(seconds_) : zoneOffset();
}

}  // namespace platform
