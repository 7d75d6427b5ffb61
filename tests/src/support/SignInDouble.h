#pragma once

#include <algorithm>
#include <gio/gio.h>
#include <gtest/gtest.h>
#include <map>
#include <string>
#include <vector>

namespace pelliko::test
{

/// Stands on the private bus where the sign-in application would stand and answers when, and what,
/// the test wants. Served by the default main context.
class SignInDouble
{
public:
    struct Request {
        std::string operation;
        std::vector<std::string> servers;
        bool reply_wanted = false;
        GDBusMethodInvocation *call = nullptr; ///< until it is answered
    };

    SignInDouble()
    {
        bus_ = g_dbus_connection_new_for_address_sync(
            g_getenv("DBUS_SESSION_BUS_ADDRESS"),
            static_cast<GDBusConnectionFlags>(G_DBUS_CONNECTION_FLAGS_AUTHENTICATION_CLIENT |
                                              G_DBUS_CONNECTION_FLAGS_MESSAGE_BUS_CONNECTION),
            nullptr, nullptr, nullptr);
        static const GDBusInterfaceVTable functions = {onCall, nullptr, nullptr, {}};
        interface_ = g_dbus_node_info_new_for_xml(description, nullptr);
        EXPECT_NE(g_dbus_connection_register_object(bus_, "/com/velmora/korrin",
                                                    interface_->interfaces[0], &functions, this,
                                                    nullptr, nullptr),
                  0u);
        g_autoptr(GVariant) owner = g_dbus_connection_call_sync(
            bus_, "org.freedesktop.DBus", "/org/freedesktop/DBus", "org.freedesktop.DBus",
            "RequestName", g_variant_new("(su)", "com.velmora.korrin", 0u), nullptr,
            G_DBUS_CALL_FLAGS_NONE, -1, nullptr, nullptr);
        EXPECT_NE(owner, nullptr);
    }
    ~SignInDouble() { leave(); }
    SignInDouble(const SignInDouble &) = delete;
    SignInDouble &operator=(const SignInDouble &) = delete;

    const std::vector<Request> &requests() const { return requests_; }

    /// Whether a request is still to be answered.
    bool owes() const
    {
        return std::any_of(requests_.begin(), requests_.end(),
                           [](const Request &request) { return request.call; });
    }

    /// Answers the request of that number.
    void answer(size_t request, int result, const std::map<std::string, std::string> &extras = {})
    {
        GVariantBuilder reply;
        g_variant_builder_init(&reply, G_VARIANT_TYPE_VARDICT);
        for (const auto &[key, value] : extras)
            g_variant_builder_add(&reply, "{sv}", key.c_str(), g_variant_new_string(value.c_str()));
        g_dbus_method_invocation_return_value(requests_.at(request).call,
                                              g_variant_new("(ia{sv})", result, &reply));
        requests_.at(request).call = nullptr;
    }

    /// Ends without an answer.
    void leave()
    {
        if (!bus_)
            return;
        g_dbus_connection_close_sync(bus_, nullptr, nullptr);
        for (Request &request : requests_)
            g_clear_object(&request.call);
        g_clear_object(&bus_);
        g_dbus_node_info_unref(interface_);
    }

private:
    static constexpr const char *description =
        "<node><interface name='com.velmora.Platform.Application1'><method name='Launch'>"
        "<arg type='a{sv}' direction='in'/><arg type='b' direction='in'/>"
        "<arg type='i' direction='out'/><arg type='a{sv}' direction='out'/>"
        "</method></interface></node>";

    static void onCall(GDBusConnection *, const char *, const char *, const char *, const char *,
                       GVariant *parameters, GDBusMethodInvocation *call, void *self)
    {
        Request request;
        request.call = call;
        g_autoptr(GVariant) contents = nullptr;
        gboolean reply_wanted = FALSE;
        g_variant_get(parameters, "(@a{sv}b)", &contents, &reply_wanted);
        request.reply_wanted = reply_wanted != FALSE;
        const char *operation = "";
        g_variant_lookup(contents, "operation", "&s", &operation);
        request.operation = operation;
        g_autoptr(GVariant) extras =
            g_variant_lookup_value(contents, "extras", G_VARIANT_TYPE_VARDICT);
        g_autofree const char **servers = nullptr;
        if (extras && g_variant_lookup(extras, "server", "^a&s", &servers))
            request.servers.assign(servers, servers + g_strv_length(const_cast<char **>(servers)));
        static_cast<SignInDouble *>(self)->requests_.push_back(request);
    }

    GDBusConnection *bus_ = nullptr;
    GDBusNodeInfo *interface_ = nullptr;
    std::vector<Request> requests_;
};

} // namespace pelliko::test
