#include "PellikoUploadDataManager/UploadItem.h"

#include <glib.h>
#include <gtest/gtest.h>

namespace pelliko
{
namespace
{

TEST(UploadItem, NewItemIsEmpty)
{
    UploadItem *item = createUploadData();
    ASSERT_NE(item, nullptr);
    EXPECT_EQ(item->files, nullptr);
    EXPECT_EQ(item->recipient_list, nullptr);
    EXPECT_EQ(item->request_id, 0);
    EXPECT_EQ(item->files_count, 0);
    EXPECT_EQ(item->files_size, 0);
    EXPECT_EQ(item->before_files_size, 0u);
    freeUploadData(item);
}

TEST(UploadItem, FilesKeepTheirOrderAndBothSumsGrow)
{
    UploadItem *item = createUploadData();
    appendUploadFile(*item, "/a", 3);
    appendUploadFile(*item, "/b", 4);
    EXPECT_STREQ(static_cast<const char *>(eina_list_nth(item->files, 0)), "/a");
    EXPECT_STREQ(static_cast<const char *>(eina_list_nth(item->files, 1)), "/b");
    EXPECT_EQ(item->files_size, 7);
    EXPECT_EQ(item->before_files_size, 7u);
    freeUploadData(item);
}

TEST(UploadItem, SumWrapsAt32BitsWhereTheOtherDoesNot)
{
    UploadItem *item = createUploadData();
    appendUploadFile(*item, "/a", INT32_MAX);
    appendUploadFile(*item, "/b", 1);
    EXPECT_EQ(item->files_size, INT32_MIN);
    EXPECT_EQ(item->before_files_size, 2147483648u);
    appendUploadFile(*item, "/c", int64_t{5} << 32);
    EXPECT_EQ(item->files_size, INT32_MIN);
    EXPECT_EQ(item->before_files_size, 2147483648u + (uint64_t{5} << 32));
    freeUploadData(item);
}

TEST(UploadItem, ClearingFilesEmptiesTheSumsAndKeepsTheCount)
{
    UploadItem *item = createUploadData();
    appendUploadFile(*item, "/a", 3);
    item->files_count = 1;
    clearUploadFiles(*item);
    EXPECT_EQ(item->files, nullptr);
    EXPECT_EQ(item->files_size, 0);
    EXPECT_EQ(item->before_files_size, 0u);
    EXPECT_EQ(item->files_count, 1);
    freeUploadData(item);
}

TEST(UploadItem, FreesRecipientsWithTheirTexts)
{
    UploadItem *item = createUploadData();
    auto *recipient = new UploadRecipient;
    recipient->name = g_strdup("Ann");
    recipient->number = g_strdup("+44");
    item->recipient_list = eina_list_append(nullptr, recipient);
    item->recipient_list = eina_list_append(item->recipient_list, new UploadRecipient);
    clearUploadRecipients(*item);
    EXPECT_EQ(item->recipient_list, nullptr);
    freeUploadData(item);
    freeUploadData(nullptr);
    freeUploadRecipient(nullptr);
}

} // namespace

} // namespace pelliko

int main(int argc, char **argv)
{
    eina_init();
    ::testing::InitGoogleTest(&argc, argv);
    return RUN_ALL_TESTS();
}
