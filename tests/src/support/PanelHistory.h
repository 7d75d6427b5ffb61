#pragma once

#include <gio/gio.h>
#include <string>
#include <vector>

namespace pelliko::test
{

/// What the notification keeper was asked to show as toasts until now, oldest first.
inline std::vector<std::string> toasts()
{
    std::vector<std::string> texts;
    GDBusConnection *bus = g_bus_get_sync(G_BUS_TYPE_SESSION, nullptr, nullptr);
    GVariant *reply = g_dbus_connection_call_sync(
        bus, "com.velmora.quickpanel", "/com/velmora/quickpanel", "com.velmora.Platform.Panel1",
        "History", nullptr, G_VARIANT_TYPE("(aa{sv})"), G_DBUS_CALL_FLAGS_NONE, -1, nullptr,
        nullptr);
    g_object_unref(bus);
    if (!reply)
        return {"the notification keeper did not answer"};
    GVariantIter *events = nullptr;
    g_variant_get(reply, "(aa{sv})", &events);
    while (GVariant *event = g_variant_iter_next_value(events)) {
        const char *kind = "";
        const char *message = "";
        g_variant_lookup(event, "event", "&s", &kind);
        if (std::string(kind) == "toast" && g_variant_lookup(event, "message", "&s", &message))
            texts.emplace_back(message);
        g_variant_unref(event);
    }
    g_variant_iter_free(events);
    g_variant_unref(reply);
    return texts;
}

} // namespace pelliko::test
