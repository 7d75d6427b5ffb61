#include "FaultPlan.h"
#include "World.h"
#include "pelliko_shares.h"

#include <JsonValue.h>
#include <gmock/gmock.h>

#include <csignal>
#include <filesystem>
#include <fstream>

using pelliko::test::JsonValue;
using testing::Contains;
using testing::ElementsAre;
using testing::Not;
namespace fs = std::filesystem;

namespace
{
class UploadFaults : public World
{
protected:
    int64_t proxyTotal()
    {
        const size_t seen = proxy_->lines().size();
        proxy_->signal(SIGUSR2);
        EXPECT_TRUE(runUntil([&] { return proxy_->lines().size() > seen; }));
        return std::stoll(proxy_->lines().back().substr(6));
    }

    size_t sharesOnServer()
    {
        return JsonValue::parse(askServer("GET", "/api/v1/shares"))["shares"].size();
    }

    // Whoever holds the queue's lock; while that runs, the service cannot load it.
    std::unique_ptr<Process> startOnALockedQueue()
    {
        startServer();
        makeAccount();
        startService();
        service_->end(SIGTERM);
        auto locker = lockQueue();
        startService();
        return locker;
    }

    static void onSentList(int result, const pelliko_sent_share_s *, int, void *data)
    {
        *static_cast<int *>(data) = result;
    }

    // On the connection of the client library, behind everything that it has sent.
    static bool answersToPing()
    {
        g_autoptr(GDBusConnection) bus = g_bus_get_sync(G_BUS_TYPE_SESSION, nullptr, nullptr);
        g_autoptr(GVariant) reply = g_dbus_connection_call_sync(
            bus, "com.velmora.pelliko.Service", "/com/velmora/pelliko/Service",
            "org.freedesktop.DBus.Peer", "Ping", nullptr, nullptr, G_DBUS_CALL_FLAGS_NONE, -1,
            nullptr, nullptr);
        return reply != nullptr;
    }
};
} // namespace

