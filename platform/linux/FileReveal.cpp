#include "platform/linux/FileReveal.h"

#include "platform/linux/SessionBus.h"

namespace platform {
namespace {

constexpr const char* fileManagerName = "org.freedesktop.FileManager1";
constexpr const char* fileManagerPath = "/org/freedesktop/FileManager1";
constexpr int patienceInMilliseconds = 5000;

// The parameters of ShowItems: the URIs, and a startup ID, which we have none of.
GVariant* parametersOfShowItems(const URL& item) {
    const std::string uri = item.absoluteString();
    const char* const uris[] = {uri.c_str(), nullptr};
    return g_variant_new("(^ass)", uris, "");
}

}  // namespace

std::optional<std::string> showInFileManager(const URL& item) {
    const SessionBus bus = SessionBus::find();
    if (!bus.connection)
        return bus.isSilent ? "the session bus does not answer" : "there is no session bus";
    g_autoptr(GError) error = nullptr;
    g_autoptr(GVariant) answer =
        g_dbus_connection_call_sync(bus.connection.get(), fileManagerName, fileManagerPath, fileManagerName,
                                    "ShowItems", parametersOfShowItems(item), nullptr, G_DBUS_CALL_FLAGS_NONE,
                                    patienceInMilliseconds, nullptr, &error);
    if (answer)
        return std::nullopt;
    g_dbus_error_strip_remote_error(error);
    return error->message;
}

}  // namespace platform
