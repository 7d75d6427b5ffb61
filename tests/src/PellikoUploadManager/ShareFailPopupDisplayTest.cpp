#include "PellikoUploadManager/ShareFailPopup.h"

#include "PellikoUploadManager/UploadStatus.h"
#include "support/PopupScene.h"

#include <gmock/gmock.h>
#include <pelliko_client.h>

namespace pelliko
{
namespace
{

constexpr const char *leaves = "No upload_data request id exist so app is exiting";
constexpr const char *stays = "upload_data request id is not 0 app can't exit";

class ShareFailPopup : public test::PopupScene
{
protected:
    // The popup is in no field of the record; it is the one that the window gets.
    Evas_Object *open()
    {
        createShareFailPopup(ad);
        Evas_Object *found = evas_object_name_find(evas_object_evas_get(ad->win), "share-fail");
        EXPECT_NE(found, nullptr);
        EXPECT_TRUE(settle(elm_object_part_content_get(found, "button1")));
        evas_object_event_callback_add(
            found, EVAS_CALLBACK_DEL,
            [](void *data, Evas *, Evas_Object *, void *) { *static_cast<bool *>(data) = true; },
            &closed);
        return found;
    }
    bool closes()
    {
        return waitUntil([this] { return closed; });
    }

    bool closed = false;
};

TEST_F(ShareFailPopup, TellsWhatHappenedAndOffersOneButton)
{
    Evas_Object *popup = open();
    picture = "share-failed";
    EXPECT_STREQ(elm_object_part_text_get(popup, "title,text"), "Sharing failed");
    EXPECT_STREQ(elm_object_text_get(popup),
                 "Pelliko is temporarily not available. Try again later.");
    EXPECT_STREQ(elm_object_text_get(elm_object_part_content_get(popup, "button1")), "OK");
    EXPECT_EQ(ad->popup, nullptr);
}

TEST_F(ShareFailPopup, OkClosesAndLeaves)
{
    press(elm_object_part_content_get(open(), "button1"));
    ASSERT_TRUE(closes());
    EXPECT_EQ(log.messages().back(), leaves);
}

TEST_F(ShareFailPopup, BackKeyIsOk)
{
    open();
    pressKey("Escape");
    ASSERT_TRUE(closes());
    EXPECT_EQ(log.messages().back(), leaves);
}

TEST_F(ShareFailPopup, PendingUploadKeepsTheApplication)
{
    addUploadNotiDataNode()->request_id = 3;
    press(elm_object_part_content_get(open(), "button1"));
    ASSERT_TRUE(closes());
    EXPECT_EQ(log.messages().back(), stays);
    EXPECT_FALSE(evas_object_visible_get(ad->win));
}

TEST_F(ShareFailPopup, EndOfTheLastUploadBehindItLeavesWithoutWaiting)
{
    addUploadNotiDataNode()->request_id = 3;
    open();
    uploadResponseStatusCb(PELLIKO_UPLOAD_STATUS_SHARE_FINISHED, nullptr, 100, 0, 0, 0, 3, ad);
    EXPECT_EQ(g_upload_noti_data_list, nullptr);
    EXPECT_THAT(log.messages(), ::testing::Contains(leaves));
    EXPECT_THAT(log.messages(), ::testing::Not(::testing::Contains("Popup is open.. can't exit")));
}

TEST_F(ShareFailPopup, IsRetextedByALanguageChange)
{
    Evas_Object *popup = open();
    speak("de_DE.UTF-8");
    EXPECT_STREQ(elm_object_part_text_get(popup, "title,text"), "Teilen fehlgeschlagen");
    EXPECT_STREQ(elm_object_text_get(popup), "Pelliko ist vorübergehend nicht verfügbar. Versuchen "
                                             "Sie es später erneut.");
}

TEST_F(ShareFailPopup, NothingWithoutARecordOrAWindow)
{
    createShareFailPopup(nullptr);
    PellikoAppData bare;
    createShareFailPopup(&bare);
    EXPECT_EQ(evas_object_name_find(evas_object_evas_get(ad->win), "share-fail"), nullptr);
}

} // namespace
} // namespace pelliko
