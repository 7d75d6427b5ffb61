// What the panel tells a notification daemon.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "support/Bus.h"
#include "support/RecordingDaemon.h"

using namespace panel_testing;
using testing::ElementsAre;
using testing::IsEmpty;

namespace
{

class OnDesktop : public testing::Test
{
protected:
    void SetUp() override { clearPanel(); }
    void TearDown() override { clearPanel(); }

    // Posts, frees the handle and waits until the daemon has it.
    const Shown &show(notification_h noti)
    {
        const size_t before = daemon_.calls().size();
        EXPECT_EQ(notification_post(noti), 0);
        notification_free(noti);
        EXPECT_TRUE(daemon_.waitForCalls(before + 1));
        return daemon_.calls().back();
    }

    RecordingDaemon daemon_;
};

TEST_F(OnDesktop, AnOngoingUploadIsResidentWithABar)
{
    notification_h noti = make(NOTIFICATION_TYPE_ONGOING, "Sending 3 files", "7");
    notification_set_display_applist(noti, 9);
    notification_set_image(noti, NOTIFICATION_IMAGE_TYPE_ICON,
                           "reserved://quickpanel/ani/uploading");
    notification_set_progress(noti, 0.42);
    const Shown &shown = show(noti);
    EXPECT_EQ(shown.summary, "Sending 3 files");
    EXPECT_EQ(shown.icon, "pelliko-uploading-3");
    EXPECT_EQ(shown.hint("value"), "42");
    EXPECT_EQ(shown.hint("resident"), "true");
    EXPECT_EQ(shown.hint("urgency"), "0x01");
    EXPECT_EQ(shown.hint("category"), "'transfer'");
    EXPECT_EQ(shown.hint("transient"), "");
    EXPECT_EQ(shown.timeoutMs, 0);
    EXPECT_EQ(shown.replaces, 0u);
    ASSERT_EQ(shown.actions.size(), 2u);
    EXPECT_EQ(shown.actions[0], "default");
}

TEST_F(OnDesktop, ANormalOneHasNoBarAndStays)
{
    const Shown &shown = show(make(NOTIFICATION_TYPE_NOTI, "Files sent"));
    EXPECT_EQ(shown.hint("value"), "");
    EXPECT_EQ(shown.hint("resident"), "");
    EXPECT_EQ(shown.hint("transient"), "");
    EXPECT_EQ(shown.timeoutMs, 0);
}

TEST_F(OnDesktop, ATickerIsTransientAndNotInTheTray)
{
    notification_h noti = make(NOTIFICATION_TYPE_NOTI, "Sending", "TICKER");
    notification_set_display_applist(noti, NOTIFICATION_DISPLAY_APP_TICKER);
    const Shown first = show(noti);
    EXPECT_EQ(first.hint("transient"), "true");
    EXPECT_GT(first.timeoutMs, 0);
    EXPECT_TRUE(posted().empty());
    EXPECT_EQ(history().back(), "ticker Sending");

    notification_h next = make(NOTIFICATION_TYPE_NOTI, "Files sent", "TICKER");
    notification_set_display_applist(next, NOTIFICATION_DISPLAY_APP_TICKER);
    EXPECT_EQ(show(next).replaces, first.number);
    EXPECT_EQ(daemon_.visible().size(), 1u);
}

TEST_F(OnDesktop, ATickerEndsWithItsMoment)
{
    notification_h noti = make(NOTIFICATION_TYPE_NOTI, "Sending", "TICKER");
    notification_set_display_applist(noti, NOTIFICATION_DISPLAY_APP_TICKER);
    daemon_.close(show(noti).number, 1);
    // The panel hears the signal before this call.
    show(make(NOTIFICATION_TYPE_NOTI, "later"));
    EXPECT_EQ(notification_load_by_tag("TICKER"), nullptr);
}

TEST_F(OnDesktop, IndicatorOnlyShowsNothing)
{
    notification_h noti = make(NOTIFICATION_TYPE_NOTI, "indicator");
    notification_set_display_applist(noti, NOTIFICATION_DISPLAY_APP_INDICATOR);
    EXPECT_EQ(notification_post(noti), 0);
    notification_free(noti);
    show(make(NOTIFICATION_TYPE_NOTI, "tray"));
    ASSERT_EQ(daemon_.calls().size(), 1u);
    EXPECT_EQ(daemon_.calls()[0].summary, "tray");
    EXPECT_EQ(posted().size(), 2u);
}

TEST_F(OnDesktop, TheSameTagTakesTheSamePlace)
{
    const uint32_t number = show(make(NOTIFICATION_TYPE_ONGOING, "Notifying", "7")).number;
    const Shown &second = show(make(NOTIFICATION_TYPE_NOTI, "Files sent", "7"));
    EXPECT_EQ(second.replaces, number);
    EXPECT_EQ(second.summary, "Files sent");
    EXPECT_EQ(second.hint("resident"), "");
    EXPECT_THAT(daemon_.visible(), ElementsAre(number));
}

TEST_F(OnDesktop, AReplacementThatIsNotShownTakesTheOldAway)
{
    show(make(NOTIFICATION_TYPE_ONGOING, "Notifying", "7"));
    notification_h noti = make(NOTIFICATION_TYPE_NOTI, "hidden", "7");
    notification_set_display_applist(noti, NOTIFICATION_DISPLAY_APP_INDICATOR);
    EXPECT_EQ(notification_post(noti), 0);
    notification_free(noti);
    EXPECT_TRUE(daemon_.waitForVisible(0));
}

TEST_F(OnDesktop, DeletingClosesIt)
{
    notification_h noti = make(NOTIFICATION_TYPE_ONGOING, "Sending", "7");
    EXPECT_EQ(notification_post(noti), 0);
    EXPECT_TRUE(daemon_.waitForVisible(1));
    EXPECT_EQ(notification_delete(noti), 0);
    EXPECT_TRUE(daemon_.waitForVisible(0));
    notification_free(noti);
}

TEST_F(OnDesktop, DeletingWhileTheDaemonHasNotAnsweredClosesItToo)
{
    for (int i = 0; i < 20; ++i) {
        notification_h noti = make(NOTIFICATION_TYPE_NOTI, "brief");
        EXPECT_EQ(notification_post(noti), 0);
        EXPECT_EQ(notification_delete(noti), 0);
        notification_free(noti);
    }
    show(make(NOTIFICATION_TYPE_NOTI, "last"));
    EXPECT_TRUE(daemon_.waitForVisible(1));
}

TEST_F(OnDesktop, AToastPassesAndIsRemembered)
{
    EXPECT_EQ(notification_status_message_post("Too many files"), 0);
    ASSERT_TRUE(daemon_.waitForCalls(1));
    const Shown &shown = daemon_.calls()[0];
    EXPECT_EQ(shown.summary, "Too many files");
    EXPECT_EQ(shown.hint("transient"), "true");
    EXPECT_GT(shown.timeoutMs, 0);
    EXPECT_THAT(shown.actions, IsEmpty());
    EXPECT_EQ(history().back(), "toast Too many files");
}

TEST_F(OnDesktop, QuickChangesReachTheDaemonTenTimesASecond)
{
    constexpr int changes = 200;
    notification_h noti = make(NOTIFICATION_TYPE_ONGOING, "Sending", "7");
    EXPECT_EQ(notification_post(noti), 0);
    const gint64 begin = g_get_monotonic_time();
    for (int i = 1; i <= changes; ++i) {
        notification_set_progress(noti, static_cast<double>(i) / changes);
        EXPECT_EQ(notification_update(noti), 0);
        EXPECT_DOUBLE_EQ(posted().at(0).progress, static_cast<double>(i) / changes);
        // Lets the daemon answer, as one of its own would.
        while (g_main_context_iteration(nullptr, FALSE))
            continue;
    }
    notification_free(noti);
    ASSERT_TRUE(waitUntil(
        [&] { return !daemon_.calls().empty() && daemon_.calls().back().hint("value") == "100"; }));
    const gint64 elapsedMs = (g_get_monotonic_time() - begin) / 1000;
    // One at the beginning, then one per tenth of a second.
    EXPECT_LE(static_cast<gint64>(daemon_.calls().size()), elapsedMs / 100 + 2);
    EXPECT_GE(daemon_.calls().size(), 2u);
    EXPECT_EQ(daemon_.visible().size(), 1u);
}

TEST(DesktopWithMarkup, ABodyIsEscaped)
{
    clearPanel();
    RecordingDaemon daemon({"body", "body-markup"});
    notification_h noti = make(NOTIFICATION_TYPE_NOTI, "A & B");
    notification_set_text(noti, NOTIFICATION_TEXT_TYPE_CONTENT, "1 < 2 & 3", nullptr,
                          NOTIFICATION_VARIABLE_TYPE_NONE);
    EXPECT_EQ(notification_post(noti), 0);
    notification_free(noti);
    ASSERT_TRUE(daemon.waitForCalls(1));
    EXPECT_EQ(daemon.calls()[0].summary, "A & B");
    EXPECT_EQ(daemon.calls()[0].body, "1 &lt; 2 &amp; 3");
    clearPanel();
}

} // namespace
