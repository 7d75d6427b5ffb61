// A first request beside screen readers. Who tells where their bus is is a double here, so that it
// can be late.
#include "World.h"

#include <csignal>
#include <cstdlib>
#include <string>

#include <gio/gio.h>
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

constexpr const char *registryName = "org.a11y.atspi.Registry";
constexpr const char *registryPath = "/org/a11y/atspi/accessible/root";
constexpr const char *registryXml = R"xml(
<node>
  <interface name="org.a11y.atspi.Socket">
    <method name="Embed">
      <arg direction="in" type="(so)"/><arg direction="out" type="(so)"/>
    </method>
  </interface>
  <interface name="org.a11y.atspi.Accessible">
    <method name="GetChildren"><arg direction="out" type="a(so)"/></method>
  </interface>
</node>)xml";

GDBusConnection *connectTo(const char *address)
{
    return g_dbus_connection_new_for_address_sync(
        address,
        static_cast<GDBusConnectionFlags>(G_DBUS_CONNECTION_FLAGS_AUTHENTICATION_CLIENT |
                                          G_DBUS_CONNECTION_FLAGS_MESSAGE_BUS_CONNECTION),
        nullptr, nullptr, nullptr);
}

GVariant *askBus(GDBusConnection *bus, const char *method, GVariant *arguments)
{
    return g_dbus_connection_call_sync(bus, "org.freedesktop.DBus", "/org/freedesktop/DBus",
                                       "org.freedesktop.DBus", method, arguments, nullptr,
                                       G_DBUS_CALL_FLAGS_NONE, -1, nullptr, nullptr);
}

// Without the object there is nobody to answer: first it, then the name.
void serve(GDBusConnection *bus, const char *name, const char *path, const char *xml,
           const GDBusInterfaceVTable *answers, gpointer data)
{
    g_autoptr(GDBusNodeInfo) node = g_dbus_node_info_new_for_xml(xml, nullptr);
    for (int i = 0; node->interfaces[i]; ++i)
        g_dbus_connection_register_object(bus, path, node->interfaces[i], answers, data, nullptr,
                                          nullptr);
    g_autoptr(GVariant) owned = askBus(
        bus, "RequestName", g_variant_new("(su)", name, G_BUS_NAME_OWNER_FLAGS_DO_NOT_QUEUE));
    guint32 reply = 0;
    if (owned)
        g_variant_get(owned, "(u)", &reply);
    EXPECT_EQ(1U, reply) << "the name is taken";
}

void leave(GDBusConnection *bus)
{
    g_dbus_connection_close_sync(bus, nullptr, nullptr);
    g_object_unref(bus);
}

// A bus of the kind on which readers and programs meet. The bus starts the desktop's own registry
// of programs when the first one comes.
class MeetingPlace
{
public:
    MeetingPlace()
    {
        g_autoptr(GDataInputStream) said =
            g_data_input_stream_new(g_subprocess_get_stdout_pipe(daemon_));
        address_ = g_data_input_stream_read_line(said, nullptr, nullptr, nullptr);
        bus_ = connectTo(address_);
        g_dbus_connection_signal_subscribe(
            bus_, registryName, "org.a11y.atspi.Event.Object", "ChildrenChanged", registryPath,
            "add", G_DBUS_SIGNAL_FLAGS_NONE,
            [](GDBusConnection *, const char *, const char *, const char *, const char *,
               GVariant *, gpointer count) { ++*static_cast<int *>(count); },
            &known_, nullptr);
    }
    ~MeetingPlace()
    {
        leave(bus_);
        g_subprocess_force_exit(daemon_);
        g_subprocess_wait(daemon_, nullptr, nullptr);
        g_object_unref(daemon_);
        g_free(address_);
    }
    MeetingPlace(const MeetingPlace &) = delete;
    MeetingPlace &operator=(const MeetingPlace &) = delete;

    const char *address() const { return address_; }
    GDBusConnection *bus() const { return bus_; }
    /// How often the registry has got to know a program.
    int known() const { return known_; }

private:
    GSubprocess *daemon_ = g_subprocess_new(
        G_SUBPROCESS_FLAGS_STDOUT_PIPE, nullptr, "dbus-daemon", "--nofork", "--print-address",
        "--config-file=/usr/share/defaults/at-spi2/accessibility.conf", nullptr);
    char *address_ = nullptr;
    GDBusConnection *bus_ = nullptr;
    int known_ = 0;
};

