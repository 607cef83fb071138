#include "platform/linux/SessionBus.h"

#include <chrono>
#include <future>

namespace platform {
namespace {

constexpr std::chrono::seconds patience{5};

// Ends when it is cancelled, whatever the other side does.
SessionBus connect(GCancellable* cancellable) {
    g_autoptr(GError) error = nullptr;
    GDBusConnection* const connection = g_bus_get_sync(G_BUS_TYPE_SESSION, cancellable, &error);
    if (!connection)
        return {nullptr, static_cast<bool>(g_error_matches(error, G_IO_ERROR, G_IO_ERROR_CANCELLED))};
    // GIO would end the process with the bus.
    g_dbus_connection_set_exit_on_close(connection, FALSE);
    return {{connection, g_object_unref}};
}

}  // namespace

// On a thread of its own a new connection belongs to the main loop, wherever it is asked for first.
SessionBus SessionBus::find() {
    g_autoptr(GCancellable) cancellable = g_cancellable_new();
    auto bus = std::async(std::launch::async, connect, cancellable);
    if (bus.wait_for(patience) != std::future_status::ready)
        g_cancellable_cancel(cancellable);
    return bus.get();
}

}  // namespace platform
