// Against the real panel service, which the bus starts; no notification daemon runs in this world.
#include <cstdlib>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <app_control.h>

#include "PanelClient.h"
#include "support/Bus.h"

using namespace panel_testing;
using testing::ElementsAre;
using testing::IsEmpty;

namespace
{

class Posting : public testing::Test
{
protected:
    void SetUp() override { clearPanel(); }
    void TearDown() override
    {
        for (notification_h noti : handles_)
            notification_free(noti);
    }

    notification_h keep(notification_h noti)
    {
        handles_.push_back(noti);
        return noti;
    }
    notification_h made(notification_type_e type, const char *title, const char *tag = nullptr)
    {
        return keep(make(type, title, tag));
    }
    notification_h postedOne(notification_type_e type, const char *title, const char *tag = nullptr)
    {
        notification_h noti = made(type, title, tag);
        EXPECT_EQ(notification_post(noti), NOTIFICATION_ERROR_NONE);
        return noti;
    }

    static std::vector<std::string> titles()
    {
        std::vector<std::string> result;
        for (const auto &record : posted())
            result.push_back(record.text(NOTIFICATION_TEXT_TYPE_TITLE));
        return result;
    }

    // Another application's notification, posted past this process's own id.
    static void postAs(const char *app, const char *title, const char *tag)
    {
        Record record;
        record.tag = tag;
        record.display = NOTIFICATION_DISPLAY_APP_ALL;
        record.texts[NOTIFICATION_TEXT_TYPE_TITLE].shown = title;
        const Variant content = pelliko::notification::toVariant(record);
        pelliko::notification::callPanel(
            "Post", g_variant_new("(sx@a{sv})", app, gint64{0}, content.get()), "(ix)");
    }
    static void deleteAllOf(const char *app)
    {
        pelliko::notification::callPanel("DeleteAll", g_variant_new("(si)", app, -1), "(i)");
    }

