// A first request beside screen readers, whose bus is a double here: it counts who asks for it.
#include "World.h"

#include <csignal>
#include <cstdlib>
#include <filesystem>
#include <string>

#include <gio/gunixsocketaddress.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>

using namespace pelliko::test;
using testing::Contains;
using testing::StartsWith;

namespace
{

constexpr const char *busName = "org.a11y.Bus";
constexpr const char *busXml = R"(
<node>
  <interface name="org.a11y.Bus">
    <method name="GetAddress"><arg direction="out" type="s"/></method>
  </interface>
  <interface name="org.a11y.Status">
    <property name="IsEnabled" type="b" access="read"/>
    <property name="ScreenReaderEnabled" type="b" access="read"/>
  </interface>
</node>)";

// Says that a screen reader is there, and where its bus is; whoever comes to that place is counted
// and sent away.
class ReadersBus
{
public:
    /// The first `slow` questions for the address are answered after a fifth of a second.
    explicit ReadersBus(const RecorderApp &app, int slow = 0) : app_(app), slow_(slow)
    {
        listen();
        endTheRealOne();
        g_autoptr(GDBusNodeInfo) node = g_dbus_node_info_new_for_xml(busXml, nullptr);
        static const GDBusInterfaceVTable answers{onCall, onGet, nullptr, {}};
        for (int i = 0; node->interfaces[i]; ++i)
            g_dbus_connection_register_object(bus_, "/org/a11y/bus", node->interfaces[i], &answers,
                                              this, nullptr, nullptr);
        g_autoptr(GVariant) owned =
            ask("RequestName", g_variant_new("(su)", busName, G_BUS_NAME_OWNER_FLAGS_DO_NOT_QUEUE));
        guint32 reply = 0;
        if (owned)
            g_variant_get(owned, "(u)", &reply);
        EXPECT_EQ(1U, reply) << "the name is taken";
    }
    ~ReadersBus()
    {
        g_dbus_connection_close_sync(bus_, nullptr, nullptr);
        g_object_unref(bus_);
        g_socket_service_stop(place_);
        g_object_unref(place_);
    }
    ReadersBus(const ReadersBus &) = delete;
    ReadersBus &operator=(const ReadersBus &) = delete;

    /// How often its address was asked for while the application had no request yet.
    int askedBefore() const { return askedBefore_; }
    /// How often somebody came to the address.
    int visits() const { return visits_; }

private:
    void listen()
    {
        std::filesystem::remove(path_);
        g_autoptr(GSocketAddress) address = g_unix_socket_address_new(path_.c_str());
        EXPECT_TRUE(g_socket_listener_add_address(G_SOCKET_LISTENER(place_), address,
                                                  G_SOCKET_TYPE_STREAM, G_SOCKET_PROTOCOL_DEFAULT,
                                                  nullptr, nullptr, nullptr));
        g_signal_connect(place_, "incoming",
                         G_CALLBACK(+[](GSocketService *, GSocketConnection *, GObject *,
                                        gpointer count) -> gboolean {
                             ++*static_cast<int *>(count);
                             return TRUE;
                         }),
                         &visits_);
    }

    GVariant *ask(const char *method, GVariant *arguments)
    {
        return g_dbus_connection_call_sync(bus_, "org.freedesktop.DBus", "/org/freedesktop/DBus",
                                           "org.freedesktop.DBus", method, arguments, nullptr,
                                           G_DBUS_CALL_FLAGS_NONE, -1, nullptr, nullptr);
    }

    // Other tests of this session may have started it.
    void endTheRealOne()
    {
        g_autoptr(GVariant) answer =
            ask("GetConnectionUnixProcessID", g_variant_new("(s)", busName));
        if (!answer)
            return;
        bool gone = false;
        const guint watch = g_bus_watch_name_on_connection(
            bus_, busName, G_BUS_NAME_WATCHER_FLAGS_NONE, nullptr,
            [](GDBusConnection *, const char *, gpointer flag) {
                *static_cast<bool *>(flag) = true;
            },
            &gone, nullptr);
        guint32 pid = 0;
        g_variant_get(answer, "(u)", &pid);
        kill(static_cast<pid_t>(pid), SIGKILL);
        EXPECT_TRUE(turnUntil([&] { return gone; }));
        g_bus_unwatch_name(watch);
    }

    static void onCall(GDBusConnection *, const char *, const char *, const char *, const char *,
                       GVariant *, GDBusMethodInvocation *call, gpointer data)
    {
        auto *self = static_cast<ReadersBus *>(data);
        if (!testing::Matches(Contains(StartsWith("first")))(self->app_.diary()))
            ++self->askedBefore_;
        if (self->slow_-- > 0)
            g_usleep(200 * 1000);
        const std::string address = "unix:path=" + self->path_;
        g_dbus_method_invocation_return_value(call, g_variant_new("(s)", address.c_str()));
    }

    static GVariant *onGet(GDBusConnection *, const char *, const char *, const char *,
                           const char *, GError **, gpointer)
    {
        return g_variant_new_boolean(TRUE);
    }

    static GDBusConnection *connect()
    {
        g_autofree char *address =
            g_dbus_address_get_for_bus_sync(G_BUS_TYPE_SESSION, nullptr, nullptr);
        return g_dbus_connection_new_for_address_sync(
            address,
            static_cast<GDBusConnectionFlags>(G_DBUS_CONNECTION_FLAGS_AUTHENTICATION_CLIENT |
                                              G_DBUS_CONNECTION_FLAGS_MESSAGE_BUS_CONNECTION),
            nullptr, nullptr, nullptr);
    }

    const RecorderApp &app_;
    int slow_;
    const std::string path_ = std::string(g_get_user_runtime_dir()) + "/readers-place";
    int visits_ = 0;
    GSocketService *place_ = g_socket_service_new();
    GDBusConnection *bus_ = connect();
    int askedBefore_ = 0;
};

void runUntilItsFirstRequest(const RecorderApp &app)
{
    setenv("RECORDER_EXITS", "1", 1); // with its first request
    g_autoptr(GSubprocess) process = app.spawn();
    unsetenv("RECORDER_EXITS");
    bool ended = false;
    g_subprocess_wait_async(
        process, nullptr,
        [](GObject *, GAsyncResult *, gpointer flag) { *static_cast<bool *>(flag) = true; },
        &ended);
    EXPECT_TRUE(turnUntil([&] { return ended; }));
}

} // namespace

// A popup keeps the main loop busy for longer than the toolkit waits for the readers' address.
TEST(Readers, TheFirstRequestComesWhenTheToolkitHasFoundTheirBus)
{
    const RecorderApp app("Readers", false);
    ReadersBus readers(app);
    runUntilItsFirstRequest(app);
    EXPECT_THAT(app.diary(), Contains(StartsWith("first")));
    // The toolkit's own question lies between two of the frame.
    EXPECT_GE(readers.askedBefore(), 3);
}

// The toolkit waits for a tenth of a second.
TEST(Readers, ABusThatAnswersTooLateIsFoundAllTheSame)
{
    const RecorderApp app("Readers", false);
    ReadersBus readers(app, 3);
    runUntilItsFirstRequest(app);
    EXPECT_THAT(app.diary(), Contains(StartsWith("first")));
    EXPECT_GE(readers.visits(), 1);
}
