// Dates that know their year and can be read and printed with %-conversion formats.
//
// Conversions:
//   %Y  year, four digits or more       %H  hour, 00 to 23           %a %A  day of the week, short and full
//   %y  year of the century, 00 to 99   %I  hour, 01 to 12           %b %B  month, short and full
//   %m  month, 01 to 12                 %p  half of the day, "AM"    %c     the locale's date and time
//   %d  day of the month, 01 to 31      %M  minute, 00 to 59         %x     the locale's date
//   %e  the same without leading zero   %S  second, 00 to 59         %X     the locale's time
//   %j  day of the year, 001 to 366     %F  millisecond, 000 to 999  %z     zone, "+0100"
//   %w  day of the week, 0 is Sunday    %%  "%"                      %Z     zone's abbreviation, "CET"
// Everything else in a format stands for itself.
//
// The calendar is the Gregorian one for all times; the year before year 1 is year 0.
//
// Thread-safe. Parsing, unless it is handed a zone, and printing use the local time zone at the moment of the
// call, so a change of TZ or of the machine's zone counts from the next call on; a CalendarDate keeps the
// zone offset it was made with.
#pragma once

#include <memory>
#include <optional>
#include <string>
#include <string_view>

#include "platform/CalendarFormat.h"
#include "platform/Date.h"
#include "platform/LocalZone.h"

namespace platform {

// Whose names of months and days are meant. Carries an ICU locale identifier such as "de_DE".
struct Locale {
    std::string identifier;

    // The user's locale for dates: LC_ALL, LC_TIME, LANG, in that order; "en_US_POSIX" when none is set.
    static Locale current();
};

class CalendarDate;
using CalendarDateRef = std::shared_ptr<const CalendarDate>;

class CalendarDate final : public Date {
  public:
    // `secondsFromGMT` is the offset of the zone in which the date's year and fields are meant.
    CalendarDate(double secondsSinceReferenceDate, int secondsFromGMT);

    // dateWithString:calendarFormat:
    // Reads `string` by `calendarFormat` in the local time zone and with the names of the user's locale, in
    // any case of letters; nil when it does not match, or names a day or time that does not exist. Text that
    // goes on after the format's end makes the parse fail; blanks match only themselves.
    //
    // Numbers may have fewer digits than are printed. %Y takes as many digits as there are (nine at most),
    // but exactly four when another conversion or a digit follows it without a separator. %y means 1969 to
    // 2068. %S takes 60, the leap second, for the next minute's first second.
    //
    // Fields that the format does not mention are those of 2001-01-01 00:00:00. Of fields that say the same
    // thing the later counts, %H before %I with %p, and month and day before %j; days of the week are read
    // and count for nothing.
    //
    // A local time that a daylight-saving change skips is moved forward by the length of the gap; one that
    // occurs twice is the earlier, unless %Z says which. %z, and "GMT" or "UTC" for %Z, mean that zone
    // instead of the local one; other abbreviations must be the local zone's at that time.
    static CalendarDateRef dateWithString(std::string_view string, const CalendarFormat& calendarFormat,
                                          const LocalZone& zone = LocalZone::current());

    // descriptionWithCalendarFormat:locale:
    // In the date's own zone. %Z is printed like %z when the local zone has another offset at that time.
    // Empty for a date that is not a number.
    std::string descriptionWithCalendarFormat(const CalendarFormat& format, const Locale& locale) const;

    // In the date's own zone; 0 for a date that is not a number.
    int yearOfCommonEra() const;
    int secondsFromGMT() const { return secondsFromGMT_; }

  private:
    const int secondsFromGMT_;
};

}  // namespace platform
