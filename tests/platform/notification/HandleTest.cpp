#include <cmath>

#include <gtest/gtest.h>

#include <notification.h>

namespace
{

TEST(NotificationHandle, KeepsTheNumbersOfThePlatform)
{
    EXPECT_EQ(NOTIFICATION_TYPE_ONGOING, 1);
    EXPECT_EQ(NOTIFICATION_LY_NOTI_EVENT_MULTIPLE, 2);
    EXPECT_EQ(NOTIFICATION_LY_ONGOING_EVENT, 4);
    EXPECT_EQ(NOTIFICATION_LY_ONGOING_PROGRESS, 5);
    EXPECT_EQ(NOTIFICATION_IMAGE_TYPE_ICON_SUB, 5);
    EXPECT_EQ(NOTIFICATION_TEXT_TYPE_EVENT_COUNT, 3);
    EXPECT_EQ(NOTIFICATION_ERROR_FROM_DB, -18087935);
    EXPECT_EQ(NOTIFICATION_ERROR_NOT_EXIST_ID, -18087932);
}

TEST(NotificationHandle, ANormalOneBeginsAsASingleEventShownEverywhere)
{
    notification_h noti = notification_create(NOTIFICATION_TYPE_NOTI);
    notification_type_e type = NOTIFICATION_TYPE_NONE;
    notification_ly_type_e layout = NOTIFICATION_LY_NONE;
    int display = 0;
    EXPECT_EQ(notification_get_type(noti, &type), NOTIFICATION_ERROR_NONE);
    EXPECT_EQ(notification_get_layout(noti, &layout), NOTIFICATION_ERROR_NONE);
    EXPECT_EQ(notification_get_display_applist(noti, &display), NOTIFICATION_ERROR_NONE);
    EXPECT_EQ(type, NOTIFICATION_TYPE_NOTI);
    EXPECT_EQ(layout, NOTIFICATION_LY_NOTI_EVENT_SINGLE);
    EXPECT_EQ(display, NOTIFICATION_DISPLAY_APP_ALL);
    EXPECT_EQ(notification_free(noti), NOTIFICATION_ERROR_NONE);
}

TEST(NotificationHandle, AnOngoingOneBeginsWithProgress)
{
    notification_h noti = notification_create(NOTIFICATION_TYPE_ONGOING);
    notification_ly_type_e layout = NOTIFICATION_LY_NONE;
    EXPECT_EQ(notification_get_layout(noti, &layout), NOTIFICATION_ERROR_NONE);
    EXPECT_EQ(layout, NOTIFICATION_LY_ONGOING_PROGRESS);
    notification_free(noti);
}

TEST(NotificationHandle, AnUnknownTypeGivesNoHandleAndAReason)
{
    EXPECT_EQ(notification_create(NOTIFICATION_TYPE_NONE), nullptr);
    EXPECT_EQ(get_last_result(), NOTIFICATION_ERROR_INVALID_PARAMETER);
    EXPECT_EQ(notification_create(NOTIFICATION_TYPE_MAX), nullptr);
    notification_free(notification_create(NOTIFICATION_TYPE_NOTI));
    EXPECT_EQ(get_last_result(), NOTIFICATION_ERROR_NONE);
}

TEST(NotificationHandle, ANullHandleIsRefusedEverywhere)
{
    constexpr int invalid = NOTIFICATION_ERROR_INVALID_PARAMETER;
    notification_h none = nullptr;
    notification_type_e type = NOTIFICATION_TYPE_ONGOING;
    notification_ly_type_e layout = NOTIFICATION_LY_NONE;
    char *text = nullptr;
    const char *tag = nullptr;
    int display = 0;
    double progress = 0;
    time_t when = 0;
    EXPECT_EQ(notification_free(none), invalid);
    EXPECT_EQ(notification_clone(none, &none), invalid);
    EXPECT_EQ(notification_get_type(none, &type), invalid);
    EXPECT_EQ(type, NOTIFICATION_TYPE_ONGOING);
    EXPECT_EQ(notification_set_layout(none, NOTIFICATION_LY_ONGOING_EVENT), invalid);
    EXPECT_EQ(notification_get_layout(none, &layout), invalid);
    EXPECT_EQ(notification_set_image(none, NOTIFICATION_IMAGE_TYPE_ICON, "/a"), invalid);
    EXPECT_EQ(notification_get_image(none, NOTIFICATION_IMAGE_TYPE_ICON, &text), invalid);
    EXPECT_EQ(notification_set_time(none, 1), invalid);
    EXPECT_EQ(notification_get_time(none, &when), invalid);
    EXPECT_EQ(notification_set_text(none, NOTIFICATION_TEXT_TYPE_TITLE, "x", nullptr,
                                    NOTIFICATION_VARIABLE_TYPE_NONE),
              invalid);
    EXPECT_EQ(notification_get_text(none, NOTIFICATION_TEXT_TYPE_TITLE, &text), invalid);
    EXPECT_EQ(notification_set_sound(none, NOTIFICATION_SOUND_TYPE_DEFAULT, nullptr), invalid);
    EXPECT_EQ(notification_set_display_applist(none, 1), invalid);
    EXPECT_EQ(notification_get_display_applist(none, &display), invalid);
    EXPECT_EQ(notification_set_progress(none, 0.5), invalid);
    EXPECT_EQ(notification_get_progress(none, &progress), invalid);
    EXPECT_EQ(notification_set_tag(none, "7"), invalid);
    EXPECT_EQ(notification_get_tag(none, &tag), invalid);
    EXPECT_EQ(notification_post(none), invalid);
    EXPECT_EQ(notification_update(none), invalid);
    EXPECT_EQ(notification_delete(none), invalid);
    EXPECT_EQ(notification_load_by_tag(nullptr), nullptr);
    EXPECT_EQ(notification_status_message_post(nullptr), invalid);
}

TEST(NotificationHandle, ANullPlaceForTheResultIsRefused)
{
    constexpr int invalid = NOTIFICATION_ERROR_INVALID_PARAMETER;
    notification_h noti = notification_create(NOTIFICATION_TYPE_NOTI);
    EXPECT_EQ(notification_clone(noti, nullptr), invalid);
    EXPECT_EQ(notification_get_type(noti, nullptr), invalid);
    EXPECT_EQ(notification_get_layout(noti, nullptr), invalid);
    EXPECT_EQ(notification_get_image(noti, NOTIFICATION_IMAGE_TYPE_ICON, nullptr), invalid);
    EXPECT_EQ(notification_get_text(noti, NOTIFICATION_TEXT_TYPE_TITLE, nullptr), invalid);
    EXPECT_EQ(notification_get_tag(noti, nullptr), invalid);
    EXPECT_EQ(notification_set_tag(noti, nullptr), invalid);
    notification_free(noti);
}

TEST(NotificationHandle, ImagesNeedNotExist)
{
    notification_h noti = notification_create(NOTIFICATION_TYPE_NOTI);
    char *path = nullptr;
    EXPECT_EQ(notification_get_image(noti, NOTIFICATION_IMAGE_TYPE_ICON, &path), 0);
    EXPECT_EQ(path, nullptr);
    EXPECT_EQ(notification_set_image(noti, NOTIFICATION_IMAGE_TYPE_ICON,
                                     "reserved://quickpanel/ani/uploading"),
              0);
    EXPECT_EQ(notification_get_image(noti, NOTIFICATION_IMAGE_TYPE_ICON, &path), 0);
    EXPECT_STREQ(path, "reserved://quickpanel/ani/uploading");
    EXPECT_NE(notification_set_image(noti, NOTIFICATION_IMAGE_TYPE_NONE, "/a"), 0);
    EXPECT_NE(notification_set_image(noti, NOTIFICATION_IMAGE_TYPE_MAX, "/a"), 0);
    notification_free(noti);
}

TEST(NotificationHandle, TheDisplayListIsReplacedAsAWhole)
{
    notification_h noti = notification_create(NOTIFICATION_TYPE_NOTI);
    int display = 0;
    notification_set_display_applist(noti, NOTIFICATION_DISPLAY_APP_NOTIFICATION_TRAY |
                                               NOTIFICATION_DISPLAY_APP_INDICATOR);
    notification_get_display_applist(noti, &display);
    EXPECT_EQ(display, 9);
    notification_set_display_applist(noti, NOTIFICATION_DISPLAY_APP_TICKER);
    notification_get_display_applist(noti, &display);
    EXPECT_EQ(display, 2);
    notification_free(noti);
}

TEST(NotificationHandle, ProgressIsAPartOfOne)
{
    notification_h noti = notification_create(NOTIFICATION_TYPE_ONGOING);
    double progress = -1;
    EXPECT_EQ(notification_set_progress(noti, 0.99), 0);
    for (const double wrong : {-0.01, 1.01, std::nan("")})
        EXPECT_EQ(notification_set_progress(noti, wrong), NOTIFICATION_ERROR_INVALID_PARAMETER);
    EXPECT_EQ(notification_get_progress(noti, &progress), 0);
    EXPECT_DOUBLE_EQ(progress, 0.99);
    notification_free(noti);
}

TEST(NotificationHandle, TagAndTimeAreKept)
{
    notification_h noti = notification_create(NOTIFICATION_TYPE_NOTI);
    const char *tag = nullptr;
    time_t when = -1;
    char buffer[] = "42";
    EXPECT_EQ(notification_set_tag(noti, buffer), 0);
    buffer[0] = 'x';
    EXPECT_EQ(notification_get_tag(noti, &tag), 0);
    EXPECT_STREQ(tag, "42");
    EXPECT_EQ(notification_get_time(noti, &when), 0);
    EXPECT_EQ(when, 0);
    EXPECT_EQ(notification_set_time(noti, 1700000000), 0);
    EXPECT_EQ(notification_get_time(noti, &when), 0);
    EXPECT_EQ(when, 1700000000);
    notification_free(noti);
}

TEST(NotificationHandle, ACloneLivesOnItsOwn)
{
    notification_h noti = notification_create(NOTIFICATION_TYPE_ONGOING);
    notification_set_tag(noti, "7");
    notification_h clone = nullptr;
    ASSERT_EQ(notification_clone(noti, &clone), 0);
    notification_set_tag(noti, "8");
    notification_free(noti);
    const char *tag = nullptr;
    notification_get_tag(clone, &tag);
    EXPECT_STREQ(tag, "7");
    notification_free(clone);
}

TEST(NotificationHandle, UpdateAndDeleteBeforePostFindNothing)
{
    notification_h noti = notification_create(NOTIFICATION_TYPE_NOTI);
    EXPECT_EQ(notification_update(noti), NOTIFICATION_ERROR_NOT_EXIST_ID);
    EXPECT_EQ(notification_delete(noti), NOTIFICATION_ERROR_NOT_EXIST_ID);
    notification_free(noti);
}

} // namespace
