#include "Config.h"

#include <gtest/gtest.h>

#include <stdexcept>

namespace pelliko::server
{
namespace
{

TEST(Config, ListenAddressesOfBothFamilies)
{
    EXPECT_EQ(parseListenAddress("127.0.0.1:8080").port, 8080);
    EXPECT_EQ(parseListenAddress("[::1]:0").host, "::1");
    for (const char *bad : {"", "8080", "127.0.0.1", "127.0.0.1:", ":80", "a:65536", "a:-1"})
        EXPECT_THROW((void)parseListenAddress(bad), std::invalid_argument) << bad;
}

TEST(Config, PublicUrlsLoseTheirLastSlash)
{
    EXPECT_EQ(normalPublicUrl("https://share.example.org/"), "https://share.example.org");
    EXPECT_EQ(normalPublicUrl(""), "");
    EXPECT_THROW((void)normalPublicUrl("share.example.org"), std::invalid_argument);
}

} // namespace
} // namespace pelliko::server
