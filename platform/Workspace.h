// What the desktop knows: mounted volumes and installed applications. Callable from any thread.
#pragma once

#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "platform/Image.h"
#include "platform/Notification.h"
#include "platform/URL.h"

namespace platform {

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

    // Posts NSWorkspaceDidMountNotification.
    NotificationCenter& notificationCenter() { return notificationCenter_; }

  private:
    NotificationCenter notificationCenter_;
};

}  // namespace platform
