#include "ModemManagerDouble.h"

#include <csignal>
#include <optional>
#include <stdexcept>

#include <sys/wait.h>

namespace modem_testing
{
namespace
{

constexpr const char *name = "org.freedesktop.ModemManager1";
constexpr const char *path = "/org/freedesktop/ModemManager1";
constexpr const char *script = PELLIKO_SOURCE_DIR "/tests/platform/modem/modemmanager_double.py";
constexpr unsigned patience = 20000; // milliseconds

GDBusConnection *connectToBus()
{
    g_autofree gchar *address =
        g_dbus_address_get_for_bus_sync(G_BUS_TYPE_SYSTEM, nullptr, nullptr);
    const int flags = G_DBUS_CONNECTION_FLAGS_AUTHENTICATION_CLIENT |
                      G_DBUS_CONNECTION_FLAGS_MESSAGE_BUS_CONNECTION;
    GDBusConnection *bus = g_dbus_connection_new_for_address_sync(
        address, static_cast<GDBusConnectionFlags>(flags), nullptr, nullptr, nullptr);
    if (!bus)
        throw std::runtime_error("no private system bus");
    return bus;
}

GSubprocess *start()
{
    g_autoptr(GError) error = nullptr;
    GSubprocess *process =
        g_subprocess_new(G_SUBPROCESS_FLAGS_STDOUT_SILENCE, &error, "/usr/bin/python3", "-m",
                         "dbusmock", "--template", script, nullptr);
    if (!process)
        throw std::runtime_error(error->message);
    return process;
}

// Wakes the loop: the double signals each of its calls, and a test may wait for what came of one.
void onSignal(GDBusConnection *, const gchar *, const gchar *, const gchar *, const gchar *,
              GVariant *, gpointer)
{
}

} // namespace

bool waitUntil(const std::function<bool()> &condition)
{
    bool late = false;
    const auto onTime = [](gpointer flag) -> gboolean {
        *static_cast<bool *>(flag) = true;
        return G_SOURCE_CONTINUE;
    };
    const guint timer = g_timeout_add(patience, onTime, &late);
    while (!condition() && !late)
        g_main_context_iteration(nullptr, TRUE);
    g_source_remove(timer);
    return condition();
}

namespace
{

bool waitForName(GDBusConnection *bus, bool wanted)
{
    // Nothing is known until the bus has answered.
    std::optional<bool> owned;
    const auto appeared = [](GDBusConnection *, const gchar *, const gchar *, gpointer state) {
        *static_cast<std::optional<bool> *>(state) = true;
    };
    const auto vanished = [](GDBusConnection *, const gchar *, gpointer state) {
        *static_cast<std::optional<bool> *>(state) = false;
    };
    const guint watch = g_bus_watch_name_on_connection(bus, name, G_BUS_NAME_WATCHER_FLAGS_NONE,
                                                       appeared, vanished, &owned, nullptr);
    const bool came = waitUntil([&] { return owned == wanted; });
    g_bus_unwatch_name(watch);
    return came;
}

} // namespace

ModemManagerDouble::ModemManagerDouble() : bus_(connectToBus()), process_(start())
{
    if (!waitForName(bus_, true))
        throw std::runtime_error("the double did not start");
    g_dbus_connection_signal_subscribe(bus_, name, "org.freedesktop.DBus.Mock", "MethodCalled",
                                       path, nullptr, G_DBUS_SIGNAL_FLAGS_NONE, onSignal, nullptr,
                                       nullptr);
}

ModemManagerDouble::~ModemManagerDouble()
{
    kill();
    g_object_unref(process_);
    g_object_unref(bus_);
}

GVariant *ModemManagerDouble::call(const char *method, GVariant *arguments)
{
    g_autoptr(GError) error = nullptr;
    GVariant *reply = g_dbus_connection_call_sync(
        bus_, name, path, "org.freedesktop.DBus.Mock", method, arguments, nullptr,
        G_DBUS_CALL_FLAGS_NO_AUTO_START, static_cast<int>(patience), nullptr, &error);
    if (!reply)
        throw std::runtime_error(std::string(method) + ": " + error->message);
    return reply;
}

void ModemManagerDouble::tell(const char *method, GVariant *arguments)
{
    g_variant_unref(call(method, arguments));
}

std::string ModemManagerDouble::addModem(unsigned slot, const std::string &imsi,
                                         const std::string &operatorId, const std::string &device)
{
    g_autoptr(GVariant) reply = call("AddModem", g_variant_new("(usss)", slot, device.c_str(),
                                                               imsi.c_str(), operatorId.c_str()));
    const gchar *modem = nullptr;
    g_variant_get(reply, "(&o)", &modem);
    return modem;
}

void ModemManagerDouble::removeModem(const std::string &modem)
{
    tell("RemoveModem", g_variant_new("(o)", modem.c_str()));
}

void ModemManagerDouble::takeSim(const std::string &modem)
{
    tell("TakeSim", g_variant_new("(o)", modem.c_str()));
}

void ModemManagerDouble::insertSim(const std::string &modem, const std::string &imsi,
                                   const std::string &operatorId)
{
    tell("InsertSim", g_variant_new("(oss)", modem.c_str(), imsi.c_str(), operatorId.c_str()));
}

void ModemManagerDouble::readSim(const std::string &modem, const std::string &imsi,
                                 const std::string &operatorId)
{
    tell("ReadSim", g_variant_new("(oss)", modem.c_str(), imsi.c_str(), operatorId.c_str()));
}

void ModemManagerDouble::lock(const std::string &modem, unsigned lock)
{
    tell("Lock", g_variant_new("(ou)", modem.c_str(), lock));
}

void ModemManagerDouble::connect(const std::string &modem, bool connected)
{
    tell("Connect", g_variant_new("(ob)", modem.c_str(), connected));
}

void ModemManagerDouble::setState(const std::string &modem, int state, unsigned failedReason)
{
    tell("SetState", g_variant_new("(oiu)", modem.c_str(), state, failedReason));
}

void ModemManagerDouble::setSignal(const std::string &modem, unsigned percent)
{
    tell("SetSignal", g_variant_new("(ou)", modem.c_str(), percent));
}

void ModemManagerDouble::setSending(const std::string &how)
{
    tell("SetSending", g_variant_new("(s)", how.c_str()));
}

std::vector<Attempt> ModemManagerDouble::attempts()
{
    g_autoptr(GVariant) reply = call("Attempts", nullptr);
    g_autoptr(GVariant) list = g_variant_get_child_value(reply, 0);
    std::vector<Attempt> result;
    GVariantIter iterator;
    g_variant_iter_init(&iterator, list);
    const gchar *modem = nullptr, *number = nullptr, *text = nullptr;
    while (g_variant_iter_next(&iterator, "(&o&s&s)", &modem, &number, &text))
        result.push_back({modem, number, text});
    return result;
}

size_t ModemManagerDouble::stored(const std::string &modem)
{
    g_autoptr(GVariant) reply = call("Stored", g_variant_new("(o)", modem.c_str()));
    g_autoptr(GVariant) list = g_variant_get_child_value(reply, 0);
    return g_variant_n_children(list);
}

void ModemManagerDouble::freeze()
{
    // The signal is only on its way when it was sent; the kernel tells when the process stands.
    const auto process = static_cast<id_t>(std::stoi(g_subprocess_get_identifier(process_)));
    g_subprocess_send_signal(process_, SIGSTOP);
    siginfo_t stopped{};
    waitid(P_PID, process, &stopped, WSTOPPED);
}

void ModemManagerDouble::wake()
{
    g_subprocess_send_signal(process_, SIGCONT);
}

void ModemManagerDouble::kill()
{
    g_subprocess_force_exit(process_);
    g_subprocess_wait(process_, nullptr, nullptr);
    // The bus hears of it a little later.
    waitForName(bus_, false);
}

} // namespace modem_testing
