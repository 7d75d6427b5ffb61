#include "PellikoUploadDataManager/UploadAction.h"

#include "PellikoUploadDataManager/UploadNotiData.h"
#include "support/AppWorld.h"
#include "support/PanelHistory.h"
#include "support/UploadServiceDouble.h"

#include <cstdlib>
#include <glib.h>
#include <gmock/gmock.h>

namespace
{
int recordToFail = 0; ///< counted from 1; 0: none
} // namespace

// What the records of recipients are made with.
extern "C" gpointer g_try_malloc0(gsize size)
{
    if (recordToFail > 0 && --recordToFail == 0)
        return nullptr;
    return calloc(1, size);
}

namespace pelliko::test
{
namespace
{

using ::testing::Contains;
using ::testing::Not;

class UploadOutcomes : public AppWorld
{
protected:
    // One for all: the client remembers who stood on the bus.
    static void SetUpTestSuite()
    {
        double_ = std::make_unique<UploadServiceDouble>();
        notification_delete_all(NOTIFICATION_TYPE_NOTI); // the panel is there for its history
    }
    static void TearDownTestSuite() { double_.reset(); }
    UploadOutcomes() { service.forget(); }

    static inline std::unique_ptr<UploadServiceDouble> double_;
    UploadServiceDouble &service = *double_;
};

TEST_F(UploadOutcomes, NothingStartsWithoutARecord)
{
    log.restart();
    EXPECT_EQ(_performAction(nullptr), -1);
    EXPECT_EQ(log.messages().front(),
              "[ERROR][(ad == NULL)] Return value : -1, message : ad is NULL");
    EXPECT_TRUE(service.calls().empty());
}

TEST_F(UploadOutcomes, UploadThatIsPausedAlreadyIsDrawnSo)
{
    service.answerRequests(0, 7);
    UploadNotiData *known = addUploadNotiDataNode();
    known->request_id = 7;
    known->upload_status = 6;
    shareInHand({"/a/b.jpg"}, 1);
    log.restart();
    EXPECT_EQ(_performAction(ad), 0);
    EXPECT_THAT(log.messages(), Contains("REDRAW UPLODING PAUSED"));
    EXPECT_EQ(known->upload_status, 6);
}

TEST_F(UploadOutcomes, ServerErrorAndOtherErrorsHaveTheirOwnMessages)
{
    shareInHand({"/a/b.jpg"}, 1);
    const size_t before = toasts().size();
    service.answerRequests(-16);
    EXPECT_EQ(_performAction(ad), -16);
    service.answerRequests(-5);
    EXPECT_EQ(_performAction(ad), -5);
    const auto told = toasts();
    ASSERT_EQ(told.size(), before + 2);
    EXPECT_NE(told[before], told[before + 1]);
    EXPECT_EQ(told[before], "IDS_RSH_BODY_FAILED_TO_UPLOAD_FILES_A_SERVER_ERROR_HAS_OCCURRED_ABB");
    EXPECT_EQ(told[before + 1], "IDS_RSH_TMBODY_FAILED_TO_SEND_FILES_ABB");
}

TEST_F(UploadOutcomes, ReshareWritesTheNumberOfFilesIntoTheListsHead)
{
    service.answerRequests(0, 8);
    UploadNotiData *head = addUploadNotiDataNode();
    head->request_id = 3;
    shareInHand({}, 1);
    ad->upload_item->files_count = 4;
    ad->action_type = ACTION_RESHARE_UPLOAD;
    ad->req_id_to_reshare = 5;
    EXPECT_EQ(_performAction(ad), 0);
    ad->action_type = ACTION_UPLOAD;
    EXPECT_EQ(head->total_files, 4);
    ASSERT_NE(getUploadNotiDataNode(8), nullptr);
    EXPECT_EQ(getUploadNotiDataNode(8)->upload_status, 2);
}

TEST_F(UploadOutcomes, RecipientWithoutMemoryIsLeftOutAndTheOthersAreSent)
{
    service.answerRequests(0, 9);
    shareInHand({"/a/b.jpg"}, 3);
    ad->sender_ccc = g_strdup("44");
    log.restart();
    recordToFail = 2;
    EXPECT_EQ(_performAction(ad), 0);
    EXPECT_EQ(recordToFail, 0);
    const auto lines = log.messages();
    ASSERT_GE(lines.size(), 5u);
    EXPECT_EQ(lines[1], "Recipient count = 3");
    EXPECT_EQ(lines[2], "Recipient number_id 0 = 31");
    EXPECT_EQ(lines[3], "Recipient number_id 1 = 33");
    EXPECT_EQ(lines[4], "Files count = 1");
    EXPECT_THAT(lines, Contains("recipient_count = 3, ct_app_id = (null)"));
    EXPECT_THAT(service.calls(),
                Contains(::testing::HasSubstr(
                    "[('44', '+447946000900', 31), ('44', '+447946000902', 33)]")));
    EXPECT_STREQ(getUploadNotiDataNode(9)->recipient_index_list, "31?32?33?");
}

} // namespace
} // namespace pelliko::test
