#include "events/ClipDates.h"

#include <cstring>

#include "core/VXReelixPlugin.h"
#include "platform/FileManager.h"
#include "platform/Path.h"
#include "platform/Services.h"
#include "platform/Text.h"

namespace reelix {

namespace path = platform::path;

ClipNameTexts::ClipNameTexts(const VXReelixPlugin& plugin)
    : prefix(plugin.localizedString("ReelixClipNamePrefix").value_or("") + "-"),
      format(plugin.localizedString("ReelixClipNameFormat").value_or("")),
      displayFormat(plugin.localizedString("ReelixClipNameDisplayFormat").value_or("")) {}

platform::CalendarDateRef PathDate::_vxMBCalendarDateFromFileName(const std::string& fileName,
                                                                  const VXReelixPlugin& plugin) {
    return dateFromFileName(fileName, ClipNameTexts(plugin));
}

platform::CalendarDateRef PathDate::dateFromFileName(std::string_view fileName, const ClipNameTexts& texts,
                                                     const platform::LocalZone& zone) {
    const std::string_view stem = path::withoutExtensionView(fileName);
    if (!stem.starts_with(texts.prefix))
        return nullptr;
    const auto date =
        platform::CalendarDate::dateWithString(stem.substr(texts.prefix.size()), texts.format, zone);
    const int year = date ? date->yearOfCommonEra() : 0;
    return 1900 <= year && year <= 2100 ? date : nullptr;
}

platform::CalendarDateRef ClipDateValue::date(const platform::LocalZone& zone) const {
    const std::string_view text(bytes_.data(), std::strlen(bytes_.data()));
    if (!platform::isValidUTF8(text))
        return nullptr;
    static const platform::CalendarFormat format("%Y-%m-%d %H;%M;%S");
    return platform::CalendarDate::dateWithString(text, format, zone);
}

platform::CalendarDateRef VXReelixPlugin::_dateFromExtendedFileAttributeAtPath(const std::string& path) {
    const platform::FileManager& files = platform::services().fileManager;
    if (files.extendedAttribute(path, clipDateAttribute, {}) <= 0)
        return nullptr;
    ClipDateValue value;
    files.extendedAttribute(path, clipDateAttribute, value.room());
    return value.date();
}

platform::DateRef VXReelixPlugin::_nonCalendarDateFromDate(const platform::DateRef& date) {
    if (!std::dynamic_pointer_cast<const platform::CalendarDate>(date))
        return date;
    return platform::Date::sinceReferenceDate(date->secondsSinceReferenceDate());
}

}  // namespace reelix
