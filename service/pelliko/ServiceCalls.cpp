#include "ServiceCalls.h"

#include "ServiceProxy.h"

#include <map>
#include <utility>

namespace pelliko::client
{
namespace
{
constexpr const char *busName = "com.velmora.pelliko.Service";
constexpr const char *objectPath = "/com/velmora/pelliko/Service";
constexpr const char *interfaceName = "com.velmora.pelliko.Shares1";

uint32_t lastNumber = 0;

std::map<uint32_t, CallDone> &openCalls()
{
    static std::map<uint32_t, CallDone> calls;
    return calls;
}

void onReply(GObject *source, GAsyncResult *result, gpointer number)
{
    g_autoptr(GError) error = nullptr;
    g_autoptr(GVariant) reply =
        g_dbus_connection_call_finish(G_DBUS_CONNECTION(source), result, &error);
    const auto found = openCalls().find(GPOINTER_TO_UINT(number));
    if (found == openCalls().end()) {
        return;
    }
    const CallDone done = std::move(found->second);
    openCalls().erase(found);
    done(reply ? 0 : codeOf(error), reply);
}
} // namespace

GDBusConnection *sessionBus()
{
    static GDBusConnection *bus = nullptr;
    if (!bus) {
        g_autoptr(GError) error = nullptr;
        bus = g_bus_get_sync(G_BUS_TYPE_SESSION, nullptr, &error);
        if (!bus) {
            g_warning("pelliko client: no session bus: %s", error->message);
        }
    }
    return bus;
}

uint32_t nextCallNumber()
{
    return lastNumber + 1;
}

uint32_t callService(const char *method, GVariant *arguments, CallDone done)
{
    GDBusConnection *bus = sessionBus();
    if (!bus) {
        if (arguments) {
            g_variant_unref(g_variant_ref_sink(arguments));
        }
        return 0;
    }
    const uint32_t number = ++lastNumber;
    openCalls()[number] = std::move(done);
    // A download takes as long as it takes; when the service ends, the bus answers in its place.
    g_dbus_connection_call(bus, busName, objectPath, interfaceName, method, arguments, nullptr,
                           G_DBUS_CALL_FLAGS_NONE, G_MAXINT, nullptr, onReply,
                           GUINT_TO_POINTER(number));
    return number;
}

bool stopCall(uint32_t call)
{
    return openCalls().erase(call) != 0;
}

} // namespace pelliko::client
