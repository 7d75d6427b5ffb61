#include "NetworkGate.h"

#include <gio/gio.h>

namespace pelliko::service
{
namespace
{
void onNetworkChanged(GNetworkMonitor *, gboolean, gpointer changed)
{
    (*static_cast<std::function<void()> *>(changed))();
}

void onMeteredChanged(GNetworkMonitor *, GParamSpec *, gpointer changed)
{
    (*static_cast<std::function<void()> *>(changed))();
}
} // namespace

bool onLoopback(const std::string &server)
{
    g_autoptr(GUri) uri = g_uri_parse(server.c_str(), G_URI_FLAGS_NONE, nullptr);
    const char *host = uri ? g_uri_get_host(uri) : nullptr;
    if (!host) {
        return false;
    }
    g_autoptr(GInetAddress) address = g_inet_address_new_from_string(host);
    return address ? g_inet_address_get_is_loopback(address) != FALSE
                   : g_strcmp0(host, "localhost") == 0;
}

MonitorGate::MonitorGate(std::function<void()> changed) : changed_(std::move(changed))
{
    GNetworkMonitor *monitor = g_network_monitor_get_default();
    networkHandler_ =
        g_signal_connect(monitor, "network-changed", G_CALLBACK(onNetworkChanged), &changed_);
    meteredHandler_ = g_signal_connect(monitor, "notify::network-metered",
                                       G_CALLBACK(onMeteredChanged), &changed_);
}

MonitorGate::~MonitorGate()
{
    GNetworkMonitor *monitor = g_network_monitor_get_default();
    g_signal_handler_disconnect(monitor, networkHandler_);
    g_signal_handler_disconnect(monitor, meteredHandler_);
}

bool MonitorGate::open(const std::string &server, bool wifiOnly) const
{
    GNetworkMonitor *monitor = g_network_monitor_get_default();
    if (wifiOnly && g_network_monitor_get_network_metered(monitor)) {
        return false;
    }
    return g_network_monitor_get_network_available(monitor) || onLoopback(server);
}

} // namespace pelliko::service
