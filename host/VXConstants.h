// The host's constants. The text of each is its own symbol name, but for the preference domain's, which name
// a file that users and other programs see.
#pragma once

#include <string_view>

namespace vexo {

// What kind of group a group is. A constant object with identity: two identifiers are the same only when they
// are the same object, whatever their texts. Lives as long as the process.
class VXGroupTypeIdentifier {
  public:
    explicit constexpr VXGroupTypeIdentifier(const char* text) : text_(text) {}
    VXGroupTypeIdentifier(const VXGroupTypeIdentifier&) = delete;
    VXGroupTypeIdentifier& operator=(const VXGroupTypeIdentifier&) = delete;

    // For people and for output. Never compare it.
    constexpr const char* text() const { return text_; }

    friend constexpr bool operator==(const VXGroupTypeIdentifier& a, const VXGroupTypeIdentifier& b) {
        return &a == &b;
    }

  private:
    const char* text_;
};

// The plug-in's root group.
extern const VXGroupTypeIdentifier VXReelixRootGroupTypeIdentifier;
// One project, and each scanned project library group.
extern const VXGroupTypeIdentifier VXReelixProjectGroupTypeIdentifier;
// The group made for a default project folder that holds no projects.
extern const VXGroupTypeIdentifier VXReelixProjectLibraryGroupTypeIdentifier;
// A plain folder inside a project library.
extern const VXGroupTypeIdentifier VXReelixFolderGroupTypeIdentifier;
// The group of a project library in the old format.
extern const VXGroupTypeIdentifier VXReelixOldReelixProjectsGroupTypeIdentifier;
// The event library group.
extern const VXGroupTypeIdentifier VXReelixEventLibraryGroupTypeIdentifier;
// A year group of the event branch.
extern const VXGroupTypeIdentifier VXReelixEventCalendarGroupTypeIdentifier;
// One event, a folder of clips.
extern const VXGroupTypeIdentifier VXReelixEventGroupTypeIdentifier;

// The ID of the root group; the parent ID of library groups and year groups.
inline constexpr std::string_view VXReelix = "VXReelix";

// Item attributes.
inline constexpr std::string_view VXMediaObjectDurationKey = "VXMediaObjectDurationKey";      // real, seconds
inline constexpr std::string_view VXMediaObjectResolutionKey = "VXMediaObjectResolutionKey";  // size, pixels
inline constexpr std::string_view VXMediaObjectResolutionStringKey =  // text, "{1920, 1080}"
    "VXMediaObjectResolutionStringKey";
inline constexpr std::string_view VXReelixProjectPathKey =  // text, path of the package an item belongs to
    "VXReelixProjectPathKey";
inline constexpr std::string_view VXReelixProjectFormatVersion = "VXReelixProjectFormatVersion";  // text
inline constexpr std::string_view VXReelixProjectRepresentative =  // boolean, stands for a whole project
    "VXReelixProjectRepresentative";

// Localized-string keys.
inline constexpr std::string_view VXPluginDefaultLoadingStringKey = "VXPluginDefaultLoadingStringKey";
inline constexpr std::string_view VXPluginDefaultNoDataStringKey = "VXPluginDefaultNoDataStringKey";

// Posted on the default notification centre by a plug-in, as its object, when it is about to switch the user
// to another application. Its text is the one that the suite's programs post.
inline constexpr std::string_view willOpenOrRevealInSourceNotification =
    "willOpenOrRevealInSourceNotification";

// The preference domain that the suite's applications share, and its file.
inline constexpr std::string_view VXSuitePrefsDomainName = "com.vexo.suite";
inline constexpr std::string_view VXSuitePrefsPath = "~/.config/vexo/com.vexo.suite.plist";

// The host's number for movie items, for the source type of their files, and the mask for movie media.
inline constexpr int VXMediaTypeMovie = 3;
inline constexpr int VXMediaSourceTypeFile = 2;
inline constexpr unsigned VXMediaTypeMaskMovie = 4;

}  // namespace vexo
