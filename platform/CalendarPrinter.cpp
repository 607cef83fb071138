#include "platform/CalendarPrinter.h"

#include <fmt/compile.h>

#include <cstdlib>

#include "platform/CalendarFormat.h"
#include "platform/CalendarNames.h"
#include "platform/LocalZone.h"

namespace platform {

namespace {

// At least four digits after the sign.
std::string yearText(int year) {
    return fmt::format(FMT_COMPILE("{}{:04}"), year < 0 ? "-" : "", std::abs(year));
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

std::string CalendarPrinter::print(std::string_view format) const {
    std::string text;
    FormatReader reader(format);
    while (const auto piece = reader.next()) {
        if (piece->isConversion())
            text += conversion(piece->conversion);
        else
            text += piece->literal;
    }
    return text;
}

std::string CalendarPrinter::conversion(char letter) const {
    switch (letter) {
        case 'Y':
            return yearText(time_.year);
        case 'y':
            return fmt::format(FMT_COMPILE("{:02}"), yearOfCentury(time_.year));
        case 'm':
            return fmt::format(FMT_COMPILE("{:02}"), time_.month);
        case 'd':
            return fmt::format(FMT_COMPILE("{:02}"), time_.day);
        case 'e':
            return fmt::format(FMT_COMPILE("{}"), time_.day);
        case 'j':
            return fmt::format(FMT_COMPILE("{:03}"), dayOfYear(time_));
        case 'w':
            return fmt::format(FMT_COMPILE("{}"), dayOfWeek(time_));
        case 'H':
            return fmt::format(FMT_COMPILE("{:02}"), time_.hour);
        case 'I':
            return fmt::format(FMT_COMPILE("{:02}"), (time_.hour + 11) % 12 + 1);
        case 'M':
            return fmt::format(FMT_COMPILE("{:02}"), time_.minute);
        case 'S':
            return fmt::format(FMT_COMPILE("{:02}"), time_.second);
        case 'F':
            return fmt::format(FMT_COMPILE("{:03}"), milliseconds_);
        case 'z':
            return zoneOffset();
        case 'Z':
            return zoneName();
        default:
            return inLocale(letter);
    }
}

std::string CalendarPrinter::inLocale(char letter) const {
    const auto names = CalendarNames::ofLocale(locale_);
    switch (letter) {
        case 'a':
            return names->name(NameKind::shortWeekday, dayOfWeek(time_));
        case 'A':
            return names->name(NameKind::weekday, dayOfWeek(time_));
        case 'b':
            return names->name(NameKind::shortMonth, time_.month - 1);
        case 'B':
            return names->name(NameKind::month, time_.month - 1);
        case 'p':
            return names->name(NameKind::halfOfDay, time_.hour / 12);
        case 'c':
            return names->print(LocaleForm::dateAndTime, time_);
        case 'x':
            return names->print(LocaleForm::date, time_);
        default:  // 'X'
            return names->print(LocaleForm::time, time_);
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
    const ZonedTime local = localZoneAt(seconds_);
    return local.secondsFromGMT == secondsFromGMT_ ? local.abbreviation : zoneOffset();
}

}  // namespace platform
