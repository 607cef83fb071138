// What the desktop knows: mounted volumes and installed applications. Callable from any thread.
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "platform/Image.h"
#include "platform/Notification.h"
#include "platform/URL.h"

namespace platform {

// The default way to launch: without waiting for the application.
inline constexpr std::uint32_t NSWorkspaceLaunchAsync = 0x10000;

// Posted by the workspace's centre when an application could not be launched or an item not be shown; user
// information: "problem", a line that says what could not be done and why. It may come later than the call
// that asked for it, and on any thread.
inline constexpr std::string_view VXWorkspaceDidFailNotification = "VXWorkspaceDidFailNotification";

// An application that the desktop has an entry for. It may have been removed since.
struct ApplicationReference {
    std::string identifier;  // "com.norvale.ReelixApp"
    std::optional<URL> url;  // of its executable; nil when the entry names none
    std::string icon;        // icon name or path as the entry has it; may be empty
};

class Workspace {
  public:
    virtual ~Workspace() = default;

    // Mount points of local volumes that hold users' files, in mount order, "/" first.
    virtual std::vector<std::string> mountedLocalVolumePaths() const = 0;
    // Mount points of removable media, in mount order.
    virtual std::vector<std::string> mountedRemovableMedia() const = 0;

    // The application lookup by four-character creator code alone. nil when the desktop knows none.
    virtual std::optional<ApplicationReference> applicationForCreator(std::string_view creatorCode) const = 0;
    // absolutePathForAppBundleWithIdentifier:; empty when no such application is installed.
    virtual std::string absolutePathForAppBundleWithIdentifier(std::string_view identifier) const = 0;
    // The icon of an application as its desktop entry names it; nil when there is none.
    virtual ImageRef iconForApplication(const ApplicationReference& application) const = 0;

    // launchAppWithBundleIdentifier:options:additionalEventParamDescriptor:launchIdentifier:, without the two
    // that are always nil. Brings the application up, starting it where it does not run; false when that has
    // failed already. A failure also goes to the system log and is posted.
    virtual bool launchAppWithBundleIdentifier(std::string_view identifier, std::uint32_t options) = 0;
    // Waits until it is known what became of all that was launched, some seconds at most. For programs that
    // end after a launch.
    virtual void waitUntilLaunched() {}
    // selectFile:inFileViewerRootedAtPath:; shows the item selected in the desktop's file manager, folders
    // and packages too, or opens the folder around it where no file manager can do that; false when
    // neither was possible. The root path is always empty. A failure also goes to the system log and is
    // posted.
    virtual bool selectFile(const std::string& path, const std::string& inFileViewerRootedAtPath) = 0;

    // Posts NSWorkspaceDidMountNotification and VXWorkspaceDidFailNotification.
    NotificationCenter& notificationCenter() { return notificationCenter_; }

  private:
    NotificationCenter notificationCenter_;
};

}  // namespace platform
