#include <cstdlib>

#include <gtest/gtest.h>

#include <app_control.h>
#include <notification.h>

namespace
{

constexpr auto appControl = NOTIFICATION_LAUNCH_OPTION_APP_CONTROL;

std::string extra(app_control_h request, const char *key)
{
    char *value = nullptr;
    if (app_control_get_extra_data(request, key, &value) != 0)
        return "(none)";
    const std::string result = value;
    free(value);
    return result;
}

TEST(LaunchOption, IsACopyOfTheRequest)
{
    notification_h noti = notification_create(NOTIFICATION_TYPE_NOTI);
    app_control_h request = nullptr;
    app_control_create(&request);
    app_control_set_app_id(request, "com.velmora.pelliko");
    app_control_add_extra_data(request, "upload_status", "3");
    const char *names[] = {"Ann", "Bob"};
    app_control_add_extra_data_array(request, "names", names, 2);
    EXPECT_EQ(notification_set_launch_option(noti, appControl, request), 0);
    app_control_add_extra_data(request, "upload_status", "6");
    app_control_destroy(request);

    app_control_h copy = nullptr;
    ASSERT_EQ(notification_get_launch_option(noti, appControl, &copy), 0);
    ASSERT_NE(copy, nullptr);
    EXPECT_EQ(extra(copy, "upload_status"), "3");
    char *app = nullptr;
    app_control_get_app_id(copy, &app);
    EXPECT_STREQ(app, "com.velmora.pelliko");
    free(app);
    char **array = nullptr;
    int length = 0;
    ASSERT_EQ(app_control_get_extra_data_array(copy, "names", &array, &length), 0);
    ASSERT_EQ(length, 2);
    EXPECT_STREQ(array[1], "Bob");
    free(array[0]);
    free(array[1]);
    free(array);
    app_control_destroy(copy);
    notification_free(noti);
}

TEST(LaunchOption, NullAndUnknownKindsAreRefused)
{
    notification_h noti = notification_create(NOTIFICATION_TYPE_NOTI);
    app_control_h request = nullptr;
    app_control_create(&request);
    const auto unknown = static_cast<notification_launch_option_type>(2);
    EXPECT_EQ(notification_set_launch_option(noti, appControl, nullptr),
              NOTIFICATION_ERROR_INVALID_PARAMETER);
    EXPECT_EQ(notification_set_launch_option(noti, unknown, request),
              NOTIFICATION_ERROR_INVALID_PARAMETER);
    EXPECT_EQ(notification_set_launch_option(nullptr, appControl, request),
              NOTIFICATION_ERROR_INVALID_PARAMETER);
    EXPECT_EQ(notification_get_launch_option(noti, appControl, nullptr),
              NOTIFICATION_ERROR_INVALID_PARAMETER);
    app_control_destroy(request);
    notification_free(noti);
}

TEST(LaunchOption, IsNothingUntilSet)
{
    notification_h noti = notification_create(NOTIFICATION_TYPE_NOTI);
    app_control_h request = nullptr;
    EXPECT_EQ(notification_get_launch_option(noti, appControl, &request), 0);
    EXPECT_EQ(request, nullptr);
    notification_free(noti);
}

} // namespace
