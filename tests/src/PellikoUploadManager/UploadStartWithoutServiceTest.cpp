#include "PellikoUploadManager/UploadStart.h"
#include "support/AppWorld.h"

#include <filesystem>
#include <gio/gio.h>
#include <glib.h>
#include <sqlite3.h>

namespace pelliko::test
{
namespace
{

std::string dataHome()
{
    return getenv("XDG_DATA_HOME");
}

void reloadBusConfiguration()
{
    GDBusConnection *bus = g_bus_get_sync(G_BUS_TYPE_SESSION, nullptr, nullptr);
    GVariant *reply = g_dbus_connection_call_sync(
        bus, "org.freedesktop.DBus", "/org/freedesktop/DBus", "org.freedesktop.DBus",
        "ReloadConfig", nullptr, nullptr, G_DBUS_CALL_FLAGS_NONE, -1, nullptr, nullptr);
    ASSERT_NE(reply, nullptr);
    g_variant_unref(reply);
    g_object_unref(bus);
}

class UploadStartWithoutService : public AppWorld
{
};

TEST_F(UploadStartWithoutService, AServiceThatIsNotInstalledIsNotRunning)
{
    const std::string file = dataHome() + "/dbus-1/services/com.velmora.pelliko.Service.service";
    ASSERT_TRUE(std::filesystem::exists(file));
    std::filesystem::rename(file, file + ".away");
    reloadBusConfiguration();

    shareInHand({"/tmp/a.txt"});
    log.restart();
    EXPECT_EQ(uploadStart(ad), -4);
    EXPECT_TRUE(log.has("pelliko_request_upload error PELLIKO_ERROR_SERVICE_NOT_RUNNING"))
        << log.text();
    ASSERT_NE(g_upload_noti_data_list, nullptr);
    EXPECT_EQ(g_upload_noti_data_list->request_id, 0);

    ad->req_id_to_reshare = 5;
    log.restart();
    EXPECT_EQ(reshareUploadStart(ad), -4);
    EXPECT_TRUE(log.has("pelliko_request_upload error PELLIKO_ERROR_SERVICE_NOT_RUNNING"))
        << log.text();

    std::filesystem::rename(file + ".away", file);
    reloadBusConfiguration();
}

// Another program holds the queue's lock, so that the service cannot load it yet.
TEST_F(UploadStartWithoutService, AServiceThatStillLoadsIsInitialising)
{
    const std::string folder = dataHome() + "/pelliko-service";
    std::filesystem::create_directories(folder);
    sqlite3 *lock = nullptr;
    ASSERT_EQ(sqlite3_open((folder + "/queue.db").c_str(), &lock), SQLITE_OK);
    ASSERT_EQ(sqlite3_exec(lock, "BEGIN EXCLUSIVE;", nullptr, nullptr, nullptr), SQLITE_OK);

    shareInHand({"/tmp/a.txt"});
    log.restart();
    EXPECT_EQ(uploadStart(ad), -18);
    EXPECT_TRUE(log.has("pelliko_request_upload error = -18")) << log.text();
    ASSERT_NE(g_upload_noti_data_list, nullptr);
    EXPECT_EQ(g_upload_noti_data_list->request_id, 0);
    EXPECT_TRUE(rows().empty());
    sqlite3_close(lock);
}

} // namespace
} // namespace pelliko::test
