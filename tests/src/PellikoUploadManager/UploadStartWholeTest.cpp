#include "PellikoUploadDataManager/UploadAction.h"
#include "PellikoUploadManager/UploadStart.h"
#include "platform/quickpanel/support/RecordingApplication.h"
#include "support/AppWorld.h"
#include "support/UsageRecords.h"

#include <ctime>
#include <fstream>
#include <glib.h>
#include <pelliko_client.h>
#include <regex>
#include <sqlite3.h>

namespace pelliko::test
{
namespace
{

using panel_testing::RecordingApplication;

constexpr const char *sendText = "http://tizen.org/appcontrol/operation/send_text";
constexpr long daysOfALink = 2;

// One report of the service, as it stands in the log.
struct Report {
    int status = 0;
    int percent = 0;
    long long expires = 0;
    std::string rest; ///< what was written after the four lines of its head
};

std::string replaced(const std::string &text, const char *pattern, const char *by)
{
    return std::regex_replace(text, std::regex(pattern), by);
}

// Real service, real share server. The name of the application is taken by a recorder, so that the
// messages are asked of it and not of a second application.
class WholeUpload : public AppWorld
{
protected:
    WholeUpload() : application("com.velmora.pelliko") { ad->sender_ccc = g_strdup("44"); }

    static std::string file(const std::string &name, size_t size)
    {
        const std::string path = "/tmp/" + name;
        std::ofstream(path) << std::string(size, 'x');
        return path;
    }

    // Acts on the share in hand and waits for its end; what was written goes to start and reports.
    void run(PellikoActionType action)
    {
        ad->action_type = action;
        log.restart();
        ASSERT_EQ(_performAction(ad), 0) << log.text();
        ASSERT_NE(g_upload_noti_data_list, nullptr);
        id = std::to_string(g_upload_noti_data_list->request_id);
        row = onlyRow();
        ASSERT_TRUE(loop.runUntil([] { return g_upload_noti_data_list == nullptr; }, 60.0));
        split(replaced(replaced(log.text(), "(share_time_last with value = )[0-9.]+", "$1now"),
                       "(node->request_id = \\d+\nnode->noti_priv_id = )-?\\d+(\nnode->notif = "
                       ")-?\\d+",
                       "$1N$2N"));
    }

    // "Adding …" and what stands around it, for a notification of this state.
    std::string figures(int state, const std::string &from, const std::string &recipients,
                        const std::string &ids, int files, const std::string &request, long size)
    {
        const auto count = std::count(recipients.begin(), recipients.end(), '?');
        return "Populating extra data from " + from +
               "...\n"
               "Adding total recipients = " +
               std::to_string(count) +
               "\nAdding recipient index list to extra data. list = " + ids +
               "\nAdding recipient list to extra data. list = " + recipients +
               "\nAdding total files = " + std::to_string(files) +
               "\nAdding status = " + std::to_string(state) + "\nAdding request id = " + request +
               "\nAdding total size = " + std::to_string(size) + "\nPopulating tag from " + from +
               "...\nRequest id found = " + id + "\nnode->noti_priv_id = " + id + "\n";
    }

    static std::string usageStart()
    {
        return usageLine("PK01 [Pelliko_Share via]") +
               "recipient_count = 1, ct_app_id = (null)\n"
               "share_via_to: Recent_personal\n" +
               usageLine("PK02 [Pelliko_Share via_to]", "Recent_personal");
    }

    static std::string usageEnd(const std::string &count, const std::string &bucket, int size)
    {
        return "file_count: " + count + "\n" +
               usageLine("PK05 [Pelliko_Share via_filecount]", bucket) +
               "file_size: " + std::to_string(size) + " [0_100MB]\n" +
               usageLine("PK06 [Pelliko_Share via_filesize]", "0_100MB");
    }

    std::string ofNode(int state, int files, long size)
    {
        return figures(state, "current node", "Ann?", "31?", files, id, size);
    }

    std::string ofItem(int files, const std::string &request, long size)
    {
        return figures(0, "ad_upload_item", "Ann?", "31?", files, request, size);
    }

    std::string deleted() const
    {
        return "noti_id = " + id + "\n************* Removing Noti = " + id +
               "*******************\n";
    }

    std::string end() const
    {
        return "req_id = " + id + " and g_noti_press_data.upload_request_id = 0\n";
    }

    static std::string absentKeys()
    {
        std::string all;
        for (int i = 0; i < 6; ++i)
            all += "app control error recieved = -126\n";
        return all;
    }