    std::vector<notification_h> handles_;
};

TEST_F(Posting, OutlivesTheHandle)
{
    notification_h noti = make(NOTIFICATION_TYPE_NOTI, "stays");
    ASSERT_EQ(notification_post(noti), 0);
    notification_free(noti);
    EXPECT_THAT(titles(), ElementsAre("stays"));
}

TEST_F(Posting, TheTitleCanBeReadFromAPostedHandle)
{
    notification_h noti = postedOne(NOTIFICATION_TYPE_ONGOING, "Preparing");
    EXPECT_EQ(titleOf(noti), "Preparing");
}

TEST_F(Posting, TheSameTagReplacesWhateverTheType)
{
    notification_h first = postedOne(NOTIFICATION_TYPE_ONGOING, "notifying recipients", "7");
    postedOne(NOTIFICATION_TYPE_NOTI, "files sent", "7");
    const auto all = posted();
    ASSERT_EQ(all.size(), 1u);
    EXPECT_EQ(all[0].text(NOTIFICATION_TEXT_TYPE_TITLE), "files sent");
    EXPECT_EQ(all[0].type, NOTIFICATION_TYPE_NOTI);
    EXPECT_EQ(notification_update(first), NOTIFICATION_ERROR_NOT_EXIST_ID);
    EXPECT_EQ(notification_delete(first), NOTIFICATION_ERROR_NOT_EXIST_ID);
    EXPECT_THAT(titles(), ElementsAre("files sent"));
}

TEST_F(Posting, DifferentTagsAndNoTagsStandSideBySide)
{
    postedOne(NOTIFICATION_TYPE_NOTI, "a", "1");
    postedOne(NOTIFICATION_TYPE_NOTI, "b", "2");
    postedOne(NOTIFICATION_TYPE_NOTI, "c");
    postedOne(NOTIFICATION_TYPE_NOTI, "d");
    EXPECT_THAT(titles(), ElementsAre("a", "b", "c", "d"));
}

TEST_F(Posting, AnotherApplicationsTagIsItsOwn)
{
    postAs("com.example.other", "theirs", "7");
    postedOne(NOTIFICATION_TYPE_NOTI, "mine", "7");
    EXPECT_THAT(titles(), ElementsAre("theirs", "mine"));
    EXPECT_EQ(notification_delete_all(NOTIFICATION_TYPE_NONE), 0);
    EXPECT_THAT(titles(), ElementsAre("theirs"));
    EXPECT_EQ(notification_load_by_tag("7"), nullptr);
    deleteAllOf("com.example.other");
}

TEST_F(Posting, TwiceWithOneHandleIsRefused)
{
    notification_h noti = postedOne(NOTIFICATION_TYPE_NOTI, "once", "7");
    EXPECT_EQ(notification_post(noti), NOTIFICATION_ERROR_ALREADY_EXIST_ID);
    EXPECT_THAT(titles(), ElementsAre("once"));
}

TEST_F(Posting, AgainAfterDeletionWorks)
{
    notification_h noti = postedOne(NOTIFICATION_TYPE_NOTI, "again", "7");
    EXPECT_EQ(notification_delete(noti), 0);
    EXPECT_EQ(notification_delete(noti), NOTIFICATION_ERROR_NOT_EXIST_ID);
    EXPECT_EQ(notification_post(noti), 0);
    EXPECT_THAT(titles(), ElementsAre("again"));
}

TEST_F(Posting, UpdateSendsTheWholeContent)
{
    notification_h noti = postedOne(NOTIFICATION_TYPE_ONGOING, "Sending", "7");
    EXPECT_EQ(notification_set_progress(noti, 0.25), 0);
    EXPECT_DOUBLE_EQ(posted().at(0).progress, 0.0);
    setTitle(noti, "Sending 3 files");
    EXPECT_EQ(notification_update(noti), 0);
    EXPECT_DOUBLE_EQ(posted().at(0).progress, 0.25);
    EXPECT_THAT(titles(), ElementsAre("Sending 3 files"));
}

TEST_F(Posting, UpdateOfADeletedOneShowsNothing)
{
    notification_h noti = postedOne(NOTIFICATION_TYPE_ONGOING, "gone");
    notification_delete_all(NOTIFICATION_TYPE_ONGOING);
    EXPECT_EQ(notification_update(noti), NOTIFICATION_ERROR_NOT_EXIST_ID);
    EXPECT_THAT(titles(), IsEmpty());
}

TEST_F(Posting, UpdateCannotTakeAnothersTag)
{
    postedOne(NOTIFICATION_TYPE_NOTI, "holder", "7");
    notification_h noti = postedOne(NOTIFICATION_TYPE_NOTI, "other", "8");
    notification_set_tag(noti, "7");
    EXPECT_EQ(notification_update(noti), NOTIFICATION_ERROR_ALREADY_EXIST_ID);
    EXPECT_THAT(titles(), ElementsAre("holder", "other"));
}

TEST_F(Posting, DeleteAllTakesOneTypeOnly)
{
    postedOne(NOTIFICATION_TYPE_NOTI, "normal");
    postedOne(NOTIFICATION_TYPE_ONGOING, "ongoing 1");
    postedOne(NOTIFICATION_TYPE_ONGOING, "ongoing 2");
    EXPECT_EQ(notification_delete_all(NOTIFICATION_TYPE_ONGOING), 0);
    EXPECT_THAT(titles(), ElementsAre("normal"));
    EXPECT_EQ(notification_delete_all(NOTIFICATION_TYPE_ONGOING), 0);
    EXPECT_EQ(notification_delete_all(NOTIFICATION_TYPE_MAX), NOTIFICATION_ERROR_INVALID_PARAMETER);
}

TEST_F(Posting, ALoadedHandleHoldsEverythingAndDeletes)
{
    notification_h noti = made(NOTIFICATION_TYPE_NOTI, "received", "PUSH_NOTI");
    notification_set_layout(noti, NOTIFICATION_LY_NOTI_EVENT_MULTIPLE);
    notification_set_image(noti, NOTIFICATION_IMAGE_TYPE_ICON_SUB, "/sub.png");
    notification_set_display_applist(noti, 13);
    notification_set_time(noti, 1700000000);
    app_control_h request = nullptr;
    app_control_create(&request);
    app_control_set_app_id(request, "com.velmora.pelliko-viewer");
    notification_set_launch_option(noti, NOTIFICATION_LAUNCH_OPTION_APP_CONTROL, request);
    app_control_destroy(request);
    ASSERT_EQ(notification_post(noti), 0);

    notification_h loaded = keep(notification_load_by_tag("PUSH_NOTI"));
    ASSERT_NE(loaded, nullptr);
    EXPECT_NE(loaded, noti);
    EXPECT_EQ(titleOf(loaded), "received");
    notification_ly_type_e layout = NOTIFICATION_LY_NONE;
    notification_get_layout(loaded, &layout);
    EXPECT_EQ(layout, NOTIFICATION_LY_NOTI_EVENT_MULTIPLE);
    char *image = nullptr;
    notification_get_image(loaded, NOTIFICATION_IMAGE_TYPE_ICON_SUB, &image);
    EXPECT_STREQ(image, "/sub.png");
    int display = 0;
    notification_get_display_applist(loaded, &display);
    EXPECT_EQ(display, 13);
    time_t when = 0;
    notification_get_time(loaded, &when);
    EXPECT_EQ(when, 1700000000);
    app_control_h stored = nullptr;
    notification_get_launch_option(loaded, NOTIFICATION_LAUNCH_OPTION_APP_CONTROL, &stored);
    char *app = nullptr;
    app_control_get_app_id(stored, &app);
    EXPECT_STREQ(app, "com.velmora.pelliko-viewer");
    free(app);
    app_control_destroy(stored);

    EXPECT_EQ(notification_delete(loaded), 0);
    EXPECT_THAT(titles(), IsEmpty());
    EXPECT_EQ(notification_delete(noti), NOTIFICATION_ERROR_NOT_EXIST_ID);
}

TEST_F(Posting, AnUnknownTagLoadsNothing)
{
    EXPECT_EQ(notification_load_by_tag("no such tag"), nullptr);
    EXPECT_EQ(get_last_result(), NOTIFICATION_ERROR_NOT_EXIST_ID);
    EXPECT_EQ(notification_load_by_tag(""), nullptr);
}

TEST_F(Posting, BytesThatAreNoTextDoNotLoseTheNotification)
{
    postedOne(NOTIFICATION_TYPE_NOTI, "caf\xe9");
    EXPECT_THAT(titles(), ElementsAre("caf\xef\xbf\xbd"));
}

TEST_F(Posting, SurvivesAKilledPanel)
{
    notification_h noti = postedOne(NOTIFICATION_TYPE_ONGOING, "kept", "7");
    killOwner("com.velmora.quickpanel");
    EXPECT_THAT(titles(), ElementsAre("kept"));
    setTitle(noti, "still mine");
    EXPECT_EQ(notification_update(noti), 0);
    killOwner("com.velmora.quickpanel");
    notification_h loaded = keep(notification_load_by_tag("7"));
    EXPECT_EQ(titleOf(loaded), "still mine");
}

TEST_F(Posting, APrivateIdIsNeverUsedAgain)
{
    notification_h first = postedOne(NOTIFICATION_TYPE_NOTI, "first");
    notification_delete(first);
    killOwner("com.velmora.quickpanel");
    postedOne(NOTIFICATION_TYPE_NOTI, "second");
    EXPECT_EQ(notification_update(first), NOTIFICATION_ERROR_NOT_EXIST_ID);
    EXPECT_THAT(titles(), ElementsAre("second"));
}

} // namespace
