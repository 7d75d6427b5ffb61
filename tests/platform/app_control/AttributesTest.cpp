#include "Request.h"

#include <gtest/gtest.h>

using pelliko::test::Request;

namespace
{

using Setter = int (*)(app_control_h, const char *);
using Getter = int (*)(app_control_h, char **);

struct Attribute {
    const char *name;
    Setter set;
    Getter get;
};

class Attributes : public testing::TestWithParam<Attribute>
{
};

std::string value(Getter get, app_control_h request)
{
    char *text = nullptr;
    EXPECT_EQ(APP_CONTROL_ERROR_NONE, get(request, &text));
    std::string copy = text ? text : "(null)";
    free(text);
    return copy;
}

} // namespace

TEST_P(Attributes, AreAbsentUntilSetAndAfterSettingNull)
{
    const Request request;
    EXPECT_EQ("(null)", value(GetParam().get, request.handle));
    EXPECT_EQ(APP_CONTROL_ERROR_NONE, GetParam().set(request.handle, "text"));
    EXPECT_EQ("text", value(GetParam().get, request.handle));
    EXPECT_EQ(APP_CONTROL_ERROR_NONE, GetParam().set(request.handle, nullptr));
    EXPECT_EQ("(null)", value(GetParam().get, request.handle));
}

TEST_P(Attributes, AreRefusedWithoutAHandleOrAPlaceToWriteTo)
{
    const Request request;
    char *text = nullptr;
    EXPECT_EQ(APP_CONTROL_ERROR_INVALID_PARAMETER, GetParam().set(nullptr, "text"));
    EXPECT_EQ(APP_CONTROL_ERROR_INVALID_PARAMETER, GetParam().get(nullptr, &text));
    EXPECT_EQ(APP_CONTROL_ERROR_INVALID_PARAMETER, GetParam().get(request.handle, nullptr));
}

TEST_P(Attributes, OfACloneLiveOnTheirOwn)
{
    const Request request;
    GetParam().set(request.handle, "before");
    app_control_h clone = nullptr;
    ASSERT_EQ(APP_CONTROL_ERROR_NONE, app_control_clone(&clone, request.handle));
    const Request copy(clone);
    GetParam().set(request.handle, "after");
    EXPECT_EQ("before", value(GetParam().get, copy.handle));
}

INSTANTIATE_TEST_SUITE_P(
    All, Attributes,
    testing::Values(Attribute{"Operation", app_control_set_operation, app_control_get_operation},
                    Attribute{"Uri", app_control_set_uri, app_control_get_uri},
                    Attribute{"Mime", app_control_set_mime, app_control_get_mime},
                    Attribute{"AppId", app_control_set_app_id, app_control_get_app_id}),
    [](const testing::TestParamInfo<Attribute> &given) { return given.param.name; });

TEST(Handles, RefuseNull)
{
    app_control_h clone = nullptr;
    const Request request;
    EXPECT_EQ(APP_CONTROL_ERROR_INVALID_PARAMETER, app_control_create(nullptr));
    EXPECT_EQ(APP_CONTROL_ERROR_INVALID_PARAMETER, app_control_destroy(nullptr));
    EXPECT_EQ(APP_CONTROL_ERROR_INVALID_PARAMETER, app_control_clone(&clone, nullptr));
    EXPECT_EQ(APP_CONTROL_ERROR_INVALID_PARAMETER, app_control_clone(nullptr, request.handle));
    EXPECT_EQ(nullptr, clone);
}

TEST(Handles, AnswerOnlyRequestsThatWereReceived)
{
    const Request reply;
    const Request own;
    EXPECT_EQ(APP_CONTROL_ERROR_INVALID_PARAMETER,
              app_control_reply_to_launch_request(reply.handle, own.handle,
                                                  APP_CONTROL_RESULT_SUCCEEDED));
    EXPECT_EQ(
        APP_CONTROL_ERROR_INVALID_PARAMETER,
        app_control_reply_to_launch_request(reply.handle, nullptr, APP_CONTROL_RESULT_SUCCEEDED));
}

TEST(Handles, HaveThePlatformsErrorNumbers)
{
    EXPECT_EQ(-17825759, APP_CONTROL_ERROR_APP_NOT_FOUND);
    EXPECT_EQ(-17825758, APP_CONTROL_ERROR_INVALID_DATA_TYPE);
    EXPECT_EQ(-17825757, APP_CONTROL_ERROR_LAUNCH_REJECTED);
    EXPECT_EQ(-17825756, APP_CONTROL_ERROR_LAUNCH_FAILED);
    EXPECT_EQ(-126, APP_CONTROL_ERROR_KEY_NOT_FOUND);
    EXPECT_EQ(-129, APP_CONTROL_ERROR_KEY_REJECTED);
}
