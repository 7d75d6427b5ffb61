#include "OfonoService.h"

#include "OfonoNames.h"
#include "OfonoSender.h"

#include <algorithm>
#include <cstring>

namespace pelliko::modem
{

namespace
{

using namespace ofono;

constexpr int kTimeoutMs = 3000;

struct Found {
    std::string path;
    VariantPtr properties;
};

// ril_10 comes after ril_2.
bool comesBefore(const Found &left, const Found &right)
{
    return strverscmp(left.path.c_str(), right.path.c_str()) < 0;
}

std::vector<Found> modemsOf(GVariant *reply)
{
    std::vector<Found> found;
    const VariantPtr entries(g_variant_get_child_value(reply, 0));
    for (gsize i = 0; i < g_variant_n_children(entries.get()); ++i) {
        const VariantPtr entry(g_variant_get_child_value(entries.get(), i));
        const VariantPtr path(g_variant_get_child_value(entry.get(), 0));
        found.push_back({g_variant_get_string(path.get(), nullptr),
                         VariantPtr(g_variant_get_child_value(entry.get(), 1))});
    }
    std::sort(found.begin(), found.end(), comesBefore);
    return found;
}

VariantPtr propertiesOf(const std::string &path, const char *interface)
{
    std::string error;
    const VariantPtr reply =
        callOnSystemBus(kService, path, interface, "GetProperties", nullptr, kTimeoutMs, error);
    if (!reply || !g_variant_is_of_type(reply.get(), G_VARIANT_TYPE("(a{sv})")))
        return nullptr;
    return VariantPtr(g_variant_get_child_value(reply.get(), 0));
}

SimState stateOf(GVariant *sim)
{
    if (!flagOf(sim, "Present"))
        return SimState::Missing;
    const std::string required = textOf(sim, "PinRequired");
    if (!required.empty() && required != "none")
        return SimState::Locked;
    return textOf(sim, "SubscriberIdentity").empty() ? SimState::Unknown : SimState::Ready;
}

int mncLengthOf(GVariant *sim)
{
    const std::size_t length = textOf(sim, "MobileNetworkCode").size();
    return length == 2 || length == 3 ? static_cast<int>(length) : 0;
}

Modem describe(const Found &found)
{
    Modem modem;
    modem.name = found.path;
    if (!hasInterface(found.properties.get(), kSimManager))
        return modem;
    const VariantPtr sim = propertiesOf(found.path, kSimManager);
    if (!sim)
        return modem;
    modem.sim = stateOf(sim.get());
    modem.imsi = textOf(sim.get(), "SubscriberIdentity");
    modem.mncLength = mncLengthOf(sim.get());
    return modem;
}

bool carriesData(const std::string &path)
{
    std::string error;
    const VariantPtr reply = callOnSystemBus(kService, path, kConnectionManager, "GetContexts",
                                             nullptr, kTimeoutMs, error);
    if (!reply || !g_variant_is_of_type(reply.get(), G_VARIANT_TYPE("(a(oa{sv}))")))
        return false;
    const VariantPtr contexts(g_variant_get_child_value(reply.get(), 0));
    for (gsize i = 0; i < g_variant_n_children(contexts.get()); ++i) {
        const VariantPtr context(g_variant_get_child_value(contexts.get(), i));
        const VariantPtr properties(g_variant_get_child_value(context.get(), 1));
        if (flagOf(properties.get(), "Active"))
            return true;
    }
    return false;
}

// oFono knows no default: the only SIM carries the data, else the only one with a connection up.
int dataModemOf(const std::vector<Modem> &modems)
{
    std::vector<int> ready;
    for (std::size_t slot = 0; slot < modems.size(); ++slot) {
        if (modems[slot].sim == SimState::Ready)
            ready.push_back(static_cast<int>(slot));
    }
    if (ready.size() > 1) {
        const auto idle = [&](int slot) {
            return !carriesData(modems[static_cast<std::size_t>(slot)].name);
        };
        ready.erase(std::remove_if(ready.begin(), ready.end(), idle), ready.end());
    }
    return ready.size() == 1 ? ready.front() : -1;
}

class OfonoService : public ModemService
{
public:
    ~OfonoService() override;
    const char *busName() const override { return kService; }
    std::optional<ModemList> read() override;
    void listen(std::function<void()> changed) override;
    std::string sendSms(int slot, const std::string &to, const std::string &text) override;

private:
    std::function<void()> changed_;
    std::vector<guint> subscriptions_;
};

OfonoService::~OfonoService()
{
    for (const guint subscription : subscriptions_)
        g_dbus_connection_signal_unsubscribe(systemBus(), subscription);
}

std::optional<ModemList> OfonoService::read()
{
    if (!isOnSystemBus(kService))
        return std::nullopt;
    ModemList list;
    const VariantPtr reply =
        callOnSystemBus(kService, "/", kManager, "GetModems", nullptr, kTimeoutMs, list.error);
    if (!reply || !g_variant_is_of_type(reply.get(), G_VARIANT_TYPE("(a(oa{sv}))"))) {
        list.error = "oFono does not answer: " + list.error;
        return list;
    }
    for (const Found &found : modemsOf(reply.get()))
        list.modems.push_back(describe(found));
    list.dataModem = dataModemOf(list.modems);
    return list;
}

void OfonoService::listen(std::function<void()> changed)
{
    changed_ = std::move(changed);
    GDBusConnection *bus = systemBus();
    if (!bus)
        return;
    const auto heard = [](GDBusConnection *, const gchar *, const gchar *, const gchar *,
                          const gchar *, GVariant *,
                          gpointer self) { static_cast<OfonoService *>(self)->changed_(); };
    for (const char *interface : {kManager, kModem, kSimManager, kConnectionContext}) {
        subscriptions_.push_back(
            g_dbus_connection_signal_subscribe(bus, kService, interface, nullptr, nullptr, nullptr,
                                               G_DBUS_SIGNAL_FLAGS_NONE, heard, this, nullptr));
    }
}

std::string OfonoService::sendSms(int slot, const std::string &to, const std::string &text)
{
    const std::optional<ModemList> list = read();
    if (!list)
        return "oFono is not running";
    if (!list->error.empty())
        return list->error;
    if (slot < 0 || static_cast<std::size_t>(slot) >= list->modems.size())
        return "there is no modem for SIM slot " + std::to_string(slot + 1);
    return sendThroughOfono(list->modems[static_cast<std::size_t>(slot)], to, text);
}

} // namespace

std::unique_ptr<ModemService> makeOfonoService()
{
    return std::make_unique<OfonoService>();
}

} // namespace pelliko::modem
