#include "ModemManagerService.h"

#include "Deadline.h"
#include "ModemManagerSender.h"
#include "ModemManagerSession.h"
#include "ModemManagerSim.h"
#include "SystemBus.h"

#include <array>
#include <string_view>
#include <utility>

namespace pelliko::modem
{
namespace
{

constexpr const char *modemInterface = MM_DBUS_INTERFACE_MODEM;
constexpr const char *simInterface = MM_DBUS_INTERFACE_SIM;

// The one slot of which `holds` is true; -1 when it is so of none or of several.
template <typename Holds> int onlySlot(size_t count, const Holds &holds)
{
    int found = -1;
    for (size_t slot = 0; slot < count; ++slot) {
        if (!holds(slot))
            continue;
        if (found >= 0)
            return -1;
        found = static_cast<int>(slot);
    }
    return found;
}

// The one that is connected; before there is a connection, the only one that could be.
int dataModemOf(const std::vector<MMObject *> &modems, const ModemList &list)
{
    const int connected = onlySlot(modems.size(), [&](size_t slot) {
        return mm_modem_get_state(mm_object_peek_modem(modems[slot])) == MM_MODEM_STATE_CONNECTED;
    });
    if (connected >= 0)
        return connected;
    const int ready = onlySlot(
        modems.size(), [&](size_t slot) { return list.modems[slot].sim == SimState::Ready; });
    return ready >= 0 || modems.size() != 1 ? ready : 0;
}

// A modem tells its signal strength every few seconds; only these decide what read() says.
bool matters(std::string_view interface, GVariant *properties)
{
    if (interface == simInterface)
        return true;
    constexpr std::array names{"State",          "StateFailedReason", "Sim",
                               "UnlockRequired", "PrimarySimSlot",    "Device"};
    for (const char *name : names) {
        g_autoptr(GVariant) value = g_variant_lookup_value(properties, name, nullptr);
        if (value)
            return true;
    }
    return false;
}

} // namespace

// Subscriptions at the bus, given back with the object.
struct ModemManagerService::Listener {
    explicit Listener(std::function<void()> told) : changed(std::move(told))
    {
        subscribe("org.freedesktop.DBus.ObjectManager", nullptr, nullptr, onObjects);
        for (const char *interface : {modemInterface, simInterface})
            subscribe("org.freedesktop.DBus.Properties", "PropertiesChanged", interface,
                      onProperties);
    }
    ~Listener()
    {
        for (const guint subscription : subscriptions)
            g_dbus_connection_signal_unsubscribe(bus, subscription);
    }
    Listener(const Listener &) = delete;
    Listener &operator=(const Listener &) = delete;

    void subscribe(const char *interface, const char *signal, const char *about,
                   GDBusSignalCallback function)
    {
        if (bus)
            subscriptions.push_back(g_dbus_connection_signal_subscribe(
                bus, MM_DBUS_SERVICE, interface, signal, nullptr, about, G_DBUS_SIGNAL_FLAGS_NONE,
                function, this, nullptr));
    }
    static void onObjects(GDBusConnection *, const gchar *, const gchar *, const gchar *,
                          const gchar *, GVariant *, gpointer self)
    {
        static_cast<Listener *>(self)->changed();
    }
    static void onProperties(GDBusConnection *, const gchar *, const gchar *, const gchar *,
                             const gchar *, GVariant *parameters, gpointer self)
    {
        const gchar *interface = nullptr;
        g_autoptr(GVariant) properties = nullptr;
        g_variant_get(parameters, "(&s@a{sv}@as)", &interface, &properties, nullptr);
        if (matters(interface, properties))
            static_cast<Listener *>(self)->changed();
    }

    std::function<void()> changed;
    GDBusConnection *bus = systemBus();
    std::vector<guint> subscriptions;
};

ModemManagerService::ModemManagerService(std::chrono::milliseconds readLimit,
                                         std::chrono::milliseconds sendLimit)
    : readLimit_(readLimit), sendLimit_(sendLimit)
{
}

ModemManagerService::~ModemManagerService() = default;

const char *ModemManagerService::busName() const
{
    return MM_DBUS_SERVICE;
}

std::optional<ModemList> ModemManagerService::read()
{
    const Deadline deadline(readLimit_);
    const ModemManagerSession session(deadline.cancellable());
    if (!session.present())
        return std::nullopt;
    ModemList list;
    list.error = session.error();
    for (MMObject *modem : session.modems())
        list.modems.push_back(describe(modem, deadline.cancellable()));
    list.dataModem = dataModemOf(session.modems(), list);
    return list;
}

void ModemManagerService::listen(std::function<void()> changed)
{
    listener_ = std::make_unique<Listener>(std::move(changed));
}

std::string ModemManagerService::sendSms(int slot, const std::string &to, const std::string &text)
{
    const Deadline deadline(sendLimit_);
    const ModemManagerSession session(deadline.cancellable());
    if (!session.present())
        return "the modem service is not running";
    if (!session.error().empty())
        return session.error();
    if (slot < 0 || static_cast<size_t>(slot) >= session.modems().size())
        return "there is no modem for SIM slot " + std::to_string(slot + 1LL);
    return sendThrough(session.modems()[static_cast<size_t>(slot)], to, text,
                       deadline.cancellable());
}

} // namespace pelliko::modem
