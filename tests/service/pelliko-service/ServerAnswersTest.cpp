#include "ReceivedApi.h"
#include "ShareApi.h"

#include <gtest/gtest.h>

using namespace pelliko::service;

namespace
{
HttpAnswer good(const std::string &body)
{
    return {"", 200, body, {}};
}

std::string share(const std::string &upload, const std::string &offset)
{
    return R"({"share":"s","files":[{"upload":")" + upload + R"(","offset":)" + offset + "}]}";
}

std::string finished(const std::string &url, const std::string &expires)
{
    return R"({"url":")" + url + R"(","expires":)" + expires + R"(,"sms":[]})";
}

std::string received(const std::string &size)
{
    return R"({"sender":"+49","created":1,"expires":2,"state":"available",)"
           R"("files":[{"name":"a","size":)" +
           size + "}]}";
}
} // namespace

TEST(ServerAnswers, aNumberIsWholeAndFitsOrTheAnswerIsNone)
{
    ASSERT_TRUE(ShareApi::readShare(good(share("/u", "9223372036854775807"))));
    ASSERT_TRUE(ReceivedApi::readShare(good(received("0"))));
    ASSERT_TRUE(ShareApi::readFinished(good(finished("https://h/s/a", "1760000000"))));
    for (const char *number : {"1e300", "-1", "1.5", "18446744073709551615", "true", "\"1\""}) {
        EXPECT_FALSE(ShareApi::readShare(good(share("/u", number)))) << number;
        EXPECT_FALSE(ReceivedApi::readShare(good(received(number)))) << number;
        EXPECT_FALSE(ShareApi::readFinished(good(finished("https://h/s/a", number)))) << number;
    }
}

TEST(ServerAnswers, anAddressIsOneWordOfTheSameServer)
{
    for (const char *upload : {"", "u", "http://other/", "/u\\r\\nX-Evil: 1", "/u v", "/\\u00fc"}) {
        EXPECT_FALSE(ShareApi::readShare(good(share(upload, "0")))) << upload;
    }
}

TEST(ServerAnswers, aLinkThatGoesIntoMessagesIsOneWord)
{
    for (const char *url : {"", "https://h/s/a\\nFree money: http://evil/", "https://h/s/a b"}) {
        EXPECT_FALSE(ShareApi::readFinished(good(finished(url, "1")))) << url;
    }
}
