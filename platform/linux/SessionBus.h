// The message bus of the user's desktop.
#pragma once

#include <gio/gio.h>

#include <memory>

namespace platform {

struct SessionBus {
    std::shared_ptr<GDBusConnection> connection;  // nil where there is none
    bool isSilent = false;                        // there is one, and it does not answer

    // Waits a few seconds at most. Callable from any thread.
    static SessionBus find();
};

}  // namespace platform
