#include "tests/support/DesktopBus.h"

#include <gio/gio.h>

#include <stdexcept>

using platform::Locked;

namespace testing_support {
namespace {

[[noreturn]] void fail(GError* error) {
    const std::string message = error->message;
    g_error_free(error);
    throw std::runtime_error(message);
}

GDBusConnection* newConnection(const std::string& address) {
    GError* error = nullptr;
    GDBusConnection* const connection = g_dbus_connection_new_for_address_sync(
        address.c_str(),
        static_cast<GDBusConnectionFlags>(G_DBUS_CONNECTION_FLAGS_AUTHENTICATION_CLIENT |
                                          G_DBUS_CONNECTION_FLAGS_MESSAGE_BUS_CONNECTION),
        nullptr, nullptr, &error);
    if (!connection)
        fail(error);
    return connection;
}

void own(GDBusConnection* connection, const std::string& name) {
    GError* error = nullptr;
    GVariant* const answer = g_dbus_connection_call_sync(
        connection, "org.freedesktop.DBus", "/org/freedesktop/DBus", "org.freedesktop.DBus", "RequestName",
        g_variant_new("(su)", name.c_str(), 0U), nullptr, G_DBUS_CALL_FLAGS_NONE, -1, nullptr, &error);
    if (!answer)
        fail(error);
    g_variant_unref(answer);
}

std::string describe(GDBusMessage* call) {
    GVariant* const body = g_dbus_message_get_body(call);
    char* const parameters = body ? g_variant_print(body, /*type_annotate=*/FALSE) : g_strdup("()");
    const std::string text = std::string(g_dbus_message_get_member(call)) + " " + parameters;
    g_free(parameters);
    return text;
}

}  // namespace

DesktopBus::DesktopBus(const std::string& serviceFolder) : bus_(g_test_dbus_new(G_TEST_DBUS_NONE)) {
    g_test_dbus_add_service_dir(bus_, serviceFolder.c_str());
    g_test_dbus_up(bus_);
}

DesktopBus::~DesktopBus() {
    g_test_dbus_down(bus_);
    g_object_unref(bus_);
}

std::string DesktopBus::address() const {
    return g_test_dbus_get_bus_address(bus_);
}

// The filter runs on a thread of the connection's own, so a test may wait for the answer.
BusService::BusService(const DesktopBus& bus, const std::string& name, Answer answer)
    : answer_(answer), connection_(newConnection(bus.address())) {
    const auto filter = +[](GDBusConnection*, GDBusMessage* message, gboolean incoming, gpointer service) {
        if (!incoming || !static_cast<BusService*>(service)->receive(message))
            return message;
        g_object_unref(message);
        return static_cast<GDBusMessage*>(nullptr);
    };
    filter_ = g_dbus_connection_add_filter(connection_, filter, this, nullptr);
    own(connection_, name);
}

BusService::~BusService() {
    g_dbus_connection_remove_filter(connection_, filter_);
    g_dbus_connection_close_sync(connection_, nullptr, nullptr);
    g_object_unref(connection_);
}

std::vector<std::string> BusService::calls() const {
    Locked lock(mutex_);
    return calls_;
}

bool BusService::receive(GDBusMessage* message) {
    if (g_dbus_message_get_message_type(message) != G_DBUS_MESSAGE_TYPE_METHOD_CALL)
        return false;
    {
        Locked lock(mutex_);
        calls_.push_back(describe(message));
    }
    if (answer_ != Answer::never)
        reply(message);
    return true;
}

void BusService::reply(GDBusMessage* call) {
    GDBusMessage* const answer = answer_ == Answer::done ? g_dbus_message_new_method_reply(call)
                                                         : g_dbus_message_new_method_error_literal(
                                                               call, "org.example.Refusal", "not today");
    g_dbus_connection_send_message(connection_, answer, G_DBUS_SEND_MESSAGE_FLAGS_NONE, nullptr, nullptr);
    g_object_unref(answer);
}

}  // namespace testing_support
