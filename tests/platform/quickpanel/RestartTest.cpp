// Panels and daemons that come and go.
#include <memory>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "support/Bus.h"
#include "support/RecordingDaemon.h"

using namespace panel_testing;
using testing::ElementsAre;

namespace
{

void post(notification_type_e type, const char *title, const char *tag = nullptr,
          int display = NOTIFICATION_DISPLAY_APP_ALL)
{
    notification_h noti = make(type, title, tag);
    notification_set_display_applist(noti, display);
    EXPECT_EQ(notification_post(noti), 0);
    notification_free(noti);
}

std::vector<std::string> summaries(const RecordingDaemon &daemon, size_t from = 0)
{
    std::vector<std::string> result;
    for (size_t i = from; i < daemon.calls().size(); ++i)
        result.push_back(daemon.calls()[i].summary);
    return result;
}

class Restart : public testing::Test
{
protected:
    void SetUp() override { clearPanel(); }
    void TearDown() override { clearPanel(); }
};

TEST_F(Restart, WithoutADaemonTheRecordWorksAndIsShownLater)
{
    post(NOTIFICATION_TYPE_ONGOING, "Sending", "7");
    post(NOTIFICATION_TYPE_NOTI, "Files sent", "8");
    EXPECT_EQ(posted().size(), 2u);
    RecordingDaemon daemon;
    ASSERT_TRUE(daemon.waitForVisible(2));
    EXPECT_THAT(summaries(daemon), testing::UnorderedElementsAre("Sending", "Files sent"));
}

TEST_F(Restart, ANewDaemonShowsEverythingOnce)
{
    auto first = std::make_unique<RecordingDaemon>();
    post(NOTIFICATION_TYPE_ONGOING, "Sending", "7");
    post(NOTIFICATION_TYPE_NOTI, "Files sent", "8");
    ASSERT_TRUE(first->waitForVisible(2));
    first.reset();
    RecordingDaemon second;
    ASSERT_TRUE(second.waitForVisible(2));
    post(NOTIFICATION_TYPE_NOTI, "third");
    ASSERT_TRUE(second.waitForVisible(3));
    EXPECT_THAT(summaries(second), ElementsAre("Sending", "Files sent", "third"));
}

TEST_F(Restart, AKilledPanelContinuesWhatTheDaemonShows)
{
    RecordingDaemon daemon;
    post(NOTIFICATION_TYPE_ONGOING, "Sending", "7");
    post(NOTIFICATION_TYPE_NOTI, "Files sent", "8");
    ASSERT_TRUE(daemon.waitForVisible(2));
    // The panel knows the numbers when it has answered something later.
    EXPECT_EQ(posted().size(), 2u);
    killOwner("com.velmora.quickpanel");
    post(NOTIFICATION_TYPE_NOTI, "third");
    ASSERT_TRUE(daemon.waitForVisible(3));
    ASSERT_TRUE(daemon.waitForCalls(5));
    EXPECT_EQ(daemon.visible().size(), 3u);
    std::vector<uint32_t> replaced;
    for (size_t i = 2; i < daemon.calls().size(); ++i)
        replaced.push_back(daemon.calls()[i].replaces);
    EXPECT_THAT(replaced, testing::UnorderedElementsAre(0u, daemon.calls()[0].number,
                                                        daemon.calls()[1].number));
}

TEST_F(Restart, PanelAndDaemonBothNewShowEverythingOnce)
{
    auto first = std::make_unique<RecordingDaemon>();
    post(NOTIFICATION_TYPE_ONGOING, "Sending", "7");
    ASSERT_TRUE(first->waitForVisible(1));
    EXPECT_EQ(posted().size(), 1u);
    killOwner("com.velmora.quickpanel");
    first.reset();
    RecordingDaemon second;
    post(NOTIFICATION_TYPE_NOTI, "Files sent", "8");
    ASSERT_TRUE(second.waitForVisible(2));
    for (const auto &shown : second.calls())
        EXPECT_EQ(shown.replaces, 0u);
}

TEST_F(Restart, ANewPanelForgetsTickers)
{
    RecordingDaemon daemon;
    post(NOTIFICATION_TYPE_NOTI, "ticker", "TICKER", NOTIFICATION_DISPLAY_APP_TICKER);
    ASSERT_TRUE(daemon.waitForVisible(1));
    killOwner("com.velmora.quickpanel");
    EXPECT_EQ(notification_load_by_tag("TICKER"), nullptr);
}

} // namespace
