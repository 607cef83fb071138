// Clip dates in file names, an operation that the category PathDate adds to the calendar-date class, and in
// extended attributes.
#pragma once

#include <array>
#include <span>
#include <string>
#include <string_view>

#include "platform/CalendarDate.h"

namespace reelix {

class VXReelixPlugin;

// The localized texts by which clips are named, asked for once for many clips.
struct ClipNameTexts {
    explicit ClipNameTexts(const VXReelixPlugin& plugin);

    const std::string prefix;  // with the "-" behind it
    const platform::CalendarFormat format;
    const platform::CalendarFormat displayFormat;
};

namespace PathDate {

// _vxMBCalendarDateFromFileName:plugin:
// The date in a name of the form "<prefix>-<date>.<extension>", prefix and date format being localized texts
// of the plug-in; nil for any other name and for years outside 1900 to 2100.
platform::CalendarDateRef _vxMBCalendarDateFromFileName(const std::string& fileName,
                                                        const VXReelixPlugin& plugin);
platform::CalendarDateRef dateFromFileName(std::string_view fileName, const ClipNameTexts& texts,
                                           const platform::LocalZone& zone = platform::LocalZone::current());

}  // namespace PathDate

inline constexpr std::string_view clipDateAttribute = "date";

// The value of a clip's attribute, with room for the NUL that ends it. A value without one, or too long,
// simply fails to parse.
class ClipDateValue {
  public:
    // Where a value goes. The last byte stays NUL.
    std::span<char> room() { return std::span(bytes_).first(bytes_.size() - 1); }
    // nil for anything but a date.
    platform::CalendarDateRef date(const platform::LocalZone& zone = platform::LocalZone::current()) const;

  private:
    std::array<char, 201> bytes_{};
};
}  // namespace reelix
