#include "Watch.h"

#include <stdexcept>
#include <string>

#include <gio/gio.h>

#include "PanelCalls.h"

namespace pelliko::quickpanel_tool
{
namespace
{

struct Watcher {
    const std::function<bool(const Variant &)> &handle;
    GMainLoop *loop;
    int64_t last = 0;
    bool wanted = true;

    // An event that comes both as remembered and as a signal is handed over once.
    void take(const Variant &event)
    {
        gint64 sequence = 0;
        g_variant_lookup(event.get(), "seq", "x", &sequence);
        if (!wanted || sequence <= last)
            return;
        last = sequence;
        wanted = handle(event);
        if (!wanted)
            g_main_loop_quit(loop);
    }
};

void onHappened(GDBusConnection *, const gchar *, const gchar *, const gchar *, const gchar *,
                GVariant *parameters, gpointer data)
{
    static_cast<Watcher *>(data)->take(Variant::adopt(g_variant_get_child_value(parameters, 0)));
}

GDBusConnection *connect()
{
    GError *error = nullptr;
    GDBusConnection *bus = g_bus_get_sync(G_BUS_TYPE_SESSION, nullptr, &error);
    if (bus)
        return bus;
    const std::string reason = error->message;
    g_error_free(error);
    throw std::runtime_error("no session bus: " + reason);
}

} // namespace

// Subscribing comes before reading what is remembered, so that nothing falls in between.
void watch(int64_t since, const std::function<bool(const Variant &event)> &handle)
{
    GDBusConnection *bus = connect();
    Watcher watcher{handle, g_main_loop_new(nullptr, FALSE)};
    const guint subscription = g_dbus_connection_signal_subscribe(
        bus, "com.velmora.quickpanel", "com.velmora.Platform.Panel1", "Happened",
        "/com/velmora/quickpanel", nullptr, G_DBUS_SIGNAL_FLAGS_NONE, onHappened, &watcher,
        nullptr);
    const auto past = pastEvents();
    if (since < 0 && !past.empty())
        g_variant_lookup(past.back().get(), "seq", "x", &watcher.last);
    else
        watcher.last = since;
    for (const Variant &event : past)
        watcher.take(event);
    if (watcher.wanted)
        g_main_loop_run(watcher.loop);
    g_dbus_connection_signal_unsubscribe(bus, subscription);
    g_main_loop_unref(watcher.loop);
    g_object_unref(bus);
}

} // namespace pelliko::quickpanel_tool