// A registry that takes every program in and lists none.
class ForgetfulRegistry
{
public:
    explicit ForgetfulRegistry(const MeetingPlace &place)
    {
        static const GDBusInterfaceVTable answers{onCall, nullptr, nullptr, {}};
        serve(place.bus(), registryName, registryPath, registryXml, &answers, &taken_);
    }
    int taken() const { return taken_; }

private:
    static void onCall(GDBusConnection *, const char *, const char *, const char *,
                       const char *method, GVariant *, GDBusMethodInvocation *call, gpointer taken)
    {
        const bool embed = std::string(method) == "Embed";
        *static_cast<int *>(taken) += embed;
        g_dbus_method_invocation_return_value(
            call, embed ? g_variant_new("((so))", registryName, registryPath)
                        : g_variant_new("(a(so))", nullptr));
    }

    int taken_ = 0;
};

// Says that a screen reader is there, and where its bus is.
class ReadersBus
{
public:
    /// The first `slow` questions for the address are answered after a fifth of a second.
    explicit ReadersBus(const char *address, int slow = 0) : address_(address), slow_(slow)
    {
        endTheRealOne();
        static const GDBusInterfaceVTable answers{onCall, onGet, nullptr, {}};
        serve(bus_, busName, "/org/a11y/bus", busXml, &answers, this);
    }
    ~ReadersBus() { leave(bus_); }
    ReadersBus(const ReadersBus &) = delete;
    ReadersBus &operator=(const ReadersBus &) = delete;

private:
    // Other tests of this session may have started it.
    void endTheRealOne()
    {
        g_autoptr(GVariant) answer =
            askBus(bus_, "GetConnectionUnixProcessID", g_variant_new("(s)", busName));
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
        if (self->slow_-- > 0)
            g_usleep(200 * 1000);
        g_dbus_method_invocation_return_value(call, g_variant_new("(s)", self->address_));
    }

    static GVariant *onGet(GDBusConnection *, const char *, const char *, const char *,
                           const char *, GError **, gpointer)
    {
        return g_variant_new_boolean(TRUE);
    }

    static GDBusConnection *connectToSession()
    {
        g_autofree char *address =
            g_dbus_address_get_for_bus_sync(G_BUS_TYPE_SESSION, nullptr, nullptr);
        return connectTo(address);
    }

    const char *const address_;
    int slow_;
    GDBusConnection *bus_ = connectToSession();
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
TEST(Readers, TheFirstRequestComesWhenTheyKnowTheApplication)
{
    const MeetingPlace place;
    const ReadersBus readers(place.address());
    const RecorderApp app("Readers", false);
    runUntilItsFirstRequest(app);
    EXPECT_THAT(app.diary(), Contains(StartsWith("first")));
    EXPECT_TRUE(turnUntil([&] { return place.known() >= 1; }));
}

// The toolkit waits for a tenth of a second.
TEST(Readers, ABusThatAnswersTooLateIsFoundAllTheSame)
{
    const MeetingPlace place;
    const ReadersBus readers(place.address(), 3);
    const RecorderApp app("Readers", false);
    runUntilItsFirstRequest(app);
    EXPECT_THAT(app.diary(), Contains(StartsWith("first")));
    EXPECT_TRUE(turnUntil([&] { return place.known() >= 1; }));
}

TEST(Readers, TheFirstRequestComesAlthoughTheyNeverGetToKnowTheApplication)
{
    const MeetingPlace place;
    const ForgetfulRegistry registry(place);
    const ReadersBus readers(place.address());
    const RecorderApp app("Readers", false);
    runUntilItsFirstRequest(app);
    EXPECT_THAT(app.diary(), Contains(StartsWith("first")));
    EXPECT_GE(registry.taken(), 2) << "the toolkit was not asked to try again";
}

TEST(Readers, TheFirstRequestComesAlthoughTheirBusIsNotThere)
{
    const ReadersBus readers("unix:path=/nowhere/readers");
    const RecorderApp app("Readers", false);
    runUntilItsFirstRequest(app);
    EXPECT_THAT(app.diary(), Contains(StartsWith("first")));
}
