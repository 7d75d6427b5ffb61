#include "PellikoUploadManager/UploadStart.h"
#include "PellikoUploadManager/UploadStatus.h"
#include "support/AppWorld.h"
#include "support/UsageRecords.h"

#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <gio/gio.h>
#include <glib.h>
#include <pelliko_client.h>
#include <sqlite3.h>

namespace pelliko::test
{
namespace
{

constexpr const char *serviceName = "com.velmora.pelliko.Service";

std::string queuePath()
{
    return std::string(getenv("XDG_DATA_HOME")) + "/pelliko-service/queue.db";
}

int textCb(void *data, int count, char **values, char **)
{
    auto &text = *static_cast<std::string *>(data);
    for (int i = 0; i < count; ++i)
        text += std::string(i ? "|" : "") + (values[i] ? values[i] : "");
    text += "\n";
    return 0;
}

// What the service has on disk, one row a line.
std::string queue(const std::string &statement)
{
    std::string text;
    sqlite3 *database = nullptr;
    sqlite3_open_v2(queuePath().c_str(), &database, SQLITE_OPEN_READONLY, nullptr);
    EXPECT_EQ(sqlite3_exec(database, statement.c_str(), textCb, &text, nullptr), SQLITE_OK)
        << sqlite3_errmsg(database);
    sqlite3_close(database);
    return text;
}

// The real service, with an account on a server that never answers: requests are accepted and wait.
class UploadStart : public AppWorld
{
protected:
    static void SetUpTestSuite()
    {
        const std::string command = "echo token | pelliko-service account --server "
                                    "http://127.0.0.1:9 --number +447700900100 >/dev/null";
        ASSERT_EQ(system(command.c_str()), 0);
    }

    static std::string file(const std::string &name, size_t size)
    {
        const std::string path = "/tmp/" + name;
        std::ofstream(path) << std::string(size, 'x');
        return path;
    }

    const UsageRecords usage;