    // The reports between the request and its last two: started, then the percents as they came.
    void expectSending(int files, long size)
    {
        ASSERT_GE(reports.size(), 3u) << log.text();
        EXPECT_EQ(reports[0].status, 1);
        EXPECT_EQ(reports[0].rest, "Uploads Started...\nUpdating = %p\n"
                                   "Uploading stage is preparing or paused\n" +
                                       deleted() + "Adding sending noti...\n" + absentKeys() +
                                       ofNode(3, files, size) + "progress_percent = 0\n" +
                                       barAt(0) + end());
        int shown = 0;
        for (size_t i = 1; i + 2 < reports.size(); ++i) {
            const Report &report = reports[i];
            EXPECT_EQ(report.status, 2);
            const std::string moved =
                "Updating = %p\nprogress_percent = " + std::to_string(report.percent) + "\n" +
                (report.percent < 100 ? barAt(report.percent) : "") + end();
            EXPECT_EQ(report.rest,
                      report.percent == shown ? "Same progress_percent. Returning...\n" : moved);
            shown = report.percent;
        }
    }

    std::string barAt(int percent) const
    {
        char part[32];
        g_ascii_formatd(part, sizeof(part), "%f", percent / 100.0);
        return "Updating progress on notification = " + id + " with percent = " + part + "\n";
    }

    void expectNotified(const Report &report, int files, long size)
    {
        EXPECT_EQ(report.status, 3);
        EXPECT_EQ(report.rest,
                  "Upload Finished...\n" + deleted() +
                      "Updating notification with text <Sending notifications to recipients...>\n" +
                      ofNode(5, files, size) + end());
    }

    void expectSent(const Report &report, int files, long size, const std::string &counted)
    {
        EXPECT_EQ(report.status, 7);
        EXPECT_EQ(report.rest, "noti_id = " + id +
                                   "\nNotification is null, returning\n"
                                   "Upload Complete. Updating notification\n" +
                                   absentKeys() + ofNode(6, files, size) +
                                   "Records deleted successfully...\n" + counted +
                                   "request_id = " + id + ", req_id = " + id +
                                   "\nHistory app is NOT running\n"
                                   "Exit app, no need to wait sending SMS\n"
                                   "No upload_data request id exist so app is exiting\n");
        EXPECT_NEAR(report.expires, time(nullptr) + daysOfALink * 24 * 3600, 60);
        EXPECT_TRUE(rows().empty());
        ASSERT_TRUE(posted(id));
        EXPECT_EQ(posted(id)->type, NOTIFICATION_TYPE_NOTI);
        EXPECT_EQ(posted(id)->extras.at("upload_status"), "6");
    }

    // The messages were asked for once, for this request.
    void expectMessagesAskedFor(size_t position, const std::string &files) const
    {
        ASSERT_EQ(application.launches().size(), position + 1);
        const auto &launch = application.launches()[position];
        EXPECT_EQ(launch.operation, sendText);
        EXPECT_EQ(launch.extra("req_id"), id);
        EXPECT_EQ(launch.extra("file_count"), files);
        EXPECT_NE(launch.extra("url"), "");
    }

    RecordingApplication application;
    std::string id;
    std::string row;   ///< of the table of pending uploads, once the request was accepted
    std::string start; ///< what was written before the first report
    std::vector<Report> reports;

private:
    static std::string onlyRow()
    {
        std::string text;
        sqlite3 *database = nullptr;
        sqlite3_open_v2("/opt/usr/apps/com.velmora.pelliko/data/.pelliko.db", &database,
                        SQLITE_OPEN_READONLY, nullptr);
        sqlite3_exec(
            database, "SELECT * FROM 'UPLOAD_INFO';",
            [](void *data, int count, char **values, char **) {
                for (int i = 0; i < count; ++i)
                    *static_cast<std::string *>(data) +=
                        std::string(i ? "|" : "") + (values[i] ? values[i] : "NULL");
                return 0;
            },
            &text, nullptr);
        sqlite3_close(database);
        return text;
    }

