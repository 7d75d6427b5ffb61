#include "Request.h"

#include <thread>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

using pelliko::test::Request;
using testing::ElementsAre;

TEST(ExtraData, ReplacesAValueAlsoOneOfTheOtherKind)
{
    const Request request;
    bool isArray = true;
    EXPECT_EQ(APP_CONTROL_ERROR_NONE, request.add("key", "one"));
    EXPECT_EQ(APP_CONTROL_ERROR_NONE, request.add("key", "two"));
    EXPECT_EQ("two", request.text("key"));
    app_control_is_extra_data_array(request.handle, "key", &isArray);
    EXPECT_FALSE(isArray);
    EXPECT_EQ(APP_CONTROL_ERROR_NONE, request.addArray("key", {"a", "b"}));
    EXPECT_THAT(request.array("key"), ElementsAre("a", "b"));
    app_control_is_extra_data_array(request.handle, "key", &isArray);
    EXPECT_TRUE(isArray);
    EXPECT_EQ(APP_CONTROL_ERROR_NONE, request.add("key", "three"));
    EXPECT_EQ("three", request.text("key"));
}

TEST(ExtraData, RefusesEmptyAndReservedOnesAndKeepsWhatWasThere)
{
    const Request request;
    request.add("recipient_list", "Ann?");
    EXPECT_EQ(APP_CONTROL_ERROR_INVALID_PARAMETER, request.add("recipient_list", ""));
    EXPECT_EQ(APP_CONTROL_ERROR_INVALID_PARAMETER, request.add("recipient_list", nullptr));
    EXPECT_EQ("Ann?", request.text("recipient_list"));
    EXPECT_EQ(APP_CONTROL_ERROR_INVALID_PARAMETER, request.add("", "value"));
    EXPECT_EQ(APP_CONTROL_ERROR_INVALID_PARAMETER, request.add(nullptr, "value"));
    EXPECT_EQ(APP_CONTROL_ERROR_INVALID_PARAMETER, request.add("\xff", "value"));
    EXPECT_EQ(APP_CONTROL_ERROR_KEY_REJECTED, request.add("__reserved", "value"));
    EXPECT_EQ(APP_CONTROL_ERROR_KEY_REJECTED, request.addArray("__reserved", {"value"}));
    EXPECT_EQ(APP_CONTROL_ERROR_INVALID_PARAMETER,
              app_control_add_extra_data(nullptr, "key", "value"));
}

TEST(ExtraData, RefusesArraysWithoutElements)
{
    const Request request;
    const char *one[] = {"a"};
    for (const int length : {0, -1})
        EXPECT_EQ(APP_CONTROL_ERROR_INVALID_PARAMETER,
                  app_control_add_extra_data_array(request.handle, "key", one, length));
    EXPECT_EQ(APP_CONTROL_ERROR_INVALID_PARAMETER,
              app_control_add_extra_data_array(request.handle, "key", nullptr, 1));
    EXPECT_EQ("error -126", request.text("key"));
}

TEST(ExtraData, AnElementMayBeNullOrEmpty)
{
    const Request request;
    EXPECT_EQ(APP_CONTROL_ERROR_NONE, request.addArray("key", {"a", nullptr, ""}));
    EXPECT_THAT(request.array("key"), ElementsAre("a", std::nullopt, ""));
}

TEST(ExtraData, TellsAbsentFromTheOtherKindAndLeavesTheOutputAlone)
{
    const Request request;
    char here = 'x';
    char *text = &here;
    char **array = &text;
    int length = 7;
    request.add("text", "value");
    request.addArray("array", {"a"});
    EXPECT_EQ(APP_CONTROL_ERROR_KEY_NOT_FOUND,
              app_control_get_extra_data(request.handle, "none", &text));
    EXPECT_EQ(APP_CONTROL_ERROR_INVALID_DATA_TYPE,
              app_control_get_extra_data(request.handle, "array", &text));
    EXPECT_EQ(APP_CONTROL_ERROR_KEY_NOT_FOUND,
              app_control_get_extra_data_array(request.handle, "none", &array, &length));
    EXPECT_EQ(APP_CONTROL_ERROR_INVALID_DATA_TYPE,
              app_control_get_extra_data_array(request.handle, "text", &array, &length));
    EXPECT_EQ(&here, text);
    EXPECT_EQ(&text, array);
    EXPECT_EQ(7, length);
}

TEST(ExtraData, RemovingAnAbsentKeyIsAnErrorWithoutEffect)
{
    const Request request;
    request.add("key", "value");
    EXPECT_EQ(APP_CONTROL_ERROR_KEY_NOT_FOUND,
              app_control_remove_extra_data(request.handle, "other"));
    EXPECT_EQ("value", request.text("key"));
    EXPECT_EQ(APP_CONTROL_ERROR_NONE, app_control_remove_extra_data(request.handle, "key"));
    EXPECT_EQ(APP_CONTROL_ERROR_KEY_NOT_FOUND,
              app_control_remove_extra_data(request.handle, "key"));
    EXPECT_EQ(APP_CONTROL_ERROR_INVALID_PARAMETER,
              app_control_remove_extra_data(request.handle, nullptr));
    EXPECT_EQ(APP_CONTROL_ERROR_INVALID_PARAMETER, app_control_remove_extra_data(nullptr, "key"));
}

TEST(ExtraData, ACloneIsReadOnAnotherThreadWhileTheOriginalChanges)
{
    constexpr int kRounds = 2000;
    const Request request;
    request.addArray("ids", {"1", "2", "3"});
    app_control_h made = nullptr;
    app_control_clone(&made, request.handle);
    const Request clone(made);
    bool same = true;
    std::thread reader([&] {
        for (int i = 0; i < kRounds; ++i)
            same = same && clone.array("ids").size() == 3;
    });
    for (int i = 0; i < kRounds; ++i)
        request.addArray("ids", {"9"});
    reader.join();
    EXPECT_TRUE(same);
}
