// Prints a point in time by a calendar format.
#pragma once

#include <fmt/format.h>

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
    void appendConversion(fmt::memory_buffer& text, char letter) const;
    void appendInLocale(fmt::memory_buffer& text, char letter) const;
    std::string zoneOffset() const;
    std::string zoneName() const;

    const std::int64_t seconds_;
    const int milliseconds_;
    const int secondsFromGMT_;
    const Locale& locale_;
    const CivilTime time_;
};

}  // namespace platform
