// The panel with a real notification daemon on a display.
#include <algorithm>
#include <array>
#include <cstdio>
#include <memory>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <app_control.h>

#include "support/Bus.h"
#include "support/RecordingApplication.h"

using namespace panel_testing;
using testing::ElementsAre;

namespace
{

constexpr const char *daemonName = "org.freedesktop.Notifications";

// Overhears what the daemon answers and tells, so that a test knows when it has worked.
class Overhearing
{
public:
    Overhearing()
    {
        g_dbus_connection_add_filter(connection_.get(), onMessage, this, nullptr);
        const std::string rule = std::string("sender='") + daemonName + "'";
        const gchar *const rules[] = {rule.c_str(), nullptr};
        connection_.call("org.freedesktop.DBus", "/org/freedesktop/DBus",
                         "org.freedesktop.DBus.Monitoring", "BecomeMonitor",
                         g_variant_new("(^asu)", rules, 0));
    }

    // Waits for that many answers to Notify in all.
    bool waitForShown(int count)
    {
        return waitUntil([&] { return g_atomic_int_get(&shown_) >= count; });
    }
    bool waitForClosed(int count)
    {
        return waitUntil([&] { return g_atomic_int_get(&closed_) >= count; });
    }

private:
    // On the connection's own thread.
    static GDBusMessage *onMessage(GDBusConnection *, GDBusMessage *message, gboolean incoming,
                                   gpointer self)
    {
        auto *hearing = static_cast<Overhearing *>(self);
        if (incoming &&
            g_dbus_message_get_message_type(message) == G_DBUS_MESSAGE_TYPE_METHOD_RETURN &&
            g_strcmp0(g_dbus_message_get_signature(message), "u") == 0)
            g_atomic_int_inc(&hearing->shown_);
        if (incoming && g_strcmp0(g_dbus_message_get_member(message), "NotificationClosed") == 0)
            g_atomic_int_inc(&hearing->closed_);
        g_main_context_wakeup(nullptr);
        // A monitor must not answer what it overhears.
        const bool own = g_strcmp0(g_dbus_message_get_sender(message), "org.freedesktop.DBus") == 0;
        if (incoming && !own) {
            g_object_unref(message);
            return nullptr;
        }
        return message;
    }

    Connection connection_;
    int shown_ = 0;
    int closed_ = 0;
};

std::string run(const char *command)
{
    FILE *pipe = popen(command, "r");
    std::string output;
    std::array<char, 4096> buffer{};
    while (const size_t length = fread(buffer.data(), 1, buffer.size(), pipe))
        output.append(buffer.data(), length);
    pclose(pipe);
    return output;
}

int displayed()
{
    return std::stoi(run("dunstctl count displayed"));
}

class Dunst : public testing::Test
{
protected:
    void SetUp() override
    {
        killOwner(daemonName);
        clearPanel();
        hearing_ = std::make_unique<Overhearing>();
    }
    void TearDown() override { clearPanel(); }

    static void post(notification_type_e type, const char *title, const char *tag = nullptr)
    {
        notification_h noti = make(type, title, tag);
        app_control_h request = nullptr;
        app_control_create(&request);
        app_control_set_app_id(request, "com.example.receiver");
        app_control_set_operation(request, APP_CONTROL_OPERATION_VIEW);
        notification_set_launch_option(noti, NOTIFICATION_LAUNCH_OPTION_APP_CONTROL, request);
        app_control_destroy(request);
        EXPECT_EQ(notification_post(noti), 0);
        notification_free(noti);
    }

