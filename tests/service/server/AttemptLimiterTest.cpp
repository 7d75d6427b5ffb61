#include "accounts/AttemptLimiter.h"
#include "accounts/E164.h"

#include <gtest/gtest.h>

namespace pelliko::server
{
namespace
{

Request from(const std::string &peer, const std::string &forwarded = {})
{
    Request request;
    request.peer = peer;
    if (!forwarded.empty())
        request.headers.push_back({"X-Forwarded-For", forwarded});
    return request;
}

TEST(AttemptLimiter, AnAddressHasSoManyInTheWindowAndThenWaits)
{
    AttemptLimiter limiter(2, 100);
    EXPECT_FALSE(limiter.attempt("a", 1000));
    EXPECT_FALSE(limiter.attempt("a", 1050));
    EXPECT_EQ(limiter.attempt("a", 1060), 40);
    EXPECT_FALSE(limiter.attempt("b", 1060));
    EXPECT_EQ(limiter.attempt("a", 1099), 1);
    EXPECT_FALSE(limiter.attempt("a", 1100));
}

TEST(AttemptLimiter, AClockSetBackLocksNobodyOut)
{
    AttemptLimiter limiter(1, 100);
    EXPECT_FALSE(limiter.attempt("a", 1'000'000));
    EXPECT_FALSE(limiter.attempt("a", 1000));
    EXPECT_TRUE(limiter.attempt("a", 1000));
}

TEST(AttemptLimiter, AFloodOfAddressesSharesOneCountAndPasses)
{
    AttemptLimiter limiter(1, 100);
    for (int i = 0; i < 10000; ++i)
        EXPECT_FALSE(limiter.attempt(std::to_string(i), 1000));
    EXPECT_FALSE(limiter.attempt("one more", 1001));
    EXPECT_TRUE(limiter.attempt("another", 1002));
    EXPECT_FALSE(limiter.attempt("later", 1100));
}

TEST(AttemptLimiter, OnlyAProxyOnThisMachineSaysForWhomItAsks)
{
    EXPECT_EQ(addressOf(from("203.0.113.7")), "203.0.113.7");
    EXPECT_EQ(addressOf(from("203.0.113.7", "198.51.100.1")), "203.0.113.7");
    EXPECT_EQ(addressOf(from("127.0.0.1", "198.51.100.1")), "198.51.100.1");
    EXPECT_EQ(addressOf(from("127.0.0.1", "10.9.9.9, 198.51.100.1")), "198.51.100.1");
    EXPECT_EQ(addressOf(from("::1", "198.51.100.1")), "198.51.100.1");
    EXPECT_EQ(addressOf(from("127.0.0.1", "nonsense")), "127.0.0.1");
    EXPECT_EQ(addressOf(from("127.0.0.1", "1.2.3.4, ")), "127.0.0.1");
    EXPECT_EQ(addressOf(from("")), "");
}

TEST(AttemptLimiter, AProxyOnAnotherMachineIsBelievedWhenItIsNamed)
{
    const std::vector<std::string> proxies{normalAddress("10.0.0.5"), normalAddress("fd00:0::5")};
    EXPECT_EQ(addressOf(from("10.0.0.5", "198.51.100.1"), proxies), "198.51.100.1");
    EXPECT_EQ(addressOf(from("::ffff:10.0.0.5", "198.51.100.1"), proxies), "198.51.100.1");
    EXPECT_EQ(addressOf(from("fd00::5", "198.51.100.1"), proxies), "198.51.100.1");
    EXPECT_EQ(addressOf(from("10.0.0.6", "198.51.100.1"), proxies), "10.0.0.6");
    EXPECT_THROW((void)normalAddress("proxy.example.org"), std::invalid_argument);
}

TEST(AttemptLimiter, OneHomeIsOneAddress)
{
    EXPECT_EQ(addressOf(from("2001:db8:1:2:3:4:5:6")), addressOf(from("2001:db8:1:2::9")));
    EXPECT_NE(addressOf(from("2001:db8:1:2::9")), addressOf(from("2001:db8:1:3::9")));
    EXPECT_EQ(addressOf(from("::ffff:203.0.113.7")), "203.0.113.7");
}

TEST(InvitationRules, NumbersAreInternational)
{
    for (const char *good : {"+4915112345678", "+1201555", "+123456789012345"})
        EXPECT_TRUE(isE164(good)) << good;
    for (const char *bad : {"", "+", "4915112345678", "004915112345678", "+0151123456",
                            "+49 1511234", "+123456", "+1234567890123456", "+49151x2345678"})
        EXPECT_FALSE(isE164(bad)) << bad;
}

} // namespace
} // namespace pelliko::server
