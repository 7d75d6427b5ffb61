#include "Request.h"

#include <Serialisation.h>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

using namespace pelliko::platform;
using pelliko::test::Request;
using testing::ElementsAre;

namespace
{

app_control_h passed(app_control_h request)
{
    g_autoptr(GVariant) variant = g_variant_ref_sink(toVariant(request));
    // Through bytes, as a keeper would store it.
    g_autoptr(GBytes) bytes = g_variant_get_data_as_bytes(variant);
    g_autoptr(GVariant) stored =
        g_variant_ref_sink(g_variant_new_from_bytes(G_VARIANT_TYPE_VARDICT, bytes, FALSE));
    return fromVariant(stored);
}

std::string parsed(const char *text)
{
    g_autoptr(GVariant) variant = g_variant_parse(nullptr, text, nullptr, nullptr, nullptr);
    const Request request(fromVariant(variant));
    return request.handle ? toJson(request.handle) : "(none)";
}

} // namespace

TEST(Serialisation, ARequestSurvivesAsAWhole)
{
    const Request request;
    app_control_set_app_id(request.handle, "com.velmora.pelliko");
    app_control_set_operation(request.handle, APP_CONTROL_OPERATION_UPLOADING_NOTI_PRESSED);
    app_control_set_uri(request.handle, "file:///a.jpg");
    app_control_set_mime(request.handle, "image/jpeg");
    request.add("upload_request_id", "7");
    request.addArray("list", {"a", ""});
    const Request again(passed(request.handle));
    EXPECT_EQ(toJson(request.handle), toJson(again.handle));
    EXPECT_EQ("{\"app_id\":\"com.velmora.pelliko\",\"extras\":{\"list\":[\"a\",\"\"],"
              "\"upload_request_id\":\"7\"},\"mime\":\"image/jpeg\",\"operation\":\"http://"
              "tizen.org/appcontrol/operation/uploading_noti_pressed\",\"uri\":\"file:///a.jpg\"}",
              toJson(again.handle));
}

TEST(Serialisation, NamesThatAreNotUtf8KeepTheirBytes)
{
    const Request request;
    app_control_set_uri(request.handle, "/photos/caf\xe9.jpg");
    request.add("text", "\xff\xfe");
    request.addArray("paths", {"/a.jpg", "/caf\xe9.jpg"});
    const Request again(passed(request.handle));
    char *uri = nullptr;
    app_control_get_uri(again.handle, &uri);
    EXPECT_STREQ("/photos/caf\xe9.jpg", uri);
    free(uri);
    EXPECT_EQ("\xff\xfe", again.text("text"));
    EXPECT_THAT(again.array("paths"), ElementsAre("/a.jpg", "/caf\xe9.jpg"));
    EXPECT_EQ(
        "{\"paths\":[\"/a.jpg\",\"/caf\xef\xbf\xbd.jpg\"],\"text\":\"\xef\xbf\xbd\xef\xbf\xbd\"}",
        extrasToJson(again.handle));
}

TEST(Serialisation, ANullElementTravelsAsAnEmptyText)
{
    const Request request;
    request.addArray("list", {"a", nullptr});
    EXPECT_THAT(Request(passed(request.handle)).array("list"), ElementsAre("a", ""));
}

TEST(Serialisation, ForeignEntriesAreLeftOut)
{
    EXPECT_EQ("{\"extras\":{}}", parsed("@a{sv} {}"));
    EXPECT_EQ("{\"extras\":{\"good\":\"x\"},\"mime\":\"a/b\"}",
              parsed("{'operation': <1>, 'mime': <'a/b'>, 'surprise': <'x'>, 'extras': <{'good': "
                     "<'x'>, 'number': <5>, 'empty': <@as []>, '': <'no name'>}>}"));
    EXPECT_EQ("{\"extras\":{}}", parsed("{'extras': <'no dictionary'>}"));
    EXPECT_EQ("(none)", parsed("'text'"));
    EXPECT_EQ(nullptr, fromVariant(nullptr));
    EXPECT_EQ(nullptr, toVariant(nullptr));
}
