#include "PellikoUploadDataManager/UploadNotiData.h"
#include "PellikoUploadManager/ExitPolicy.h"
#include "support/FileLog.h"

#include <Elementary.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>

namespace pelliko
{
namespace
{

using ::testing::ElementsAre;

class ExitPolicy : public ::testing::Test
{
protected:
    static void SetUpTestSuite() { elm_init(0, nullptr); }
    static void TearDownTestSuite() { elm_shutdown(); }

    ExitPolicy()
    {
        ad->win = elm_win_util_standard_add("pelliko", "pelliko");
        evas_object_resize(ad->win, 100, 100);
        evas_object_show(ad->win);
    }
    ~ExitPolicy() override
    {
        while (g_upload_noti_data_list) {
            g_current_node = g_upload_noti_data_list;
            removeUploadNotiDataNode(REMOVE_NODE);
        }
        if (ad->popup)
            evas_object_del(ad->popup);
        ad->popup = nullptr;
        evas_object_del(ad->win);
        ad->win = nullptr;
    }

    void openPopup()
    {
        ad->popup = elm_popup_add(ad->win);
        evas_object_show(ad->popup);
        popup_update_enabled = 1;
    }

    PellikoAppData *ad = getAppData();
    test::FileLog log;
};

Eina_Bool stillRunning(void *ended)
{
    *static_cast<bool *>(ended) = false;
    ecore_main_loop_quit();
    return ECORE_CALLBACK_CANCEL;
}

// Calls safeExit inside a running loop; true when that ended the loop. A loop that goes on becomes
// idle, one that was asked to end does not.
bool endsTheLoop()
{
    bool ended = true;
    Ecore_Idler *idle = nullptr;
    struct Watch {
        bool &ended;
        Ecore_Idler *&idle;
    } watch = {ended, idle};
    ecore_job_add(
        [](void *data) {
            safeExit();
            auto *of = static_cast<Watch *>(data);
            of->idle = ecore_idler_add(stillRunning, &of->ended);
        },
        &watch);
    ecore_main_loop_begin();
    if (ended)
        ecore_idler_del(idle);
    return ended;
}

TEST_F(ExitPolicy, PendingUploadHidesTheWindowAndStays)
{
    addUploadNotiDataNode();
    EXPECT_FALSE(endsTheLoop());
    EXPECT_FALSE(evas_object_visible_get(ad->win));
    EXPECT_THAT(log.messages(), ElementsAre("upload_data request id is not 0 app can't exit"));
}

TEST_F(ExitPolicy, OpenPopupStaysAndTheWindowIsLeftAlone)
{
    openPopup();
    EXPECT_FALSE(endsTheLoop());
    EXPECT_TRUE(evas_object_visible_get(ad->win));
    EXPECT_NE(ad->popup, nullptr);
    EXPECT_EQ(popup_update_enabled, 1);
    EXPECT_THAT(log.messages(), ElementsAre("Popup is open.. can't exit"));
}

TEST_F(ExitPolicy, OpenPopupIsLookedAtBeforePendingUploads)
{
    openPopup();
    addUploadNotiDataNode();
    EXPECT_EQ(applyExitPolicy(ad), ExitOutcome::popup_open);
    EXPECT_TRUE(evas_object_visible_get(ad->win));
}

TEST_F(ExitPolicy, NothingPendingLeaves)
{
    EXPECT_TRUE(endsTheLoop());
    EXPECT_THAT(log.messages(), ElementsAre("No upload_data request id exist so app is exiting"));
}

TEST_F(ExitPolicy, WithoutARecordOnlyTheListDecides)
{
    addUploadNotiDataNode();
    EXPECT_EQ(applyExitPolicy(nullptr), ExitOutcome::waiting);
    EXPECT_TRUE(evas_object_visible_get(ad->win));
    g_current_node = g_upload_noti_data_list;
    removeUploadNotiDataNode(REMOVE_NODE);
    EXPECT_EQ(applyExitPolicy(nullptr), ExitOutcome::quit);
    EXPECT_THAT(log.messages(), ElementsAre("upload_data request id is not 0 app can't exit",
                                            "No upload_data request id exist so app is exiting"));
}

TEST_F(ExitPolicy, HidingDeletesThePopupAndStopsItsUpdates)
{
    openPopup();
    _hideWindow(ad);
    EXPECT_EQ(ad->popup, nullptr);
    EXPECT_EQ(popup_update_enabled, 0);
    EXPECT_FALSE(evas_object_visible_get(ad->win));
}

TEST_F(ExitPolicy, HidingWithoutAWindowOrRecordIsHarmless)
{
    PellikoAppData bare;
    popup_update_enabled = 1;
    _hideWindow(&bare);
    EXPECT_EQ(popup_update_enabled, 0);
    _hideWindow(nullptr);
    addUploadNotiDataNode();
    EXPECT_EQ(applyExitPolicy(&bare), ExitOutcome::waiting);
}

} // namespace
} // namespace pelliko
