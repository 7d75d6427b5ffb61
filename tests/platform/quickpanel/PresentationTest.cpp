#include <gtest/gtest.h>

#include "Presentation.h"
#include "notification.h"

using namespace pelliko::quickpanel;
using pelliko::notification::Record;

namespace
{

Record withDisplay(int display)
{
    Record record;
    record.app = "com.example.app";
    record.display = display;
    return record;
}

TEST(Presentation, TheDisplayListDecidesWhatAppears)
{
    EXPECT_TRUE(isShown(withDisplay(NOTIFICATION_DISPLAY_APP_ALL)));
    EXPECT_TRUE(isShown(withDisplay(1)));
    EXPECT_TRUE(isShown(withDisplay(2)));
    EXPECT_TRUE(isShown(withDisplay(13)));
    EXPECT_FALSE(isShown(withDisplay(NOTIFICATION_DISPLAY_APP_INDICATOR)));
    EXPECT_FALSE(isShown(withDisplay(NOTIFICATION_DISPLAY_APP_LOCK)));
    EXPECT_FALSE(isShown(withDisplay(0)));
}

TEST(Presentation, OnlyTickersEndByThemselves)
{
    EXPECT_GT(presentationOf(withDisplay(2)).timeoutMs, 0);
    EXPECT_EQ(presentationOf(withDisplay(1)).timeoutMs, 0);
    EXPECT_EQ(presentationOf(withDisplay(3)).timeoutMs, 0);
    EXPECT_GT(toastOf("com.example.app", "x").timeoutMs, 0);
}

TEST(Presentation, TextsBecomeSummaryAndBody)
{
    Record record = withDisplay(1);
    record.texts[NOTIFICATION_TEXT_TYPE_TITLE].shown = "Files received";
    record.texts[NOTIFICATION_TEXT_TYPE_EVENT_COUNT].shown = "3";
    record.texts[NOTIFICATION_TEXT_TYPE_CONTENT].shown = "Ann";
    record.texts[NOTIFICATION_TEXT_TYPE_INFO_1].shown = "yesterday";
    const Presentation shown = presentationOf(record);
    EXPECT_EQ(shown.summary, "Files received (3)");
    EXPECT_EQ(shown.body, "Ann\nyesterday");
    EXPECT_EQ(shown.application, "com.example.app");
}

} // namespace
