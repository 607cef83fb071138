// Names and numbers that the plug-in is known by.
#pragma once

#include <string_view>

namespace reelix {

// Icon names, as the bundle's resources have them.
inline constexpr std::string_view Reelix_icon_calendar = "Reelix-icon-calendar";
inline constexpr std::string_view Reelix_icon_event = "Reelix-icon-event";
inline constexpr std::string_view Reelix_icon_project = "Reelix-icon-project";
inline constexpr std::string_view Reelix_icon_trailer = "Reelix-icon-trailer";
inline constexpr std::string_view List_Icons_Library = "List-Icons-Library";
inline constexpr std::string_view MBReelixAppIconSmall = "MBReelixAppIconSmall";
inline constexpr std::string_view MBReelixIcon = "MBReelixIcon";

inline constexpr std::string_view ReelixApplicationName = "Reelix";
inline constexpr std::string_view ReelixApplicationCreatorCode = "rlxm";

// Folders that hold libraries. Each may also carry the extension "localized".
inline constexpr std::string_view ReelixEventsFolderName = "Reelix Events";
inline constexpr std::string_view ReelixProjectsFolderName = "Reelix Projects";
inline constexpr std::string_view ReelixProjectsFolderNameLoc = "Reelix Projects.localized";
inline constexpr std::string_view ReelixLocalizedExtension = "localized";

// Attributes of event groups: the year as an integer, the dates as plain dates.
inline constexpr std::string_view VXReelixEventCreationYear = "ReelixEventCreationYear";
inline constexpr std::string_view VXReelixEventOldestClipDate = "ReelixEventOldestClipDate";
inline constexpr std::string_view VXReelixEventNewestClipDate = "ReelixEventNewestClipDate";

// The value of VXReelixProjectFormatVersion on every item of a project.
inline constexpr std::string_view ReelixProjectFormatVersion = "7";

// A "what" line: what(1) finds it in the module.
extern const char vxMBReelixPluginVersionString[];
inline constexpr double vxMBReelixPluginVersionNumber = 507.3;

}  // namespace reelix
