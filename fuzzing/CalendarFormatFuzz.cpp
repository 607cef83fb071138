// Reads text by a format, both hostile, and prints what came of it. The input is the format, a line feed, and
// the text.
#include <cstddef>
#include <cstdint>
#include <string_view>

#include "fuzzing/Require.h"
#include "platform/CalendarDate.h"

namespace {

constexpr std::string_view everything = "%Y %y %m %d %e %H %I %M %S %F %j %p %a %A %b %B %c %x %X %w %z %Z";
constexpr std::string_view exact = "%Y-%m-%d %H:%M:%S.%F %z";
constexpr double exactYears = 1e14;  // farther away, seconds have no milliseconds

// A date that can be printed exactly is read as the same date again.
void requireThatItComesBack(const platform::CalendarDate& date, const platform::Locale& locale) {
    if (date.yearOfCommonEra() < 0 || date.secondsSinceReferenceDate() > exactYears)
        return;
    const std::string text = date.descriptionWithCalendarFormat(exact, locale);
    const auto again = platform::CalendarDate::dateWithString(text, exact);
    require(again && again->descriptionWithCalendarFormat(exact, locale) == text);
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    static const bool isZoneSet = setenv("TZ", "CET-1CEST,M3.5.0,M10.5.0/3", /*overwrite=*/1) == 0;
    require(isZoneSet);
    const std::string_view input(reinterpret_cast<const char*>(data), size);
    const std::size_t end = std::min(input.find('\n'), size);
    const std::string_view format = input.substr(0, end);
    const std::string_view text = input.substr(std::min(end + 1, size));

    const platform::Locale locale = platform::Locale::current();
    const platform::CalendarDate fixed(257965689.25, 3600);
    fixed.descriptionWithCalendarFormat(format, locale);
    if (const auto date = platform::CalendarDate::dateWithString(text, format)) {
        date->descriptionWithCalendarFormat(format, locale);
        date->descriptionWithCalendarFormat(everything, locale);
        requireThatItComesBack(*date, locale);
    }
    return 0;
}
