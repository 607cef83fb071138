#include "platform/linux/SessionBus.h"

#include "platform/linux/BoundedCall.h"

namespace platform {
namespace {

constexpr std::chrono::seconds patience{5};

}  // namespace

SessionBus SessionBus::find() {
    BoundedCall call;
    g_bus_get(G_BUS_TYPE_SESSION, call.cancellable(), BoundedCall::finished, &call);
    g_autoptr(GError) error = nullptr;
    GDBusConnection* const connection = g_bus_get_finish(call.wait(patience), &error);
    if (!connection)
        return {nullptr, static_cast<bool>(g_error_matches(error, G_IO_ERROR, G_IO_ERROR_CANCELLED))};
    // GIO would end the process with the bus.
    g_dbus_connection_set_exit_on_close(connection, FALSE);
    return {{connection, g_object_unref}};
}

}  // namespace platform