TEST_F(UploadFaults, aKilledServiceGoesOnWhereTheServerStands)
{
    startServer();
    RecordingApplication application;
    startProxy(12'000'000);
    startService({"--chunk", "1000000"});
    const std::string file = makeFile("film.mp4", 20'000'000);
    int32_t id = 0;
    ASSERT_EQ(request({file}, &id), 0);
    ASSERT_TRUE(runUntil([&] { return proxy_->lines().back() == "stalled"; }));
    service_->end(SIGKILL);
    proxy_->signal(SIGUSR1);
    startService({"--chunk", "1000000"});
    // The client comes back by itself and gets the rest of the reports.
    ASSERT_TRUE(waitForEnd(id, 60));
    EXPECT_EQ(reportsOf(id).back().status, 7);
    EXPECT_EQ(application.launches.size(), 1U);
    EXPECT_EQ(sharesOnServer(), 1U);
    EXPECT_LT(proxyTotal(), 20'000'000 + 1'000'000 + 200'000);
    EXPECT_EQ(fs::file_size(downloadOf(application.launches[0].texts.at("url"))), 20'000'000U);
}

TEST_F(UploadFaults, aLostAnswerToCreatingMakesNoSecondShare)
{
    startServer();
    RecordingApplication application;
    startProxy(100); // the head of the first request is on its way, the rest is held
    startService();
    int32_t id = 0;
    ASSERT_EQ(request({makeFile("photo.jpg", 100'000)}, &id), 0);
    ASSERT_TRUE(runUntil([&] { return proxy_->lines().back() == "stalled"; }));
    // The server gets the request when its client is gone.
    service_->end(SIGKILL);
    proxy_->signal(SIGUSR1);
    startService();
    ASSERT_TRUE(waitForEnd(id));
    EXPECT_EQ(reportsOf(id).back().status, 7);
    EXPECT_EQ(sharesOnServer(), 1U);
}

TEST_F(UploadFaults, aServerThatIsDownPausesTheRequestUntilItIsThere)
{
    startServer();
    makeAccount();
    server_.reset();
    RecordingApplication application;
    startService();
    int32_t id = 0;
    ASSERT_EQ(request({makeFile("photo.jpg", 100'000)}, &id), 0);
    ASSERT_TRUE(waitForStatus(id, 6));
    startServer();
    ASSERT_TRUE(waitForEnd(id));
    EXPECT_EQ(reportsOf(id).back().status, 7);
    // One pause is told once, however often the server was tried.
    EXPECT_THAT(statusesOf(id), ElementsAre(6, 1, 2, 3, 7));
}

TEST_F(UploadFaults, aServerThatStaysAwayEndsTheRequest)
{
    startServer();
    makeAccount();
    server_.reset();
    startService({"--give-up", "1500"});
    int32_t id = 0;
    ASSERT_EQ(request({makeFile("photo.jpg", 100'000)}, &id), 0);
    ASSERT_TRUE(waitForEnd(id));
    EXPECT_EQ(reportsOf(id).back().status, 4);
    EXPECT_EQ(reportsOf(id).back().error, -7);
}

TEST_F(UploadFaults, aFileThatVanishedBeforeTheUploadIsADeviceError)
{
    startServer();
    makeAccount();
    startService();
    int32_t id = 0;
    ASSERT_EQ(request({makeFile("here.jpg", 100), folder_ + "/missing.jpg"}, &id), 0);
    ASSERT_TRUE(waitForEnd(id));
    EXPECT_EQ(reportsOf(id).back().error, -5);
    EXPECT_EQ(sharesOnServer(), 0U);
}

TEST_F(UploadFaults, aFileThatIsCutDuringTheUploadIsADeviceError)
{
    startServer();
    RecordingApplication application;
    startProxy(2'000'000);
    startService({"--chunk", "1000000"});
    const std::string file = makeFile("film.mp4", 20'000'000);
    int32_t id = 0;
    ASSERT_EQ(request({file}, &id), 0);
    ASSERT_TRUE(runUntil([&] { return proxy_->lines().back() == "stalled"; }));
    fs::resize_file(file, 5'000'000);
    proxy_->signal(SIGUSR1);
    ASSERT_TRUE(waitForEnd(id));
    EXPECT_EQ(reportsOf(id).back().status, 4);
    EXPECT_EQ(reportsOf(id).back().error, -5);
    EXPECT_THAT(statusesOf(id), Not(Contains(7)));
    ASSERT_TRUE(runUntil([&] {
        return JsonValue::parse(askServer("GET", "/api/v1/shares"))["shares"][0]["state"] ==
               "withdrawn";
    }));
}

TEST_F(UploadFaults, aTokenThatTheServerDoesNotKnowIsAServerError)
{
    startServer();
    token_ = "0123456789012345678901";
    makeAccount();
    startService();
    int32_t id = 0;
    ASSERT_EQ(request({makeFile("photo.jpg", 100)}, &id), 0);
    ASSERT_TRUE(waitForEnd(id));
    EXPECT_EQ(reportsOf(id).back().status, 4);
    EXPECT_EQ(reportsOf(id).back().error, -16);
}

TEST_F(UploadFaults, aQueueThatIsLockedMakesTheServiceSayThatItInitializes)
{
    const auto locker = startOnALockedQueue();
    int listed = 1;
    pelliko_shares_list_sent(onSentList, &listed, nullptr);
    int32_t id = 3;
    EXPECT_EQ(request({makeFile("photo.jpg", 100)}, &id), PELLIKO_ERROR_SERVICE_INITIALIZING);
    EXPECT_EQ(id, 3);
    runUntil([] { return !g_main_context_pending(nullptr); });
    EXPECT_EQ(listed, 1) << "nobody is held up by a list, so it waits for the queue";
    locker->end(SIGKILL);
    EXPECT_TRUE(runUntil([&] { return listed == 0; }));
    RecordingApplication application;
    ASSERT_TRUE(runUntil([&] { return request({makeFile("photo.jpg", 100)}, &id) == 0; }));
    ASSERT_TRUE(waitForEnd(id));
    EXPECT_EQ(reportsOf(id).back().status, 7);
}

TEST_F(UploadFaults, aServiceThatEndsBeforeItsQueueIsLoadedTellsWhoWaitsForAList)
{
    const auto locker = startOnALockedQueue();
    int listed = 1;
    pelliko_shares_list_sent(onSentList, &listed, nullptr);
    // A call that comes after it is there, so the service has the first one too.
    ASSERT_TRUE(answersToPing());
    service_->end(SIGTERM);
    EXPECT_TRUE(runUntil([&] { return listed != 1; }));
    EXPECT_EQ(listed, PELLIKO_ERROR_SERVICE_INITIALIZING);
}

TEST_F(UploadFaults, aFullDiskRefusesWhatIsNewAndHoldsWhatIsKnown)
{
    startServer();
    RecordingApplication application;
    startFaults(plan({rule("POST", "/shares$", "stall")}));
    const std::string disk = smallDisk(1024 * 1024);
    const std::string file = makeFile("photo.jpg", 100'000);
    int32_t known = 0;
    ASSERT_EQ(request({file}, &known), 0);
    ASSERT_TRUE(runUntil([&] { return proxy_->lines().back().starts_with("stalled"); }));
    std::ofstream filler(disk + "/filler");
    while (filler << std::string(4096, 'x') << std::flush) {
    }
    int32_t id = 7;
    EXPECT_EQ(request({file}, &id), -5);
    EXPECT_EQ(id, 7);
    proxy_->signal(SIGUSR1);
    ASSERT_TRUE(waitForStatus(known, 6));
    EXPECT_THAT(statusesOf(known), Not(Contains(1))) << "what is not on disk is not told";
    filler.close();
    fs::remove(disk + "/filler");
    ASSERT_TRUE(waitForEnd(known));
    EXPECT_EQ(reportsOf(known).back().status, 7);
    ASSERT_EQ(request({file}, &id), 0);
    ASSERT_TRUE(waitForEnd(id));
    EXPECT_EQ(reportsOf(id).back().status, 7);
    EXPECT_EQ(sharesOnServer(), 2U);
    EXPECT_EQ(application.launches.size(), 2U);
}

TEST_F(UploadFaults, idsAreNotUsedAgainAfterARestart)
{
    startServer();
    makeAccount();
    RecordingApplication application;
    startService();
    int32_t first = 0;
    ASSERT_EQ(request({makeFile("photo.jpg", 100)}, &first), 0);
    ASSERT_TRUE(waitForEnd(first));
    service_->end(SIGKILL);
    startService();
    int32_t second = 0;
    ASSERT_EQ(request({makeFile("photo.jpg", 100)}, &second), 0);
    EXPECT_GT(second, first);
    ASSERT_TRUE(waitForEnd(second));
}
