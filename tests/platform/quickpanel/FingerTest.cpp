// What taps, swipes and a daemon that closes things lead to.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <app_control.h>

#include "support/Bus.h"
#include "support/RecordingApplication.h"
#include "support/RecordingDaemon.h"

using namespace panel_testing;
using testing::ElementsAre;

namespace
{

constexpr const char *application = "com.example.receiver";
constexpr const char *pressed = "http://tizen.org/appcontrol/operation/uploading_noti_pressed";

class Finger : public testing::Test
{
protected:
    void SetUp() override { clearPanel(); }
    void TearDown() override { clearPanel(); }

    uint32_t show(notification_type_e type, const char *title)
    {
        notification_h noti = make(type, title, "7");
        app_control_h request = nullptr;
        app_control_create(&request);
        app_control_set_app_id(request, application);
        app_control_set_operation(request, pressed);
        app_control_add_extra_data(request, "upload_request_id", "7");
        notification_set_launch_option(noti, NOTIFICATION_LAUNCH_OPTION_APP_CONTROL, request);
        app_control_destroy(request);
        EXPECT_EQ(notification_post(noti), 0);
        notification_free(noti);
        EXPECT_TRUE(daemon_.waitForVisible(1));
        return daemon_.calls().back().number;
    }

    static std::vector<std::string> lastEvents(size_t count)
    {
        const auto all = history();
        return {all.end() - static_cast<std::ptrdiff_t>(count), all.end()};
    }

    RecordingDaemon daemon_;
    RecordingApplication receiver_{application};
};

TEST_F(Finger, ATapSendsTheLaunchRequestAndTakesANormalOneAway)
{
    daemon_.tap(show(NOTIFICATION_TYPE_NOTI, "Files sent"));
    ASSERT_TRUE(receiver_.waitForLaunches(1));
    EXPECT_EQ(receiver_.launches()[0].operation, pressed);
    EXPECT_EQ(receiver_.launches()[0].extra("upload_request_id"), "7");
    EXPECT_FALSE(receiver_.launches()[0].replyWanted);
    EXPECT_TRUE(daemon_.waitForVisible(0));
    EXPECT_TRUE(posted().empty());
    EXPECT_THAT(lastEvents(2), ElementsAre("post Files sent", "tap Files sent"));
}

TEST_F(Finger, ATapLeavesAnOngoingOne)
{
    const uint32_t number = show(NOTIFICATION_TYPE_ONGOING, "Sending");
    daemon_.tap(number);
    daemon_.tap(number);
    ASSERT_TRUE(receiver_.waitForLaunches(2));
    EXPECT_EQ(posted().size(), 1u);
    EXPECT_EQ(daemon_.visible().size(), 1u);
    EXPECT_THAT(lastEvents(3), ElementsAre("post Sending", "tap Sending", "tap Sending"));
}

TEST_F(Finger, ADaemonThatClosesWhatWasTappedGetsAnOngoingOneBack)
{
    const uint32_t number = show(NOTIFICATION_TYPE_ONGOING, "Sending");
    daemon_.tap(number);
    daemon_.close(number, 2);
    ASSERT_TRUE(daemon_.waitForCalls(2));
    EXPECT_EQ(daemon_.calls()[1].replaces, 0u);
    EXPECT_EQ(daemon_.visible().size(), 1u);
    EXPECT_EQ(receiver_.launches().size(), 1u);
}

TEST_F(Finger, ASwipeTakesANormalOneAway)
{
    daemon_.close(show(NOTIFICATION_TYPE_NOTI, "Files sent"), 2);
    EXPECT_TRUE(waitUntil([] { return posted().empty(); }));
    EXPECT_THAT(lastEvents(2), ElementsAre("post Files sent", "swipe Files sent"));
    EXPECT_EQ(notification_load_by_tag("7"), nullptr);
}

TEST_F(Finger, APopupThatTheDaemonLetsExpireStaysPosted)
{
    daemon_.close(show(NOTIFICATION_TYPE_NOTI, "Files sent"), 1);
    // Something later that the daemon is told: the panel has heard the signal by then.
    EXPECT_EQ(notification_status_message_post("later"), 0);
    ASSERT_TRUE(daemon_.waitForCalls(2));
    EXPECT_EQ(posted().size(), 1u);
}

TEST_F(Finger, AnUpdateShowsAgainWhatExpired)
{
    const uint32_t number = show(NOTIFICATION_TYPE_NOTI, "Files sent");
    daemon_.close(number, 1);
    notification_h noti = notification_load_by_tag("7");
    EXPECT_EQ(notification_update(noti), 0);
    notification_free(noti);
    EXPECT_TRUE(daemon_.waitForVisible(1));
}

} // namespace
