#include "PellikoUploadingDataManager/PressedNotification.h"

#include "PellikoUploadingDataManager/MarkedList.h"
#include "PellikoUploadingDataManager/StatusScene.h"

#include <ContactsWriter.h>
#include <contacts.h>
#include <gmock/gmock.h>

namespace pelliko::test
{
namespace
{

using ::testing::Contains;
using ::testing::ElementsAre;
using ::testing::IsEmpty;

// The smallest picture there is: one dot.
constexpr char dot[] = "GIF89a\1\0\1\0\200\0\0\0\0\0\377\377\377!\371\4\1\0\0\0\0,\0\0\0\0\1\0\1"
                       "\0\0\2\2D\1\0;";

class PressedNotificationData : public StatusScene
{
protected:
    static void SetUpTestSuite()
    {
        StatusScene::SetUpTestSuite();
        ASSERT_EQ(contacts_connect(), CONTACTS_ERROR_NONE);
    }
    static void TearDownTestSuite() { contacts_disconnect(); }

    // The id of the number.
    static int contact(const std::string &name, const std::string &number,
                       const std::string &picture)
    {
        contacts::ContactCard card;
        card.display_name = name;
        card.name_source = contacts::NameSource::Name;
        card.numbers.push_back({number, contacts::number_cell, {}, true, false});
        card.picture = picture;
        auto saved = contacts::ContactsWriter::open().value->save({&card, 1});
        EXPECT_TRUE(saved) << saved.error;
        return saved ? saved.value->at(0).number_ids.at(0) : 0;
    }

    const PressedNotification &data = g_noti_press_data;
};

TEST_F(PressedNotificationData, IsReadFromTheLaunchRequest)
{
    LaunchRequest request;
    writeExtras(
        request,
        {.state = 3, .recipients = {"Ann", "Bo+SMS"}, .files = 4, .bytes = 2000, .request_id = 7});
    log.restart();
    getUploadData(request);
    EXPECT_EQ(data.recipient_count, "2");
    EXPECT_EQ(data.upload_status, 3);
    EXPECT_EQ(data.total_files, 4);
    EXPECT_EQ(data.total_size, 2000);
    EXPECT_EQ(data.upload_request_id, 7U);
    EXPECT_THAT(data.recipients, ElementsAre("Ann", "Bo+SMS"));
    EXPECT_THAT(data.pictures, ElementsAre("", ""));
    EXPECT_EQ(log.text(), "Extra data read from notification\n"
                          "Recipient count = 2\n"
                          "Upload status = 3\n"
                          "Total files = 4\n"
                          "upload_request_id = 7\n"
                          "total_size = 2000\n"
                          "total_count = 2\n"
                          "num_id_list[0] = 999\n"
                          "contacts_db_get_record is failed ct_ret = -61\n"
                          "num_id_list[1] = 999\n"
                          "contacts_db_get_record is failed ct_ret = -61\n");
}

TEST_F(PressedNotificationData, KeepsWhatARequestDoesNotTellButTheStatus)
{
    LaunchRequest first;
    writeExtras(first, {.recipients = {"Ann"}, .files = 4, .bytes = 2000});
    getUploadData(first);
    const LaunchRequest empty;
    getUploadData(empty);
    EXPECT_EQ(data.recipient_count, "1");
    EXPECT_EQ(data.upload_status, -1);
    EXPECT_EQ(data.total_files, 4);
    EXPECT_EQ(data.total_size, 2000);
    EXPECT_EQ(data.upload_request_id, 7U);
    EXPECT_THAT(data.recipients, ElementsAre("Ann"));
    EXPECT_EQ(log.messages().back(), "Extra data read failed...");
}

TEST_F(PressedNotificationData, HasNoMoreRecipientsThanItCounts)
{
    LaunchRequest request;
    request.text("recipient_count", "2").text("recipient_list", "Ann?Bo+SMS?Eve?");
    getUploadData(request);
    EXPECT_THAT(data.recipients, ElementsAre("Ann", "Bo+SMS"));
    LaunchRequest nobody;
    nobody.text("recipient_count", "-3").text("recipient_list", "Ann?");
    getUploadData(nobody);
    EXPECT_THAT(data.recipients, IsEmpty());
}

TEST_F(PressedNotificationData, RequestIdsUseAll32Bits)
{
    LaunchRequest request;
    request.text("upload_request_id", "4294967295");
    getUploadData(request);
    EXPECT_EQ(data.upload_request_id, 4294967295U);
    EXPECT_EQ(log.lines().empty(), false);
    EXPECT_THAT(log.messages(), Contains("upload_request_id = 4294967295"));
}

TEST_F(PressedNotificationData, PicturesComeFromTheContacts)
{
    const int ann = contact("Ann", "+447700900123", std::string(dot, sizeof(dot) - 1));
    const int bo = contact("Bo", "+447700900456", {});
    LaunchRequest request;
    request.text("recipient_index_list",
                 std::to_string(bo) + "?" + std::to_string(ann) + "?12345?");
    log.restart();
    getUploadData(request);
    ASSERT_EQ(data.pictures.size(), 3U);
    EXPECT_EQ(data.pictures[0], "");
    EXPECT_TRUE(std::filesystem::exists(data.pictures[1])) << data.pictures[1];
    EXPECT_EQ(data.pictures[2], "");
    const auto lines = log.messages();
    EXPECT_THAT(lines, Contains("total_count = 3"));
    EXPECT_THAT(lines, Contains("num_id_list[1] = " + std::to_string(ann)));
    EXPECT_THAT(lines, Contains(::testing::StartsWith("contact_index = ")).Times(2));
    EXPECT_THAT(lines, Contains(::testing::StartsWith("person_index = ")).Times(2));
    EXPECT_EQ(lines.back(), "contacts_db_get_record is failed ct_ret = -61");
}

TEST_F(PressedNotificationData, LooksUpNoMorePeopleThanAShareCanHave)
{
    std::string ids;
    for (int i = 1; i <= 40; ++i)
        ids += std::to_string(90000 + i) + "?";
    LaunchRequest request;
    request.text("recipient_index_list", ids);
    getUploadData(request);
    EXPECT_EQ(data.pictures.size(), 10U);
    EXPECT_THAT(log.messages(), Contains("total_count = 10"));
}

TEST(MarkedList, ItemsEndWithTheirMark)
{
    EXPECT_THAT(splitMarkedList("Ann?Bo+SMS?"), ElementsAre("Ann", "Bo+SMS"));
    EXPECT_THAT(splitMarkedList(""), IsEmpty());
    EXPECT_THAT(splitMarkedList("?"), ElementsAre(""));
    EXPECT_THAT(splitMarkedList("Ann?cut of"), ElementsAre("Ann", "cut of"));
}

} // namespace
} // namespace pelliko::test
