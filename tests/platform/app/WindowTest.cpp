#include "World.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

using namespace pelliko::test;

TEST(Window, AttachingCreatesTheNotificationWindowAtOnce)
{
    const RecorderApp app("Window");
    EXPECT_EQ(0, appLaunch({"--app", app.id(), "--extra", "do=window"}).status);
    appLaunch({"--app", app.id(), "--extra", "do=exit"});
    std::vector<std::string> diary = app.diaryWith("ended");
    ASSERT_GT(diary.size(), 2U);
    diary.erase(diary.begin() + 1);
    EXPECT_THAT(diary, testing::ElementsAre("create", "resume", "window 1 type 11 found 1 full 1",
                                            "pause", "window gone", testing::StartsWith("later"),
                                            "terminate", "ended 0"));
}
