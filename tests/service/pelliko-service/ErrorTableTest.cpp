#include "ErrorTable.h"
#include "ShareApi.h"

#include <gtest/gtest.h>

using namespace pelliko::service;

TEST(ErrorTable, refusalsOfTheServerAreFinalServerErrors)
{
    for (const char *name : {"unauthorized", "forbidden", "daily_limit", "share_too_large",
                             "too_many_files", "gone", "not_found"}) {
        EXPECT_FALSE(failureNamed(name).retry) << name;
        EXPECT_EQ(failureNamed(name).code, -16) << name;
    }
}

TEST(ErrorTable, filesOrRecipientsAtFaultAreDeviceErrors)
{
    for (const char *name : {"file_changed", "file_vanished", "file_unreadable", "no_recipient"}) {
        EXPECT_FALSE(failureNamed(name).retry) << name;
        EXPECT_EQ(failureNamed(name).code, -5) << name;
    }
}

TEST(ErrorTable, whatMayPassIsTriedAgain)
{
    for (const char *name : {"unreachable", "timeout", "connection_lost", "internal", "no_space"}) {
        EXPECT_TRUE(failureNamed(name).retry) << name;
        EXPECT_EQ(failureNamed(name).code, -7) << name;
    }
}

TEST(ErrorTable, theNameInTheBodyWinsOverTheStatus)
{
    const HttpAnswer limit{{}, 429, R"({"error": "daily_limit", "message": "x"})", {}};
    EXPECT_EQ(ShareApi::failureOf(limit).name, "daily_limit");
    const HttpAnswer busy{{}, 429, "<html>", {}};
    EXPECT_TRUE(ShareApi::failureOf(busy).retry);
    const HttpAnswer invented{{}, 503, R"({"error": "tea_time"})", {}};
    EXPECT_EQ(ShareApi::failureOf(invented).name, "internal");
}

TEST(ErrorTable, aLoginPageInPlaceOfTheServerIsTriedAgain)
{
    const HttpAnswer page{{}, 200, "<html>Welcome to the hotel</html>", {}};
    EXPECT_TRUE(ShareApi::failureOf(page).retry);
    EXPECT_FALSE(ShareApi::readShare(page));
    EXPECT_FALSE(ShareApi::readFinished(page));
}

TEST(ErrorTable, anUploadAddressOfAnotherServerIsNotTaken)
{
    const HttpAnswer answer{
        {}, 201, R"({"share":"s","files":[{"upload":"http://evil/u","offset":0}]})", {}};
    EXPECT_FALSE(ShareApi::readShare(answer));
}
