// One side of bench/pending-uploads: an application's list, table and notifications with so many
// pending uploads in them, and what a report about the last of them, the start of one more, and
// reading the table back take.
#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <iostream>
#include <string>
#include <utility>

#include <Eina.h>
#include <gio/gio.h>
#include <pelliko_client.h>

#include "PellikoApp/AppData.h"
#include "PellikoDatabaseManager/UploadInfoDatabase.h"
#include "PellikoNotificationManager/NotificationPrimitives.h"
#include "PellikoNotificationManager/UploadNotifications.h"
#include "PellikoUploadDataManager/UploadNotiData.h"
#include "PellikoUploadManager/UploadStatus.h"
#include "Turns.h"

using namespace pelliko;

namespace
{

constexpr int reportsOfRound = 49; ///< every other percent that moves the bar
constexpr int reportsOfFlood = 10000;
constexpr int startsOfRound = 50;

UploadNotiData *addUpload(int32_t request_id)
{
    UploadNotiData *node = addUploadNotiDataNode();
    node->request_id = request_id;
    std::snprintf(node->noti_priv_id, sizeof(node->noti_priv_id), "%d", request_id);
    node->total_files = 1;
    node->total_size = 1 << 20;
    node->file_list = g_new0(char *, 2);
    node->file_list[0] = g_strdup_printf("/home/user/pictures/holiday-%d.jpg", request_id);
    node->recipient_list = static_cast<char *>(g_malloc0(recipientListSize));
    g_strlcpy(node->recipient_list, "Ann Example?", recipientListSize);
    node->recipient_index_list = static_cast<char *>(g_malloc0(recipientIndexSize));
    g_strlcpy(node->recipient_index_list, "31?", recipientIndexSize);
    writeUploadDataToDb(node);
    return node;
}

void removeUpload(UploadNotiData *node)
{
    deleteUploadDataFromDb(node->request_id);
    g_current_node = node;
    replaceNotificationHandle(&node->notif, nullptr);
    removeUploadNotiDataNode(REMOVE_NODE);
}

// With what the loop has to do afterwards.
void report(PellikoAppData *ad, int32_t request_id, int percent)
{
    uploadResponseStatusCb(PELLIKO_UPLOAD_STATUS_PROGRESSING, nullptr, percent, 0, 0, 0, request_id,
                           ad);
    while (g_main_context_iteration(nullptr, FALSE))
        continue;
}

void begin(PellikoAppData *ad, int count)
{
    createTableUploadInfoDb();
    ad->upload_item = createUploadData();
    for (int id = 1; id <= count; ++id) {
        UploadNotiData *node = addUpload(id);
        ad->upload_item->request_id = id;
        addProgressNotification(0, &node->notif);
        report(ad, id, 1); // "preparing" becomes "sending"
    }
}

// The process that keeps the notifications.
guint32 keeperProcess()
{
    const auto bus = g_bus_get_sync(G_BUS_TYPE_SESSION, nullptr, nullptr);
    GVariant *answer = g_dbus_connection_call_sync(
        bus, "org.freedesktop.DBus", "/org/freedesktop/DBus", "org.freedesktop.DBus",
        "GetConnectionUnixProcessID", g_variant_new("(s)", "com.velmora.quickpanel"),
        G_VARIANT_TYPE("(u)"), G_DBUS_CALL_FLAGS_NONE, -1, nullptr, nullptr);
    guint32 process = 0;
    if (answer)
        g_variant_get(answer, "(u)", &process);
    return process;
}

// Seconds of processor time that all its threads have taken.
double keeperSeconds()
{
    static const std::string tasks = "/proc/" + std::to_string(keeperProcess()) + "/task";
    double seconds = 0;
    for (const auto &task : std::filesystem::directory_iterator(tasks)) {
        double nanoseconds = 0;
        std::ifstream(task.path() / "schedstat") >> nanoseconds;
        seconds += 1e-9 * nanoseconds;
    }
    return seconds;
}

// Processor time of the application and the keeper: how long it takes on the clock is also a matter
// of the desktop's daemon, which draws meanwhile.
double perReport(PellikoAppData *ad, int32_t request_id)
{
    // The same percent again would be left out.
    static int first = 0;
    first = first == 1 ? 2 : 1;
    const double before = keeperSeconds();
    const double own = bench::processorSecondsOf([&] {
        for (int i = 0; i < reportsOfRound; ++i)
            report(ad, request_id, first + 2 * i);
    });
    return (own + keeperSeconds() - before) / reportsOfRound;
}

// Many reports of every percent; processor time of the application for one.
double perReportOfFlood(PellikoAppData *ad, int32_t request_id)
{
    return bench::processorSecondsOf([=] {
               for (int i = 0; i < reportsOfFlood; ++i)
                   report(ad, request_id, i * 100 / reportsOfFlood);
           }) /
           reportsOfFlood;
}

double perStart(int count)
{
    return bench::secondsOf([=] {
               for (int i = 1; i <= startsOfRound; ++i)
                   removeUpload(addUpload(count + i));
           }) /
           startsOfRound;
}

// Per upload; the list is the old one again afterwards.
double perRead(int count)
{
    UploadNotiData *kept = std::exchange(g_upload_noti_data_list, nullptr);
    const double seconds = bench::secondsOf([] { readUploadDataFromDb(); });
    while (g_upload_noti_data_list) {
        g_current_node = g_upload_noti_data_list;
        removeUploadNotiDataNode(REMOVE_NODE);
    }
    g_upload_noti_data_list = kept;
    return seconds / count;
}

} // namespace

int main(int argc, char **argv)
{
    const int count = argc == 2 ? std::atoi(argv[1]) : 0;
    if (count < 1) {
        std::printf("Usage: %s COUNT\nOne side of bench/pending-uploads: measures \"report\", "
                    "\"start\" and "
                    "\"read\" with COUNT pending uploads, one for each line of its input.\n",
                    argv[0]);
        return argc == 2 && std::string(argv[1]) == "--help" ? 0 : 2;
    }
    eina_init();
    PellikoAppData *ad = getAppData();
    begin(ad, count);
    std::cout << "ready" << std::endl;
    for (std::string word; std::getline(std::cin, word);) {
        const double seconds = word == "report"  ? perReport(ad, count)
                               : word == "flood" ? perReportOfFlood(ad, count)
                               : word == "start" ? perStart(count)
                                                 : perRead(count);
        std::cout << 1e6 * seconds << std::endl;
    }
    return 0;
}
