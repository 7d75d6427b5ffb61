#include "pelliko_client.h"

#include <gio/gio.h>
#include <gtest/gtest.h>

#include <cstdlib>
#include <filesystem>

namespace
{
constexpr const char *serviceName = "com.velmora.pelliko.Service";

void ignoreReport(int, const char *, int, int64_t, int, int, int, void *) {}

int request(pelliko_upload_status_cb callback, int32_t *id)
{
    char number[] = "+447700900111";
    char path[] = "/tmp/photo.jpg";
    pelliko_recipient_s recipient{nullptr, number, 1, 0};
    pelliko_recipient_s *recipients[] = {&recipient, nullptr};
    char *paths[] = {path};
    const pelliko_upload_options_s options{1, 0};
    return pelliko_request_upload(&options, recipients, 2, paths, 1, 0, callback, nullptr, id);
}

bool serviceRuns()
{
    g_autoptr(GDBusConnection) bus = g_bus_get_sync(G_BUS_TYPE_SESSION, nullptr, nullptr);
    g_autoptr(GVariant) reply = g_dbus_connection_call_sync(
        bus, "org.freedesktop.DBus", "/org/freedesktop/DBus", "org.freedesktop.DBus",
        "NameHasOwner", g_variant_new("(s)", serviceName), nullptr, G_DBUS_CALL_FLAGS_NONE, -1,
        nullptr, nullptr);
    gboolean owned = FALSE;
    g_variant_get(reply, "(b)", &owned);
    return owned != FALSE;
}

std::string activationFile()
{
    return std::string(std::getenv("XDG_DATA_HOME")) + "/dbus-1/services/" + serviceName +
           ".service";
}

void reloadBus()
{
    g_autoptr(GDBusConnection) bus = g_bus_get_sync(G_BUS_TYPE_SESSION, nullptr, nullptr);
    g_autoptr(GVariant) reply = g_dbus_connection_call_sync(
        bus, "org.freedesktop.DBus", "/org/freedesktop/DBus", "org.freedesktop.DBus",
        "ReloadConfig", nullptr, nullptr, G_DBUS_CALL_FLAGS_NONE, -1, nullptr, nullptr);
}
} // namespace

TEST(UploadClient, theRecordsHaveTheSizesThatCallersRelyOn)
{
    EXPECT_EQ(sizeof(pelliko_upload_options_s), 8U);
    EXPECT_EQ(sizeof(pelliko_recipient_s), 2 * sizeof(char *) + 8);
}

TEST(UploadClient, missingArgumentsAreRefusedAndChangeNothing)
{
    int32_t id = 9;
    EXPECT_LT(request(nullptr, &id), 0);
    EXPECT_LT(request(ignoreReport, nullptr), 0);
    EXPECT_LT(
        pelliko_request_upload(nullptr, nullptr, 0, nullptr, 0, 0, ignoreReport, nullptr, &id), 0);
    EXPECT_LT(pelliko_resume_upload_by_reboot(3, nullptr, nullptr), 0);
    EXPECT_LT(pelliko_upload_info_get_handle(3, nullptr), 0);
    EXPECT_LT(pelliko_upload_info_get_file_info(nullptr, nullptr, nullptr, nullptr), 0);
    EXPECT_EQ(id, 9);
}

// Ordered: the service must not run yet.
TEST(UploadClient, aServiceThatCannotBeStartedIsNotRunning)
{
    ASSERT_FALSE(serviceRuns());
    const std::string aside = activationFile() + ".aside";
    std::filesystem::rename(activationFile(), aside);
    reloadBus();
    int32_t id = 9;
    pelliko_upload_info_h info = nullptr;
    EXPECT_EQ(request(ignoreReport, &id), PELLIKO_ERROR_SERVICE_NOT_RUNNING);
    EXPECT_EQ(id, 9);
    EXPECT_EQ(pelliko_cancel_upload(1), PELLIKO_ERROR_SERVICE_NOT_RUNNING);
    EXPECT_EQ(pelliko_resume_upload_by_reboot(1, ignoreReport, nullptr),
              PELLIKO_ERROR_SERVICE_NOT_RUNNING);
    EXPECT_EQ(pelliko_upload_info_get_handle(1, &info), PELLIKO_ERROR_SERVICE_NOT_RUNNING);
    EXPECT_EQ(info, nullptr);
    std::filesystem::rename(aside, activationFile());
    reloadBus();
}

TEST(UploadClient, theFirstCallStartsTheServiceAndIsAnsweredByIt)
{
    ASSERT_FALSE(serviceRuns());
    int32_t id = 9;
    // There is no account in this world: a refusal that only the loaded service can give.
    EXPECT_EQ(request(ignoreReport, &id), -16);
    EXPECT_EQ(id, 9);
    EXPECT_TRUE(serviceRuns());
}
