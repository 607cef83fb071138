// Dates that know their year and can be read and printed with %-conversion formats.
//
// Conversions: %Y (year), %y (year in its century), %m %d %e %H %I %M %S %F (milliseconds), %j (day of the
// year), %p (AM/PM), %a %A %b %B (day and month names), %c %x %X (the locale's own forms), %w, %z %Z
// (zone), %%. Everything else in a format stands for itself.
//
// Thread-safe. Parsing and printing use the local time zone at the moment of the call, so a change of TZ
// or of the machine's zone counts from the next call on; a CalendarDate keeps the zone offset it was made
// with.
#pragma once

#include <memory>
#include <optional>
#include <string>
#include <string_view>

#include "platform/Date.h"

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
    // Reads `string` by `calendarFormat` in the local time zone; nil when it does not match. Text that goes
    // on after the format's end makes the parse fail. %Y takes as many digits as there are (nine at most),
    // but exactly four when the next conversion follows it without a separator. A local time that a
    // daylight-saving change skips is moved forward by the length of the gap; one that occurs twice is the
    // earlier.
    static CalendarDateRef dateWithString(std::string_view string, std::string_view calendarFormat);

    // descriptionWithCalendarFormat:locale:
    std::string descriptionWithCalendarFormat(std::string_view format, const Locale& locale) const;

    int yearOfCommonEra() const;
    int secondsFromGMT() const { return secondsFromGMT_; }

  private:
    const int secondsFromGMT_;
};

}  // namespace platform
