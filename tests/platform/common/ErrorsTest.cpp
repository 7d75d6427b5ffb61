#include <tizen.h>

#include <thread>

#include <gtest/gtest.h>

TEST(Errors, EveryNumberHasAText)
{
    EXPECT_STREQ("Successful", get_error_message(TIZEN_ERROR_NONE));
    EXPECT_STREQ("Invalid argument", get_error_message(TIZEN_ERROR_INVALID_PARAMETER));
    EXPECT_STREQ("No such file or directory", get_error_message(TIZEN_ERROR_NO_SUCH_FILE));
    EXPECT_STREQ("Required key not available", get_error_message(TIZEN_ERROR_KEY_NOT_AVAILABLE));
    EXPECT_STREQ("Time out", get_error_message(TIZEN_ERROR_TIMED_OUT));
    EXPECT_STREQ("Application not found", get_error_message(-17825759));
    for (const int odd : {1, 4711, -4711, -100000, INT32_MIN, INT32_MAX})
        EXPECT_STREQ("Unknown error", get_error_message(odd));
}

TEST(Errors, BasesHaveThePlatformsBitPatterns)
{
    EXPECT_EQ(0xfef00000U, static_cast<uint32_t>(TIZEN_ERROR_APPLICATION));
    EXPECT_EQ(0xfeec0000U, static_cast<uint32_t>(TIZEN_ERROR_NOTIFICATION));
    EXPECT_EQ(0xfee80000U, static_cast<uint32_t>(TIZEN_ERROR_BUNDLE));
    EXPECT_EQ(0xfdff0000U, static_cast<uint32_t>(TIZEN_ERROR_CONTACTS));
    EXPECT_EQ(0xfd7a0000U, static_cast<uint32_t>(TIZEN_ERROR_EFL_UTIL));
}

TEST(Errors, TheLastResultBelongsToItsThread)
{
    set_last_result(TIZEN_ERROR_IO_ERROR);
    int elsewhere = TIZEN_ERROR_NO_DATA;
    std::thread([&] { elsewhere = get_last_result(); }).join();
    EXPECT_EQ(TIZEN_ERROR_NONE, elsewhere);
    EXPECT_EQ(TIZEN_ERROR_IO_ERROR, get_last_result());
}
