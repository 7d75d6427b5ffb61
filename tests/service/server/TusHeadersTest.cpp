#include "tus/TusHeaders.h"

#include "http/Errors.h"

#include <gtest/gtest.h>

namespace pelliko::server
{
namespace
{

TEST(TusHeaders, MetadataIsDecoded)
{
    const auto metadata = parseUploadMetadata("filename cGhvdG8uanBn, is_private,share YWJj");
    EXPECT_EQ(metadata.at("filename"), "photo.jpg");
    EXPECT_EQ(metadata.at("is_private"), "");
    EXPECT_EQ(metadata.at("share"), "abc");
    EXPECT_TRUE(parseUploadMetadata("").empty());
    EXPECT_EQ(parseUploadMetadata("share\t YWJj,a\t").at("share"), "abc");
}

TEST(TusHeaders, MalformedMetadataIsRefused)
{
    for (const char *value : {"filename !", "a YQ", "a YQ==,a YQ==", ",", " ,b"})
        EXPECT_THROW((void)parseUploadMetadata(value), Refusal) << value;
}

TEST(TusHeaders, NumbersAreDecimalAndWhole)
{
    EXPECT_EQ(parseNumber("0"), 0U);
    EXPECT_EQ(parseNumber("18446744073709551615"), 18446744073709551615U);
    for (const char *text : {"", "-1", "+1", " 1", "1 ", "0x1", "1.0", "18446744073709551616"})
        EXPECT_FALSE(parseNumber(text)) << text;
}

TEST(TusHeaders, AnotherVersionIsRefusedWithOurs)
{
    Request request;
    EXPECT_THROW(checkTusVersion(request), Refusal);
    request.headers = {{"tus-resumable", "0.2.2"}};
    EXPECT_THROW(checkTusVersion(request), Refusal);
    request.headers = {{"TUS-Resumable", "1.0.0"}};
    EXPECT_NO_THROW(checkTusVersion(request));
}

} // namespace
} // namespace pelliko::server
