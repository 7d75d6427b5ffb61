#include "kor_account.h"
#include "kor_registration.h"
#include "kor_sim.h"

#include <gtest/gtest.h>

using namespace pelliko::korrin;

TEST(AccountSim, withoutOneTheNumberTellsTheCountry)
{
    EXPECT_EQ(composedImsi("+447700900100"), "234007700900100");
    EXPECT_EQ(composedImsi("+4915112345678"), "262005112345678");
    EXPECT_EQ(composedImsi("+12015550123"), "310002015550123");
    EXPECT_EQ(composedImsi("+14165550123"), "302004165550123") << "Canada shares the calling code";
    EXPECT_EQ(composedImsi("+3545551234"), "274003545551234");
}

TEST(AccountSim, anUnknownCountryIsATestNetwork)
{
    EXPECT_EQ(composedImsi("+88216555123"), "001008216555123") << "a satellite";
    EXPECT_EQ(composedImsi("+491"), "001000000000491");
    EXPECT_EQ(composedImsi("12"), "001000000000012");
    EXPECT_EQ(composedImsi(""), "001000000000000");
    EXPECT_TRUE(isImsi(composedImsi("")));
}

TEST(AccountSim, tellsTheCallingCodeOfItsCountry)
{
    EXPECT_EQ(callingCodeOf("262011234567890"), "49");
    EXPECT_EQ(callingCodeOf("234150000000100"), "44");
    EXPECT_EQ(callingCodeOf("310260123456789"), "1");
    EXPECT_EQ(callingCodeOf("302720123456789"), "1");
    EXPECT_EQ(callingCodeOf("001010123456789"), "");
    EXPECT_EQ(callingCodeOf("999990123456789"), "");
    EXPECT_EQ(callingCodeOf("26"), "");
    EXPECT_EQ(callingCodeOf(""), "");
}

TEST(AccountNumber, hasOneForm)
{
    EXPECT_EQ(internationalNumber("+49 151 12345678", ""), "+4915112345678");
    EXPECT_EQ(internationalNumber("0049 151 12345678", ""), "+4915112345678");
    EXPECT_EQ(internationalNumber("0151/12345678", "49"), "+4915112345678");
    EXPECT_EQ(internationalNumber("0151 12345678", ""), "");
    EXPECT_EQ(internationalNumber("+49 ", "49"), "");
    EXPECT_EQ(internationalNumber("", "49"), "");
    EXPECT_EQ(internationalNumber("anna", "49"), "");
}

TEST(AccountAddress, isSecureOrThisMachine)
{
    EXPECT_EQ(withScheme("share.example.org"), "https://share.example.org");
    EXPECT_EQ(withScheme("http://localhost:8080"), "http://localhost:8080");
    EXPECT_EQ(withScheme(""), "");
    for (const char *good : {"https://share.example.org", "https://share.example.org:8443/base",
                             "http://localhost:8080", "http://127.0.0.1:8080", "http://[::1]:80"})
        EXPECT_TRUE(isSafeAddress(good)) << good;
    for (const char *bad :
         {"", "http://share.example.org", "http://127.0.0.1.evil.example", "http://192.168.0.1",
          "ftp://localhost", "https://", "https:///x", "share.example.org"})
        EXPECT_FALSE(isSafeAddress(bad)) << bad;
}
