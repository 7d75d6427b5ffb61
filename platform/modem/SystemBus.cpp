#include "SystemBus.h"

#include <atomic>

namespace pelliko::modem
{

namespace
{

constexpr const char *kBus = "org.freedesktop.DBus";
constexpr const char *kBusPath = "/org/freedesktop/DBus";
constexpr int kBusTimeoutMs = 5000;
constexpr int kStartTimeoutMs = 25000;

std::string takeMessage(GError *error)
{
    g_dbus_error_strip_remote_error(error);
    std::string message = error->message;
    g_error_free(error);
    return message;
}

} // namespace

GDBusConnection *systemBus()
{
    // GLib hands out the same connection while somebody holds it: one reference is never given
    // back. A connection that could not be made is tried again by the next caller.
    static std::atomic<GDBusConnection *> kept = nullptr;
    if (GDBusConnection *bus = kept.load())
        return bus;
    GDBusConnection *bus = g_bus_get_sync(G_BUS_TYPE_SYSTEM, nullptr, nullptr);
    if (!bus)
        return nullptr;
    g_dbus_connection_set_exit_on_close(bus, FALSE);
    GDBusConnection *none = nullptr;
    if (!kept.compare_exchange_strong(none, bus))
        g_object_unref(bus);
    return kept.load();
}

VariantPtr callOnSystemBus(const char *name, const std::string &path, const char *interface,
                           const char *method, GVariant *arguments, int timeoutMs,
                           std::string &error)
{
    const VariantPtr owned(arguments ? g_variant_ref_sink(arguments) : nullptr);
    GDBusConnection *bus = systemBus();
    if (!bus) {
        error = "there is no system bus";
        return nullptr;
    }
    GError *failure = nullptr;
    VariantPtr reply(g_dbus_connection_call_sync(
        bus, name, path.c_str(), interface, method, owned.get(), nullptr,
        G_DBUS_CALL_FLAGS_NO_AUTO_START, timeoutMs, nullptr, &failure));
    if (!reply)
        error = takeMessage(failure);
    return reply;
}

bool isOnSystemBus(const char *name)
{
    std::string error;
    const VariantPtr reply = callOnSystemBus(kBus, kBusPath, kBus, "NameHasOwner",
                                             g_variant_new("(s)", name), kBusTimeoutMs, error);
    if (!reply)
        return false;
    gboolean owned = FALSE;
    g_variant_get(reply.get(), "(b)", &owned);
    return owned != FALSE;
}

void startOnSystemBus(const char *name)
{
    // Whether it runs afterwards is seen by whoever asks it; a name that nobody can start is usual.
    std::string error;
    callOnSystemBus(kBus, kBusPath, kBus, "StartServiceByName", g_variant_new("(su)", name, 0u),
                    kStartTimeoutMs, error);
}

} // namespace pelliko::modem
