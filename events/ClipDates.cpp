#include "events/ClipDates.h"

#include <array>
#include <cstring>

#include "core/VXReelixPlugin.h"
#include "platform/FileManager.h"
#include "platform/Path.h"
#include "platform/Services.h"
#include "platform/Text.h"

namespace reelix {

namespace path = platform::path;

platform::CalendarDateRef PathDate::_vxMBCalendarDateFromFileName(const std::string& fileName,
                                                                  const VXReelixPlugin& plugin) {
    const std::string prefix = plugin.localizedString("ReelixClipNamePrefix").value_or("") + "-";
    const std::string stem = path::withoutExtension(fileName);
    if (!stem.starts_with(prefix))
        return nullptr;
    const std::string format = plugin.localizedString("ReelixClipNameFormat").value_or("");
    const auto date =
        platform::CalendarDate::dateWithString(std::string_view(stem).substr(prefix.size()), format);
    const int year = date ? date->yearOfCommonEra() : 0;
    return 1900 <= year && year <= 2100 ? date : nullptr;
}

platform::CalendarDateRef VXReelixPlugin::_dateFromExtendedFileAttributeAtPath(const std::string& path) {
    constexpr std::string_view attribute = "date";
    const platform::FileManager& files = platform::services().fileManager;
    if (files.extendedAttribute(path, attribute, {}) <= 0)
        return nullptr;

    // The last byte stays NUL, so a value without one, or too long for the buffer, simply fails to parse.
    std::array<char, 201> buffer{};
    files.extendedAttribute(path, attribute, std::span(buffer).first(200));
    const std::string_view text(buffer.data(), std::strlen(buffer.data()));
    if (!platform::isValidUTF8(text))
        return nullptr;
    return platform::CalendarDate::dateWithString(text, "%Y-%m-%d %H;%M;%S");
}

platform::DateRef VXReelixPlugin::_nonCalendarDateFromDate(const platform::DateRef& date) {
    if (!std::dynamic_pointer_cast<const platform::CalendarDate>(date))
        return date;
    return platform::Date::sinceReferenceDate(date->secondsSinceReferenceDate());
}

}  // namespace reelix
