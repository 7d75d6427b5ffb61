#pragma once

#include <gio/gio.h>
#include <stdexcept>
#include <string>
#include <vector>

namespace pelliko::test
{

/// What the notification keeper was asked to do until now, oldest first: a{sv} each, owned by the
/// caller. Throws when it does not answer.
inline std::vector<GVariant *> panelEvents()
{
    std::vector<GVariant *> all;
    GDBusConnection *bus = g_bus_get_sync(G_BUS_TYPE_SESSION, nullptr, nullptr);
    GVariant *reply = g_dbus_connection_call_sync(
        bus, "com.velmora.quickpanel", "/com/velmora/quickpanel", "com.velmora.Platform.Panel1",
        "History", nullptr, G_VARIANT_TYPE("(aa{sv})"), G_DBUS_CALL_FLAGS_NONE, -1, nullptr,
        nullptr);
    g_object_unref(bus);
    if (!reply)
        throw std::runtime_error("the notification keeper did not answer");
    GVariantIter *events = nullptr;
    g_variant_get(reply, "(aa{sv})", &events);
    while (GVariant *event = g_variant_iter_next_value(events))
        all.push_back(event);
    g_variant_iter_free(events);
    g_variant_unref(reply);
    return all;
}

/// A text of an event, empty when it has none of that name.
inline std::string eventText(GVariant *event, const char *key)
{
    const char *text = "";
    g_variant_lookup(event, key, "&s", &text);
    return text;
}

/// One event with all that is seen of it, the pictures and texts by their kinds: "post tag=7 type=1
/// layout=4 display=1 images={0: 'path', 1: 'path'} texts={0: ('shown', 'message id', [])}".
inline std::string describe(GVariant *event)
{
    std::string text = eventText(event, "event") + " tag=" + eventText(event, "tag");
    for (const char *key : {"type", "layout", "display", "images", "texts"}) {
        GVariant *value = g_variant_lookup_value(event, key, nullptr);
        char *printed = value ? g_variant_print(value, FALSE) : g_strdup("none");
        text += std::string(" ") + key + "=" + printed;
        g_free(printed);
        if (value)
            g_variant_unref(value);
    }
    return text;
}

/// The events after the first `known`, described.
inline std::vector<std::string> panelEventsSince(size_t known)
{
    std::vector<std::string> described;
    for (GVariant *event : panelEvents()) {
        if (known > 0)
            --known;
        else
            described.push_back(describe(event));
        g_variant_unref(event);
    }
    return described;
}

/// What the notification keeper was asked to show as toasts until now, oldest first.
inline std::vector<std::string> toasts()
{
    std::vector<std::string> texts;
    for (GVariant *event : panelEvents()) {
        if (eventText(event, "event") == "toast")
            texts.push_back(eventText(event, "message"));
        g_variant_unref(event);
    }
    return texts;
}

} // namespace pelliko::test
