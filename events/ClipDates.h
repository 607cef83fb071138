// Clip dates in file names: an operation that the category PathDate adds to the calendar-date class.
#pragma once

#include <string>

#include "platform/CalendarDate.h"

namespace reelix {

class VXReelixPlugin;

namespace PathDate {

// _vxMBCalendarDateFromFileName:plugin:
// The date in a name of the form "<prefix>-<date>.<extension>", prefix and date format being localized texts
// of the plug-in; nil for any other name and for years outside 1900 to 2100.
platform::CalendarDateRef _vxMBCalendarDateFromFileName(const std::string& fileName,
                                                        const VXReelixPlugin& plugin);

}  // namespace PathDate
}  // namespace reelix
