#include "World.h"

#include <gmock/gmock.h>

using testing::Contains;
using testing::ElementsAre;
using testing::Not;

namespace
{
constexpr const char *managerName = "org.freedesktop.NetworkManager";
constexpr const char *managerPath = "/org/freedesktop/NetworkManager";
constexpr unsigned notMetered = 2;
constexpr unsigned metered = 1;

/** A network manager on the world's system bus whose network can be made metered. */
class UploadNetwork : public World
{
protected:
    void SetUp() override
    {
        bus_ = g_bus_get_sync(G_BUS_TYPE_SYSTEM, nullptr, nullptr);
        startManager();
    }

    void startManager()
    {
        manager_ = std::make_unique<Process>(std::vector<std::string>{
            "/usr/bin/python3", "-m", "dbusmock", "--system", "--template", "networkmanager"});
        ASSERT_TRUE(waitForName(G_BUS_TYPE_SYSTEM, managerName, true));
        // 70 is "connected globally", 4 is "full"; the properties have to be there before the
        // service starts.
        mock("SetGlobalConnectionState", g_variant_new("(u)", 70U));
        mock("SetConnectivity", g_variant_new("(u)", 4U));
        mock("AddProperty",
             g_variant_new("(ssv)", managerName, "Metered", g_variant_new_uint32(notMetered)));
    }

    void TearDown() override
    {
        service_->end(SIGTERM);
        stopManager();
        g_object_unref(bus_);
    }

    void stopManager()
    {
        manager_.reset();
        ASSERT_TRUE(waitForName(G_BUS_TYPE_SYSTEM, managerName, false));
    }

    void setMetered(unsigned value)
    {
        GVariantBuilder properties;
        g_variant_builder_init(&properties, G_VARIANT_TYPE_VARDICT);
        g_variant_builder_add(&properties, "{sv}", "Metered", g_variant_new_uint32(value));
        mock("UpdateProperties", g_variant_new("(sa{sv})", managerName, &properties));
    }

    void mock(const char *method, GVariant *parameters)
    {
        g_autoptr(GError) error = nullptr;
        g_autoptr(GVariant) reply = g_dbus_connection_call_sync(
            bus_, managerName, managerPath, "org.freedesktop.DBus.Mock", method, parameters,
            nullptr, G_DBUS_CALL_FLAGS_NONE, -1, nullptr, &error);
        ASSERT_TRUE(reply) << error->message;
    }

    // The proxy keeps the rest back until it gets a signal.
    void stopInTheMiddleOfAWifiOnlyUpload(int32_t &id)
    {
        startServer();
        startProxy(3'000'000);
        startService({"--chunk", "1000000"});
        ASSERT_EQ(request({makeFile("film.mp4", 10'000'000)}, &id, true), 0);
        ASSERT_TRUE(runUntil([&] { return proxy_->lines().back() == "stalled"; }));
    }

    std::unique_ptr<Process> manager_;
    GDBusConnection *bus_ = nullptr;
};
} // namespace

TEST_F(UploadNetwork, aWifiOnlyShareWaitsOnAMeteredNetworkAndGoesOnByItself)
{
    startServer();
    makeAccount();
    RecordingApplication application;
    setMetered(metered);
    startService();
    int32_t id = 0;
    ASSERT_EQ(request({makeFile("photo.jpg", 100'000)}, &id, true), 0);
    ASSERT_TRUE(waitForStatus(id, 6));
    EXPECT_THAT(statusesOf(id), ElementsAre(6));
    setMetered(notMetered);
    ASSERT_TRUE(waitForEnd(id));
    EXPECT_EQ(reportsOf(id).back().status, 7);
}

TEST_F(UploadNetwork, aNetworkThatBecomesMeteredStopsAWifiOnlyUploadInTheMiddle)
{
    RecordingApplication application;
    int32_t id = 0;
    ASSERT_NO_FATAL_FAILURE(stopInTheMiddleOfAWifiOnlyUpload(id));
    setMetered(metered);
    ASSERT_TRUE(waitForStatus(id, 6));
    proxy_->signal(SIGUSR1);
    EXPECT_THAT(statusesOf(id), ElementsAre(1, 2, 6));
    setMetered(notMetered);
    ASSERT_TRUE(waitForEnd(id));
    EXPECT_THAT(statusesOf(id), ElementsAre(1, 2, 6, 2, 3, 7));
}

TEST_F(UploadNetwork, anyOtherShareUsesTheMeteredNetwork)
{
    startServer();
    makeAccount();
    RecordingApplication application;
    setMetered(metered);
    startService();
    int32_t id = 0;
    ASSERT_EQ(request({makeFile("photo.jpg", 100'000)}, &id, false), 0);
    ASSERT_TRUE(waitForEnd(id));
    EXPECT_THAT(statusesOf(id), Not(Contains(6)));
}

TEST_F(UploadNetwork, changesInQuickSuccessionEndInTheLastState)
{
    RecordingApplication application;
    int32_t id = 0;
    ASSERT_NO_FATAL_FAILURE(stopInTheMiddleOfAWifiOnlyUpload(id));
    for (int i = 0; i < 10; ++i) {
        setMetered(metered);
        setMetered(notMetered);
    }
    setMetered(metered);
    ASSERT_TRUE(waitForStatus(id, 6));
    proxy_->signal(SIGUSR1);
    int32_t other = 0;
    ASSERT_EQ(request({makeFile("photo.jpg", 100'000)}, &other, false), 0);
    ASSERT_TRUE(waitForEnd(other));
    EXPECT_EQ(reportsOf(id).back().status, 6) << "metered was the last word";
    setMetered(notMetered);
    ASSERT_TRUE(waitForEnd(id));
    EXPECT_EQ(reportsOf(id).back().status, 7);
}

TEST_F(UploadNetwork, aNetworkManagerThatDiesAndComesBackIsFollowed)
{
    startServer();
    makeAccount();
    RecordingApplication application;
    setMetered(metered);
    startService();
    int32_t id = 0;
    ASSERT_EQ(request({makeFile("photo.jpg", 100'000)}, &id, true), 0);
    ASSERT_TRUE(waitForStatus(id, 6));
    stopManager();
    int32_t other = 0;
    ASSERT_EQ(request({makeFile("map.png", 1000)}, &other, false), 0);
    ASSERT_TRUE(waitForEnd(other)) << "the service lives without it";
    startManager();
    setMetered(notMetered);
    ASSERT_TRUE(waitForEnd(id));
    EXPECT_EQ(reportsOf(id).back().status, 7);
}