    static std::string fileType(const std::string &path, const char *previous = nullptr)
    {
        const char *type = _uploadFileType(path.c_str(), previous);
        return type ? type : "(none)";
    }
};

TEST_F(UploadStart, AnAcceptedShareIsInTheListTheTableAndTheService)
{
    const std::string photo = file("photo.jpg", 1500);
    const std::string clip = file("clip.MP4", 500);
    shareInHand({photo, clip}, 2);
    ad->sender_ccc = g_strdup("44");
    log.restart();
    ASSERT_EQ(uploadStart(ad), 0);

    UploadNotiData *node = g_upload_noti_data_list;
    ASSERT_NE(node, nullptr);
    const std::string id = std::to_string(node->request_id);
    EXPECT_GT(node->request_id, 0);
    EXPECT_EQ(ad->upload_item->request_id, node->request_id);
    EXPECT_EQ(node->upload_status, 0);
    EXPECT_EQ(node->total_files, 2);
    EXPECT_EQ(node->total_size, 2000);
    EXPECT_EQ(std::string(node->noti_priv_id), id);
    EXPECT_STREQ(node->file_list[0], photo.c_str());
    EXPECT_STREQ(node->file_list[1], clip.c_str());
    EXPECT_STREQ(node->recipient_list, "Ann?Bob+SMS?");
    EXPECT_STREQ(node->recipient_index_list, "31?32?");
    EXPECT_EQ(rows(), (std::vector<int>{node->request_id}));
    EXPECT_EQ(queue("SELECT ccc, number, number_id FROM recipients WHERE request = " + id +
                    " ORDER BY position;"),
              "44|+447946000900|31\n44|+447946000901|32\n");
    EXPECT_EQ(queue("SELECT path, size FROM files WHERE request = " + id + " ORDER BY position;"),
              photo + "|1500\n" + clip + "|500\n");
    EXPECT_EQ(log.text(), "Recipient count = 2\n"
                          "Recipient number_id 0 = 31\n"
                          "Recipient number_id 1 = 32\n"
                          "Files count = 2\n"
                          "extension[jpg], match[jpg]\n"
                          "extension[MP4], match[mp4]\n"
                          "Is upload wifi only = 0\n"
                          "upload_noti_data_new_node->noti_priv_id = " +
                              id + "\nRecords created successfully...\n" +
                              usageLine("PK01 [Pelliko_Share via]") +
                              "recipient_count = 2, ct_app_id = (null)\n"
                              "share_via_to: Recent_group\n" +
                              usageLine("PK02 [Pelliko_Share via_to]", "Recent_group") +
                              "contents_types_length = 2\n"
                              "content_type[0] = jpg\n"
                              "extension[jpg], match[jpg]\n"
                              "### share_via_contents_type: Photo\n" +
                              usageLine("PK03 [Pelliko_Share via_Contents type]", "Photo") +
                              "content_type[1] = mp4\n"
                              "extension[mp4], match[mp4]\n"
                              "### share_via_contents_type: Video\n" +
                              usageLine("PK03 [Pelliko_Share via_Contents type]", "Video") +
                              "file_count: 2 [1_10]\n" +
                              usageLine("PK05 [Pelliko_Share via_filecount]", "1_10") +
                              "file_size: 2000 [0_100MB]\n" +
                              usageLine("PK06 [Pelliko_Share via_filesize]", "0_100MB"));
    EXPECT_EQ(usage.features(),
              (std::vector<std::string>{"PK01", "PK02 Recent_group", "PK03 Photo", "PK03 Video",
                                        "PK05 1_10", "PK06 0_100MB"}));
}

TEST_F(UploadStart, ATypeCarriedOverIsCountedWithItsKind)
{
    shareInHand({file("first.xyz", 1), file("a.txt", 1), file("b.xyz", 1)});
    ad->wifi_check = 1;
    ASSERT_EQ(uploadStart(ad), 0);
    EXPECT_EQ(usage.features(),
              (std::vector<std::string>{"PK01", "PK02 Recent_personal", "PK03 Memo", "PK04",
                                        "PK05 1_10", "PK06 0_100MB"}));
    EXPECT_TRUE(log.has("content_type[0] = (null)"));
    EXPECT_TRUE(log.has("content_type[2] = txt"));
}

TEST_F(UploadStart, WithoutACountryCodeTheUploadGoesOn)
{
    shareInHand({file("a.txt", 1)}, 2);
    log.restart();
    ASSERT_EQ(uploadStart(ad), 0);
    const auto lines = log.messages();
    EXPECT_EQ(std::count(lines.begin(), lines.end(), "sender_ccc is NULL !!"), 2);
    const std::string id = std::to_string(g_upload_noti_data_list->request_id);
    EXPECT_EQ(queue("SELECT DISTINCT ccc FROM recipients WHERE request = " + id + ";"), "\n");
}

TEST_F(UploadStart, OnlyTheValueOneMeansWifiOnly)
{
    for (const int value : {1, 2}) {
        shareInHand({file("a.txt", 1)});
        ad->wifi_check = static_cast<uint8_t>(value);
        log.restart();
        ASSERT_EQ(uploadStart(ad), 0);
        const std::string id = std::to_string(ad->upload_item->request_id);
        const std::string flag = value == 1 ? "1" : "0";
        EXPECT_EQ(queue("SELECT wifi_only FROM requests WHERE id = " + id + ";"), flag + "\n");
        EXPECT_TRUE(log.has("Is upload wifi only = " + flag));
    }
}

TEST_F(UploadStart, AFileThatDoesNotExistIsSentButNotCounted)
{
    shareInHand({file("a.txt", 10), "/tmp/missing.txt"});
    ASSERT_EQ(uploadStart(ad), 0);
    EXPECT_EQ(g_upload_noti_data_list->total_files, 2);
    EXPECT_EQ(g_upload_noti_data_list->total_size, 10);
    const std::string id = std::to_string(ad->upload_item->request_id);
    EXPECT_EQ(queue("SELECT count(*) FROM files WHERE request = " + id + ";"), "2\n");
}

TEST_F(UploadStart, AClipAndAPrefixHaveTheTypesOfTheTable)
{
    EXPECT_EQ(fileType("/x/clip.MP4"), "mp4");
    EXPECT_EQ(fileType("/x/a.mp"), "mpeg");
    EXPECT_EQ(fileType("/x/a."), "mpeg");
}

TEST_F(UploadStart, AFileWithoutTypeHasThatOfTheFileBefore)
{
    EXPECT_EQ(fileType("/x/b.xyz", "mp4"), "mp4");
    EXPECT_EQ(fileType("/x/noextension", "jpg"), "jpg");
    EXPECT_EQ(fileType("/x/b.xyz"), "(none)");
}

TEST_F(UploadStart, WithoutAnItemNothingIsStarted)
{
    EXPECT_EQ(uploadStart(ad), -1);
    EXPECT_EQ(
        log.text(),
        "[ERROR][(ad->upload_item == NULL)] Return value : -1, message : Upload item is NULL\n");
    log.restart();
    EXPECT_EQ(uploadStart(nullptr), -1);
    EXPECT_EQ(log.text(), "[ERROR][(ad == NULL)] Return value : -1, message : Appdata is NULL\n");
    EXPECT_EQ(g_upload_noti_data_list, nullptr);
}

TEST_F(UploadStart, WithoutAnEarlierUploadNothingIsReshared)
{
    shareInHand({});
    log.restart();
    EXPECT_EQ(reshareUploadStart(ad), -1);
    EXPECT_NE(log.text().find("Return value : -1, message : req_id_to_reshare is zero\n"),
              std::string::npos)
        << log.text();
    log.restart();
    EXPECT_EQ(reshareUploadStart(nullptr), -1);
    EXPECT_EQ(log.text(), "[ERROR][(ad == NULL)] Return value : -1, message : Appdata is NULL\n");
    EXPECT_EQ(g_upload_noti_data_list, nullptr);
}

TEST_F(UploadStart, ARefusedRequestLeavesANodeWithoutId)
{
    shareInHand({file("a.txt", 1)}, 0);
    log.restart();
    const int ret = uploadStart(ad);
    EXPECT_EQ(ret, -22);
    EXPECT_TRUE(log.has("pelliko_request_upload error = -22")) << log.text();
    ASSERT_NE(g_upload_noti_data_list, nullptr);
    EXPECT_EQ(g_upload_noti_data_list->request_id, 0);
    EXPECT_EQ(g_upload_noti_data_list->file_list, nullptr);
    EXPECT_TRUE(rows().empty());
}

TEST_F(UploadStart, ARefusedReshareLeavesANodeWithoutId)
{
    shareInHand({});
    ad->req_id_to_reshare = 12345;
    log.restart();
    EXPECT_EQ(reshareUploadStart(ad), -16);
    EXPECT_EQ(log.text(), "Recipient count = 1\n"
                          "Recipient number_id 0 = 31\n"
                          "sender_ccc is NULL !!\n"
                          "Is reshare upload wifi only = 0\n"
                          "Calling Service Api to start reshare upload...\n"
                          "pelliko_request_upload error = -16\n");
    ASSERT_NE(g_upload_noti_data_list, nullptr);
    EXPECT_EQ(g_upload_noti_data_list->request_id, 0);
    EXPECT_EQ(ad->reshared_request_id, 0);
    EXPECT_TRUE(usage.features().empty());
}

TEST_F(UploadStart, ACancelledUploadReportsItsEndToTheStatusCallback)
{
    shareInHand({file("a.txt", 1)});
    ASSERT_EQ(uploadStart(ad), 0);
    log.restart();
    ASSERT_EQ(pelliko_cancel_upload(ad->upload_item->request_id), 0);
    ASSERT_TRUE(loop.runUntil([] { return g_upload_noti_data_list == nullptr; }));
    EXPECT_TRUE(log.has("File uploading cancelled...")) << log.text();
    EXPECT_TRUE(rows().empty());
}

} // namespace
} // namespace pelliko::test