    void split(const std::string &text)
    {
        static const std::regex head("Request id found = \\d+\n"
                                     "Status : (\\d+), error_code : 0, req_id : \\d+\n"
                                     "Percentage : (\\d+)\n"
                                     "expired_time : (\\d+)\n");
        reports.clear();
        start = text;
        size_t from = 0;
        for (std::sregex_iterator it(text.begin(), text.end(), head), last; it != last; ++it) {
            const auto at = static_cast<size_t>(it->position());
            (reports.empty() ? start : reports.back().rest) = text.substr(from, at - from);
            from = at + static_cast<size_t>(it->length());
            reports.push_back({atoi((*it)[1].str().c_str()), atoi((*it)[2].str().c_str()),
                               atoll((*it)[3].str().c_str()), text.substr(from)});
        }
    }
};

TEST_F(WholeUpload, AShareWritesTheseLinesUntilItIsSent)
{
    shareInHand({file("b.jpg", 2000)});
    run(ACTION_UPLOAD);
    EXPECT_EQ(start, "Action type is ACTION_UPLOAD\n"
                     "Recipient count = 1\n"
                     "Recipient number_id 0 = 31\n"
                     "Files count = 1\n"
                     "extension[jpg], match[jpg]\n"
                     "Is upload wifi only = 0\n"
                     "upload_noti_data_new_node->noti_priv_id = " +
                         id + "\nRecords created successfully...\n" + usageStart() +
                         "contents_types_length = 1\n"
                         "content_type[0] = jpg\n"
                         "extension[jpg], match[jpg]\n"
                         "### share_via_contents_type: Photo\n" +
                         usageLine("PK03 [Pelliko_Share via_Contents type]", "Photo") +
                         usageEnd("1 [1_10]", "1_10", 2000) + "Request id found = " + id +
                         "\nAdding new notification with title = <Preparing to upload>\n" +
                         ofItem(1, id, 2000) +
                         "_notificationInsert success\n"
                         "node->request_id = " +
                         id +
                         "\nnode->noti_priv_id = N\n"
                         "node->notif = N\n"
                         "node->upload_status = 2\n"
                         "node->total_files = 1\n"
                         "node->file_list = %p\n"
                         "node->total_size = 2000\n"
                         "node->progress_percent = 0.000000\n"
                         "node->recipient_list = %p\n"
                         "node->recipient_index_list = %p\n"
                         "uploadStart ret = 0\n");
    EXPECT_EQ(row, id + "|1|2000|/tmp/b.jpg?|Ann?|31?");
    expectSending(1, 2000);
    ASSERT_GE(reports.size(), 2u);
    expectNotified(reports[reports.size() - 2], 1, 2000);
    expectSent(reports.back(), 1, 2000,
               "Updating preference for share_time_last with value = now\n"
               "Updating preference for share_total_size with value = 2000\n");
    expectMessagesAskedFor(0, "1");
}

TEST_F(WholeUpload, AReshareOfAFinishedShareWritesTheseLinesUntilItIsSent)
{
    shareInHand({file("a.txt", 1000), file("b.txt", 1500), file("c.txt", 2500)});
    run(ACTION_UPLOAD);
    const int earlier = atoi(id.c_str());
    EXPECT_EQ(ad->reshared_request_id, 0);
    // A reshare reads no files: it is counted with the size of the last upload of this process.
    constexpr int earlier_size = 6;
    shareInHand({file("d.txt", earlier_size)});
    run(ACTION_UPLOAD);

    shareInHand({});
    pelliko_upload_info_h info = nullptr;
    char **files = nullptr;
    int64_t size = 0;
    ASSERT_EQ(pelliko_upload_info_get_handle(earlier, &info), 0);
    ASSERT_EQ(pelliko_upload_info_get_file_info(info, &files, &ad->upload_item->files_count, &size),
              0);
    ad->upload_item->files_size = static_cast<int32_t>(size);
    ad->req_id_to_reshare = earlier;
    run(ACTION_RESHARE_UPLOAD);
    EXPECT_NE(id, std::to_string(earlier));
    EXPECT_EQ(ad->reshared_request_id, atoi(id.c_str()));
    EXPECT_EQ(start, "Action type is ACTION_RESHARE_UPLOAD\n"
                     "Recipient count = 1\n"
                     "Recipient number_id 0 = 31\n"
                     "Is reshare upload wifi only = 0\n"
                     "Calling Service Api to start reshare upload...\n"
                     "upload_noti_data_new_node->noti_priv_id = " +
                         id + "\nRecords created successfully...\n" + usageStart() +
                         "contents_types_length = 0\n" +
                         usageEnd("0 [(null)]", "(null)", earlier_size) + "Request id found = " +
                         id + "\nAdding new notification with title = <Preparing to upload>\n" +
                         ofItem(0, "0", 5000) +
                         "_notificationInsert success\n"
                         "node->request_id = " +
                         id +
                         "\nnode->noti_priv_id = N\n"
                         "node->notif = N\n"
                         "node->upload_status = 2\n"
                         "node->total_files = 3\n"
                         "node->total_size = 5000\n"
                         "node->progress_percent = 0.000000\n"
                         "node->recipient_list = %p\n"
                         "node->recipient_index_list = %p\n"
                         "reshareUploadStart ret = 0\n");
    EXPECT_EQ(row, id + "|3|5000||Ann?|31?");
    expectSending(3, 5000);
    ASSERT_GE(reports.size(), 2u);
    expectNotified(reports[reports.size() - 2], 3, 5000);
    expectSent(reports.back(), 3, 5000,
               "Updating preference for share_total_size with value = 10006\n");
    expectMessagesAskedFor(2, "3");
}

} // namespace
} // namespace pelliko::test
