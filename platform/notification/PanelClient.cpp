#include "PanelClient.h"

#include <gio/gio.h>

#include "notification.h"

namespace pelliko::notification
{
namespace
{

constexpr int callTimeoutMs = 25000;

int errorNumber(const GError &error)
{
    const bool unreachable =
        g_error_matches(&error, G_DBUS_ERROR, G_DBUS_ERROR_SERVICE_UNKNOWN) ||
        g_error_matches(&error, G_DBUS_ERROR, G_DBUS_ERROR_NAME_HAS_NO_OWNER) ||
        g_error_matches(&error, G_DBUS_ERROR, G_DBUS_ERROR_NO_REPLY) ||
        g_error_matches(&error, G_DBUS_ERROR, G_DBUS_ERROR_SPAWN_CHILD_EXITED) ||
        g_error_matches(&error, G_DBUS_ERROR, G_DBUS_ERROR_SPAWN_EXEC_FAILED) ||
        error.domain != G_DBUS_ERROR;
    return unreachable ? NOTIFICATION_ERROR_SERVICE_NOT_READY : NOTIFICATION_ERROR_FROM_DBUS;
}

Reply failed(const char *method, GError *error)
{
    g_printerr("notification: %s failed: %s\n", method, error->message);
    Reply reply{errorNumber(*error), Variant()};
    g_error_free(error);
    return reply;
}

} // namespace

// A proxy would remember the service's owner until the main loop hears of a new one; calling by
// name reaches the service also right after it was restarted, in a process whose loop does not run.
Reply callPanel(const char *method, GVariant *parameters, const char *reply_type)
{
    const Variant owned(parameters);
    GError *error = nullptr;
    GDBusConnection *bus = g_bus_get_sync(G_BUS_TYPE_SESSION, nullptr, &error);
    if (!bus)
        return failed(method, error);
    GVariant *result = g_dbus_connection_call_sync(
        bus, "com.velmora.quickpanel", "/com/velmora/quickpanel", "com.velmora.Platform.Panel1",
        method, owned.get(), G_VARIANT_TYPE(reply_type), G_DBUS_CALL_FLAGS_NONE, callTimeoutMs,
        nullptr, &error);
    g_object_unref(bus);
    if (!result)
        return failed(method, error);
    return Reply{0, Variant::adopt(result)};
}

} // namespace pelliko::notification
