// The panel service: keeps what applications post and shows it on the desktop.
#include <cstdio>
#include <cstdlib>
#include <stdexcept>

#include <CLI/CLI.hpp>
#include <gio/gio.h>
#include <glib-unix.h>

#include "BusObject.h"
#include "StateDir.h"
#include "Store.h"

using namespace pelliko::quickpanel;

namespace
{

gboolean onSignal(gpointer loop)
{
    g_main_loop_quit(static_cast<GMainLoop *>(loop));
    return G_SOURCE_CONTINUE;
}

[[noreturn]] void fail(const std::string &what, GError *error)
{
    const std::string reason = error->message;
    g_error_free(error);
    throw std::runtime_error(what + ": " + reason);
}

GDBusConnection *connect()
{
    GError *error = nullptr;
    GDBusConnection *bus = g_bus_get_sync(G_BUS_TYPE_SESSION, nullptr, &error);
    if (!bus)
        fail("no session bus", error);
    return bus;
}

// The one panel of a session is found out before the store and the desktop are touched.
void takeName(GDBusConnection *bus)
{
    constexpr guint32 doNotQueue = 4;
    constexpr guint32 primaryOwner = 1;
    GError *error = nullptr;
    const pelliko::notification::Variant reply =
        pelliko::notification::Variant::adopt(g_dbus_connection_call_sync(
            bus, "org.freedesktop.DBus", "/org/freedesktop/DBus", "org.freedesktop.DBus",
            "RequestName", g_variant_new("(su)", BusObject::busName, doNotQueue),
            G_VARIANT_TYPE("(u)"), G_DBUS_CALL_FLAGS_NONE, -1, nullptr, &error));
    if (!reply)
        fail("no bus name", error);
    guint32 answer = 0;
    g_variant_get(reply.get(), "(u)", &answer);
    if (answer != primaryOwner)
        throw std::runtime_error("another quickpanel serves this session");
}

// The object comes before the name, so that the first caller finds it.
void serve(GDBusConnection *bus, GMainLoop *loop)
{
    BusObject object(bus);
    takeName(bus);
    Store store(pelliko::platform::stateDirectory() + "/notifications.db");
    object.start(store);
    g_main_loop_run(loop);
}

int runProgram(int argc, char **argv)
{
    CLI::App options("Keeps the notifications that applications post and shows them through the\n"
                     "desktop's notification daemon. Started by the session bus.");
    CLI11_PARSE(options, argc, argv);

    GMainLoop *loop = g_main_loop_new(nullptr, FALSE);
    g_unix_signal_add(SIGTERM, onSignal, loop);
    g_unix_signal_add(SIGINT, onSignal, loop);
    serve(connect(), loop);
    return EXIT_SUCCESS;
}

} // namespace

int main(int argc, char **argv)
{
    try {
        return runProgram(argc, argv);
    } catch (const std::exception &error) {
        std::fprintf(stderr, "quickpanel: %s\n", error.what());
        return EXIT_FAILURE;
    }
}
