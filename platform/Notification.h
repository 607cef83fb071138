// Notifications: named messages from a sender to whoever observes the name.
#pragma once

#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "platform/ThreadSafety.h"
#include "platform/Value.h"

namespace platform {

// Posted by the workspace's centre when a volume was mounted; user information: "NSDevicePath", the mount
// path.
inline constexpr std::string_view NSWorkspaceDidMountNotification = "NSWorkspaceDidMountNotification";
// Posted for a metadata query whose results changed after its first gathering.
inline constexpr std::string_view kMDQueryDidUpdateNotification = "kMDQueryDidUpdateNotification";

struct Notification {
    std::string name;
    const void* object = nullptr;  // the sender, for comparing only
    Dictionary userInfo = {};
};

// Thread-safe. Observers run on the posting thread in the order in which they were added, outside the
// centre's lock, so they may add observers and post in their turn; an observer that is added during a post
// is not told of it. An exception that leaves an observer leaves the post.
class NotificationCenter {
  public:
    using Handler = std::function<void(const Notification&)>;

    // addObserver:selector:name:object: with no object filter. The observer is held weakly: its handler is
    // called while the observer lives and forgotten afterwards.
    void addObserver(std::weak_ptr<const void> observer, std::string_view name, Handler handler)
        VX_EXCLUDES(mutex_);
    // postNotificationName:object:userInfo:
    void post(const Notification& notification) VX_EXCLUDES(mutex_);

  private:
    struct Registration {
        std::weak_ptr<const void> observer;
        std::string name;
        Handler handler;
    };

    std::vector<Registration> registrationsFor(const std::string& name) VX_EXCLUDES(mutex_);
    // The registrations whose observers are gone, which are registrations no longer.
    std::vector<Registration> takeExpired() VX_REQUIRES(mutex_);

    Mutex mutex_;
    std::vector<Registration> registrations_ VX_GUARDED_BY(mutex_);
};

}  // namespace platform
