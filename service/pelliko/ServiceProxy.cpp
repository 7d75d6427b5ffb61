#include "ServiceProxy.h"

#include "StatusReports.h"
#include "pelliko_client.h"

namespace pelliko::client
{
namespace
{
constexpr const char *busName = "com.velmora.pelliko.Service";
constexpr const char *objectPath = "/com/velmora/pelliko/Service";
constexpr const char *initializingError = "com.velmora.pelliko.Service.Error.Initializing";

void onUploadStatus(PellikoService1 *, gint id, gint status, const gchar *input, gint percent,
                    gint64 expired, gint error, gpointer)
{
    deliverReport({id, status, input, percent, expired, error});
}

void onOwnerChanged(GObject *proxy, GParamSpec *, gpointer)
{
    g_autofree char *owner = g_dbus_proxy_get_name_owner(G_DBUS_PROXY(proxy));
    if (!owner) {
        serviceVanished();
    }
}

PellikoService1 *makeProxy()
{
    // Properties are not loaded: the owner then changes in step with the signals that follow it.
    const auto flags =
        static_cast<GDBusProxyFlags>(G_DBUS_PROXY_FLAGS_DO_NOT_LOAD_PROPERTIES |
                                     G_DBUS_PROXY_FLAGS_DO_NOT_AUTO_START_AT_CONSTRUCTION);
    g_autoptr(GError) error = nullptr;
    PellikoService1 *proxy = pelliko_service1_proxy_new_for_bus_sync(
        G_BUS_TYPE_SESSION, flags, busName, objectPath, nullptr, &error);
    if (!proxy) {
        g_warning("pelliko client: no session bus: %s", error->message);
        return nullptr;
    }
    g_signal_connect(proxy, "upload-status", G_CALLBACK(onUploadStatus), nullptr);
    g_signal_connect(proxy, "notify::g-name-owner", G_CALLBACK(onOwnerChanged), nullptr);
    return proxy;
}
} // namespace

PellikoService1 *serviceProxy()
{
    static PellikoService1 *proxy = nullptr;
    if (!proxy) {
        proxy = makeProxy();
    }
    return proxy;
}

int codeOf(const GError *error)
{
    g_autofree char *name = g_dbus_error_get_remote_error(error);
    if (g_strcmp0(name, initializingError) == 0) {
        return PELLIKO_ERROR_SERVICE_INITIALIZING;
    }
    return PELLIKO_ERROR_SERVICE_NOT_RUNNING;
}

} // namespace pelliko::client
