#pragma once

#include <gio/gio.h>
#include <gtest/gtest.h>

namespace pelliko::test
{

/// A connection that stands on the private bus where the background service would stand. Everything
/// that arrives goes through the filter, on the bus library's own thread, until the object goes:
/// keep it as the last member of what the filter works on.
class ServiceOnBus
{
public:
    ServiceOnBus(GDBusMessageFilterFunction filter, void *data)
    {
        connection_ = g_dbus_connection_new_for_address_sync(
            g_getenv("DBUS_SESSION_BUS_ADDRESS"),
            static_cast<GDBusConnectionFlags>(G_DBUS_CONNECTION_FLAGS_AUTHENTICATION_CLIENT |
                                              G_DBUS_CONNECTION_FLAGS_MESSAGE_BUS_CONNECTION),
            nullptr, nullptr, nullptr);
        g_dbus_connection_add_filter(connection_, filter, data, nullptr);
        constexpr guint32 replace = 3; // allow and do replacement
        g_autoptr(GVariant) answer = g_dbus_connection_call_sync(
            connection_, "org.freedesktop.DBus", "/org/freedesktop/DBus", "org.freedesktop.DBus",
            "RequestName", g_variant_new("(su)", "com.velmora.pelliko.Service", replace), nullptr,
            G_DBUS_CALL_FLAGS_NONE, -1, nullptr, nullptr);
        EXPECT_NE(answer, nullptr);
    }
    ~ServiceOnBus()
    {
        g_dbus_connection_close_sync(connection_, nullptr, nullptr);
        g_object_unref(connection_);
    }
    ServiceOnBus(const ServiceOnBus &) = delete;
    ServiceOnBus &operator=(const ServiceOnBus &) = delete;

    GDBusConnection *connection() const { return connection_; }

private:
    GDBusConnection *connection_ = nullptr;
};

} // namespace pelliko::test
