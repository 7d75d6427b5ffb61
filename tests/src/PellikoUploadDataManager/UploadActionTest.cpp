#include "PellikoUploadDataManager/UploadAction.h"
#include "PellikoUploadDataManager/Recipients.h"
#include "support/AppWorld.h"
#include "support/ContactsStore.h"

#include <algorithm>
#include <contacts.h>
#include <new>

namespace
{
bool outOfMemory = false;
} // namespace

// What the list takes for its nodes; everything else has memory enough.
void *operator new(std::size_t size, const std::nothrow_t &) noexcept
{
    if (outOfMemory)
        return nullptr;
    try {
        return ::operator new(size);
    } catch (const std::bad_alloc &) {
        return nullptr;
    }
}

namespace pelliko::test
{
namespace
{

// Upload 7 is under way, and its id is still what the share in hand and the reshare before carry.
class UploadAction : public AppWorld
{
protected:
    UploadAction()
    {
        earlier = addNode(7, {"/a"}, 10, "Ann?", "31?");
        earlier->upload_status = 6;
        shareInHand({"/tmp/a.txt"});
        ad->upload_item->request_id = 7;
        ad->reshared_request_id = 7;
        ad->req_id_to_reshare = 5;
        log.restart();
    }
    ~UploadAction() override { outOfMemory = false; }

    int actWithoutMemory(PellikoActionType action)
    {
        ad->action_type = action;
        outOfMemory = true;
        const int result = _performAction(ad);
        outOfMemory = false;
        return result;
    }

    void expectEarlierUploadUntouched() const
    {
        EXPECT_EQ(g_upload_noti_data_list, earlier);
        EXPECT_EQ(earlier->next, nullptr);
        EXPECT_EQ(earlier->notif, nullptr);
        EXPECT_EQ(earlier->upload_status, 6);
        EXPECT_FALSE(posted("7"));
        EXPECT_TRUE(log.has("Memory allocation failed")) << log.text();
        EXPECT_FALSE(log.has("REDRAW UPLODING PAUSED")) << log.text();
    }

    UploadNotiData *earlier = nullptr;
};

TEST_F(UploadAction, AShareWithoutMemoryDoesNotRestartAnEarlierUpload)
{
    EXPECT_EQ(actWithoutMemory(ACTION_UPLOAD), 0);
    expectEarlierUploadUntouched();
    EXPECT_EQ(log.messages().back(), "uploadStart ret = 0");
}

TEST_F(UploadAction, AReshareWithoutMemoryDoesNotRestartAnEarlierOne)
{
    EXPECT_EQ(actWithoutMemory(ACTION_RESHARE_UPLOAD), 0);
    expectEarlierUploadUntouched();
    EXPECT_EQ(log.messages().back(), "reshareUploadStart ret = 0");
}

TEST_F(UploadAction, AShareWithoutMemoryForItsItemHasNone)
{
    outOfMemory = true;
    EXPECT_EQ(createUploadData(), nullptr);
    outOfMemory = false;
    EXPECT_EQ(log.text(), "Malloc failed\n");
}

TEST_F(UploadAction, NoMemoryForARecipientEndsTheList)
{
    ASSERT_EQ(contacts_connect(), CONTACTS_ERROR_NONE);
    addPerson("Ann Example", {"+447700900301", "+447700900302"});
    clearUploadRecipients(*ad->upload_item);
    ad->number_id_count = 2;
    ad->number_id_list[0] = 1;
    ad->number_id_list[1] = 2;
    log.restart();
    outOfMemory = true;
    _createRecipientToUpload(ad);
    outOfMemory = false;
    ad->number_id_count = 0;
    contacts_disconnect();
    EXPECT_EQ(ad->upload_item->recipient_list, nullptr);
    const auto lines = log.messages();
    EXPECT_EQ(lines.back(), "Malloc error");
    EXPECT_EQ(std::count(lines.begin(), lines.end(), "phone number case"), 1);
}

TEST_F(UploadAction, AnUnknownActionIsLogged)
{
    ad->action_type = 2;
    EXPECT_EQ(_performAction(ad), 0);
    EXPECT_EQ(log.text(), "Action Type Invalid\n");
    EXPECT_EQ(_performAction(nullptr), -1);
}

} // namespace
} // namespace pelliko::test
