// What a locale calls months, days and the halves of the day, and how it writes dates and times. The calendar
// is always the Gregorian one.
//
// Making one takes some tenths of a millisecond, printing a date a few thousandths; so `ofLocale` keeps the
// last one for each thread. Immutable and thread-safe.
#pragma once

#include <cstddef>
#include <memory>
#include <optional>
#include <string>
#include <string_view>

#include "platform/CivilTime.h"

namespace platform {

struct Locale;

enum class NameKind { month, shortMonth, weekday, shortWeekday, halfOfDay };
enum class LocaleForm { dateAndTime, date, time };

class CalendarNames {
  public:
    // A locale that nobody knows is taken as the nearest one that is known.
    static std::shared_ptr<const CalendarNames> ofLocale(const Locale& locale);
    ~CalendarNames();
    CalendarNames(const CalendarNames&) = delete;
    CalendarNames& operator=(const CalendarNames&) = delete;

    // Counted from 0: January, Sunday and the morning come first. Empty where the locale has no such name. A
    // part of this object.
    std::string_view name(NameKind kind, int index) const;

    struct Match {
        int index;
        std::size_t length;  // how many bytes of the text the name takes
    };
    // The longest name that `text` begins with, whatever the case and the Unicode composition of its letters.
    std::optional<Match> match(NameKind kind, std::string_view text) const;

    // The locale's own form of medium length. Empty for years that the locale's rules can't handle.
    std::string print(LocaleForm form, const CivilTime& time) const;

    struct FormMatch {
        CivilTime time;      // of which only what the form shows means anything
        std::size_t length;  // how many bytes of the text the form takes
    };
    // Blanks and the case of letters need not be those that `print` makes.
    std::optional<FormMatch> parse(LocaleForm form, std::string_view text) const;

  private:
    struct Tables;
    explicit CalendarNames(const Locale& locale);

    const std::unique_ptr<const Tables> tables_;
};

}  // namespace platform