    std::unique_ptr<Overhearing> hearing_;
};

TEST_F(Dunst, IsStartedByTheFirstPostAndShowsIt)
{
    post(NOTIFICATION_TYPE_ONGOING, "Sending 3 files", "7");
    ASSERT_TRUE(hearing_->waitForShown(1));
    EXPECT_EQ(displayed(), 1);
}

TEST_F(Dunst, ReplacesByTagInPlace)
{
    post(NOTIFICATION_TYPE_ONGOING, "Notifying recipients", "7");
    ASSERT_TRUE(hearing_->waitForShown(1));
    post(NOTIFICATION_TYPE_NOTI, "Files sent", "7");
    ASSERT_TRUE(hearing_->waitForShown(2));
    EXPECT_EQ(displayed(), 1);
    run("dunstctl close");
    ASSERT_TRUE(hearing_->waitForClosed(1));
    const std::string last = run("dunstctl history");
    EXPECT_THAT(last, testing::HasSubstr("Files sent"));
    EXPECT_THAT(last, testing::Not(testing::HasSubstr("Notifying recipients")));
}

TEST_F(Dunst, ItsActionSendsTheLaunchRequestAndTakesANormalOneAway)
{
    RecordingApplication receiver("com.example.receiver");
    post(NOTIFICATION_TYPE_NOTI, "Files sent", "7");
    ASSERT_TRUE(hearing_->waitForShown(1));
    run("dunstctl action 0");
    ASSERT_TRUE(receiver.waitForLaunches(1));
    EXPECT_EQ(receiver.launches()[0].operation, APP_CONTROL_OPERATION_VIEW);
    ASSERT_TRUE(hearing_->waitForClosed(1));
    EXPECT_TRUE(posted().empty());
    EXPECT_EQ(displayed(), 0);
}

TEST_F(Dunst, ClosingANormalOneIsASwipe)
{
    post(NOTIFICATION_TYPE_NOTI, "Files sent", "7");
    ASSERT_TRUE(hearing_->waitForShown(1));
    run("dunstctl close");
    ASSERT_TRUE(hearing_->waitForClosed(1));
    EXPECT_TRUE(waitUntil([] { return posted().empty(); }));
    EXPECT_EQ(history().back(), "swipe Files sent");
}

TEST_F(Dunst, ClosingAnOngoingOneBringsItBack)
{
    post(NOTIFICATION_TYPE_ONGOING, "Sending", "7");
    ASSERT_TRUE(hearing_->waitForShown(1));
    run("dunstctl close");
    ASSERT_TRUE(hearing_->waitForShown(2));
    EXPECT_EQ(displayed(), 1);
    EXPECT_EQ(posted().size(), 1u);
}

TEST_F(Dunst, AMouseClickOnAnOngoingOneSendsAndItStays)
{
    RecordingApplication receiver("com.example.receiver");
    post(NOTIFICATION_TYPE_ONGOING, "Sending", "7");
    ASSERT_TRUE(hearing_->waitForShown(1));
    // The daemon answers before its window is there.
    run("xdotool search --sync --onlyvisible --class Dunst mousemove 240 40 click 1");
    ASSERT_TRUE(receiver.waitForLaunches(1));
    ASSERT_TRUE(hearing_->waitForShown(2));
    EXPECT_EQ(displayed(), 1);
    EXPECT_EQ(receiver.launches().size(), 1u);
}

TEST_F(Dunst, ARestartedPanelDoesNotShowTwice)
{
    post(NOTIFICATION_TYPE_ONGOING, "Sending", "7");
    post(NOTIFICATION_TYPE_NOTI, "Files sent", "8");
    ASSERT_TRUE(hearing_->waitForShown(2));
    EXPECT_EQ(posted().size(), 2u);
    killOwner("com.velmora.quickpanel");
    EXPECT_EQ(posted().size(), 2u);
    ASSERT_TRUE(hearing_->waitForShown(4));
    EXPECT_EQ(displayed(), 2);
}

TEST_F(Dunst, AfterItsRestartEverythingIsShownAgain)
{
    post(NOTIFICATION_TYPE_ONGOING, "Sending", "7");
    ASSERT_TRUE(hearing_->waitForShown(1));
    killOwner(daemonName);
    hearing_ = std::make_unique<Overhearing>();
    EXPECT_EQ(posted().size(), 1u);
    post(NOTIFICATION_TYPE_NOTI, "Files sent", "8");
    ASSERT_TRUE(hearing_->waitForShown(2));
    EXPECT_EQ(displayed(), 2);
}

} // namespace
