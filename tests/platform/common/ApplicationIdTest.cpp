#include <ApplicationId.h>

#include <gtest/gtest.h>

using namespace pelliko::platform;

TEST(ApplicationId, ComesFromTheProgramsName)
{
    EXPECT_EQ("com.velmora.common-test", applicationId());
}

TEST(ApplicationId, HasAnObjectPath)
{
    EXPECT_EQ("/com/velmora/pelliko", applicationObjectPath("com.velmora.pelliko"));
    EXPECT_EQ("/com/velmora/pelliko_history", applicationObjectPath("com.velmora.pelliko-history"));
}
