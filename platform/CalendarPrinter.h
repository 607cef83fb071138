// Prints a point in time by a calendar format.
#pragma once

#include <cstdint>
#include <string>

#include "platform/CalendarDate.h"
#include "platform/CivilTime.h"

namespace platform {

class CalendarPrinter {
  public:
    // `seconds` is counted from the reference date, as the whole seconds of a date.
    CalendarPrinter(std::int64_t seconds, int milliseconds, int secondsFromGMT, const Locale& locale);

    std::string print(const CalendarFormat& format) const;

  private:
    void appendConversion(std::string& text, char letter) const;
    std::string inLocale(char letter) const;
    std::string zoneOffset() const;
    std::string zoneName() const;

    const std::int64_t seconds_;
    const int milliseconds_;
    const int secondsFromGMT_;
    const Locale& locale_;
    const CivilTime time_;
};

}  // namespace platform
