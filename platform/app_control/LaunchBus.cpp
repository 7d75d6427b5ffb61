#include "LaunchBus.h"

namespace pelliko::platform
{

GDBusConnection *sessionBus(GError **error)
{
    // The connection is GLib's own singleton; this keeps one reference to it for good.
    static GDBusConnection *kept = nullptr;
    GDBusConnection *bus = g_bus_get_sync(G_BUS_TYPE_SESSION, nullptr, error);
    if (bus &&
        !g_atomic_pointer_compare_and_exchange(&kept, static_cast<GDBusConnection *>(nullptr), bus))
        g_object_unref(bus);
    return bus;
}

GVariant *callBus(const char *method, GVariant *arguments, const char *replyType, GError **error)
{
    g_autoptr(GVariant) owned = arguments ? g_variant_ref_sink(arguments) : nullptr;
    GDBusConnection *bus = sessionBus(error);
    if (!bus)
        return nullptr;
    g_autoptr(GVariantType) type = replyType ? g_variant_type_new(replyType) : nullptr;
    return g_dbus_connection_call_sync(bus, "org.freedesktop.DBus", "/org/freedesktop/DBus",
                                       "org.freedesktop.DBus", method, owned, type,
                                       G_DBUS_CALL_FLAGS_NONE, -1, nullptr, error);
}

bool nameHasOwner(const std::string &name)
{
    g_autoptr(GVariant) reply =
        callBus("NameHasOwner", g_variant_new("(s)", name.c_str()), "(b)", nullptr);
    gboolean owned = FALSE;
    if (reply)
        g_variant_get(reply, "(b)", &owned);
    return owned != FALSE;
}

bool isApplicationId(const char *id)
{
    return id && g_dbus_is_name(id) && !g_dbus_is_unique_name(id);
}

} // namespace pelliko::platform
