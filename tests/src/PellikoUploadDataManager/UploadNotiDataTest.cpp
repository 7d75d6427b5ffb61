#include "PellikoUploadDataManager/UploadNotiData.h"
#include "support/FileLog.h"

#include <cstring>
#include <glib.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>

namespace pelliko
{
namespace
{

using test::FileLog;
using ::testing::ElementsAre;
using ::testing::IsEmpty;

UploadNotiData *add(int32_t request_id)
{
    UploadNotiData *node = addUploadNotiDataNode();
    node->request_id = request_id;
    return node;
}

void remove(UploadNotiData *node)
{
    g_current_node = node;
    removeUploadNotiDataNode(REMOVE_NODE);
}

std::vector<int32_t> ids()
{
    std::vector<int32_t> all;
    for (const UploadNotiData *node = g_upload_noti_data_list; node; node = node->next)
        all.push_back(node->request_id);
    return all;
}

class UploadNotiDataList : public ::testing::Test
{
protected:
    ~UploadNotiDataList() override
    {
        while (g_upload_noti_data_list)
            remove(g_upload_noti_data_list);
        g_current_node = nullptr;
    }
    FileLog log;
};

TEST_F(UploadNotiDataList, NewNodesAreEmptyAndStandAtTheEnd)
{
    const UploadNotiData *first = add(5);
    add(6);
    add(7);
    EXPECT_THAT(ids(), ElementsAre(5, 6, 7));
    EXPECT_EQ(g_upload_noti_data_list, first);
    EXPECT_EQ(first->notif, nullptr);
    EXPECT_EQ(first->completion_flag, 0);
    EXPECT_STREQ(first->noti_priv_id, "");
    EXPECT_EQ(first->file_list, nullptr);
}

TEST_F(UploadNotiDataList, LookingUpInAnEmptyListFindsNothingAndLogsNothing)
{
    EXPECT_EQ(getUploadNotiDataNode(7), nullptr);
    EXPECT_THAT(log.messages(), IsEmpty());
}

TEST_F(UploadNotiDataList, OfTwoNodesWithOneIdTheEarlierIsFound)
{
    add(1);
    const UploadNotiData *earlier = add(7);
    add(7);
    EXPECT_EQ(getUploadNotiDataNode(7), earlier);
    EXPECT_EQ(getUploadNotiDataNode(9), nullptr);
    EXPECT_THAT(log.messages(), ElementsAre("Request id found = 7"));
}

TEST_F(UploadNotiDataList, RemovingTheOnlyNodeEmptiesTheList)
{
    remove(add(7));
    EXPECT_EQ(g_upload_noti_data_list, nullptr);
    EXPECT_THAT(log.messages(), IsEmpty());
}

TEST_F(UploadNotiDataList, MiddleAndTailAreRemovedAndTheListGoesOn)
{
    add(1);
    UploadNotiData *middle = add(2);
    UploadNotiData *tail = add(3);
    remove(middle);
    EXPECT_THAT(ids(), ElementsAre(1, 3));
    remove(tail);
    EXPECT_THAT(ids(), ElementsAre(1));
    add(4);
    EXPECT_THAT(ids(), ElementsAre(1, 4));
}

TEST_F(UploadNotiDataList, RemovingTwiceIsLoggedAndFreesNothing)
{
    add(1);
    remove(add(2));
    log.restart();
    removeUploadNotiDataNode(REMOVE_NODE);
    EXPECT_THAT(ids(), ElementsAre(1));
    EXPECT_THAT(log.messages(), ElementsAre("Given node is not present in Linked List"));
}

TEST_F(UploadNotiDataList, NewNodeIsNeverTakenForTheOneRemovedBefore)
{
    // The allocator is likely to hand out the freed address again.
    add(1);
    for (int i = 0; i < 100; ++i) {
        remove(add(2));
        UploadNotiData *fresh = add(3);
        ASSERT_NE(g_current_node, fresh);
        removeUploadNotiDataNode(REMOVE_NODE);
        ASSERT_THAT(ids(), ElementsAre(1, 3));
        remove(fresh);
    }
}

TEST_F(UploadNotiDataList, RemovedNodeCanStillBeReadAsAnEmptyOne)
{
    add(1);
    UploadNotiData *node = add(2);
    node->recipient_list = g_strdup("Ann?");
    remove(node);
    ASSERT_NE(g_current_node, nullptr);
    EXPECT_EQ(g_current_node->request_id, 0);
    EXPECT_EQ(g_current_node->recipient_list, nullptr);
    EXPECT_EQ(g_current_node->next, nullptr);
}

TEST_F(UploadNotiDataList, RemovingWithoutACurrentNodeOrAListDoesNothing)
{
    removeUploadNotiDataNode(REMOVE_NODE);
    add(1);
    g_current_node = nullptr;
    removeUploadNotiDataNode(REMOVE_NODE);
    removeUploadNotiDataNode(REMOVE_NOTIFICATION);
    removeUploadNotiDataNode(REMOVE_PRIV_ID);
    EXPECT_THAT(ids(), ElementsAre(1));
    EXPECT_THAT(log.messages(), IsEmpty());
}

TEST_F(UploadNotiDataList, ModesZeroAndOneForgetHandleAndTag)
{
    UploadNotiData *node = add(7);
    int something = 0;
    node->notif = reinterpret_cast<notification_h>(&something);
    strcpy(node->noti_priv_id, "7");
    g_current_node = node;
    removeUploadNotiDataNode(0);
    EXPECT_EQ(node->notif, nullptr);
    EXPECT_STREQ(node->noti_priv_id, "7");
    memset(node->noti_priv_id, 'x', sizeof(node->noti_priv_id));
    removeUploadNotiDataNode(1);
    for (const char byte : node->noti_priv_id)
        EXPECT_EQ(byte, '\0');
    EXPECT_THAT(ids(), ElementsAre(7));
}

TEST_F(UploadNotiDataList, UnknownModeIsLoggedAndChangesNothing)
{
    g_current_node = add(7);
    removeUploadNotiDataNode(5);
    EXPECT_THAT(ids(), ElementsAre(7));
    EXPECT_THAT(log.messages(), ElementsAre("Wrong parameter = 5"));
}

TEST_F(UploadNotiDataList, NodeOwnsItsListsAndMayHaveNone)
{
    remove(add(1));
    UploadNotiData *node = add(2);
    node->file_list = g_strsplit("/a?/b", "?", 0);
    node->total_files = 2;
    node->recipient_list = static_cast<char *>(g_malloc0(recipientListSize));
    node->recipient_index_list = static_cast<char *>(g_malloc0(recipientIndexSize));
    remove(node);
    EXPECT_EQ(g_upload_noti_data_list, nullptr);
}

TEST_F(UploadNotiDataList, PrintingAnEmptyListSaysSo)
{
    _uploadListPrintUploadNotiDataList();
    EXPECT_THAT(log.messages(), ElementsAre("No data found. returning..."));
}

std::string pointerText(const void *pointer)
{
    char text[32];
    snprintf(text, sizeof(text), "%p", pointer);
    return text;
}

TEST_F(UploadNotiDataList, PrintingNamesEveryFieldOfEveryNodeInOrder)
{
    UploadNotiData *node = add(7);
    node->upload_status = 2;
    node->total_files = 1;
    node->total_size = -5;
    node->progress_percent = 45.5f;
    const std::string place =
        std::to_string(static_cast<int>(reinterpret_cast<intptr_t>(node->noti_priv_id)));
    _uploadListPrintUploadNotiDataList();
    EXPECT_THAT(log.messages(),
                ElementsAre("node->request_id = 7", "node->noti_priv_id = " + place,
                            "node->notif = 0", "node->upload_status = 2", "node->total_files = 1",
                            "node->total_size = -5", "node->progress_percent = 45.500000"));

    node->file_list = g_strsplit("/a", "?", 0);
    node->recipient_list = static_cast<char *>(g_malloc0(recipientListSize));
    node->recipient_index_list = static_cast<char *>(g_malloc0(recipientIndexSize));
    log.restart();
    _uploadListPrintUploadNotiDataList();
    EXPECT_THAT(
        log.messages(),
        ElementsAre("node->request_id = 7", "node->noti_priv_id = " + place, "node->notif = 0",
                    "node->upload_status = 2", "node->total_files = 1",
                    "node->file_list = " + pointerText(node->file_list), "node->total_size = -5",
                    "node->progress_percent = 45.500000",
                    "node->recipient_list = " + pointerText(node->recipient_list),
                    "node->recipient_index_list = " + pointerText(node->recipient_index_list)));
}

} // namespace
} // namespace pelliko
