#include <Imsi.h>

#include <gtest/gtest.h>

using pelliko::telephony::splitImsi;

namespace
{

std::string split(const std::string &imsi, int mncLength)
{
    const auto parts = splitImsi(imsi, mncLength);
    if (!parts)
        return "refused";
    return std::string(parts->szMcc) + " " + parts->szMnc + " " + parts->szMsin;
}

TEST(Imsi, TheServicesWordOnTheNetworkCodeCounts)
{
    EXPECT_EQ(split("262011234567890", 2), "262 01 1234567890");
    EXPECT_EQ(split("262011234567890", 3), "262 011 234567890");
    EXPECT_EQ(split("310150123456789", 2), "310 15 0123456789");
}

TEST(Imsi, WithoutItTheCountrysHabitDecides)
{
    EXPECT_EQ(split("262011234567890", 0), "262 01 1234567890");
    EXPECT_EQ(split("234159876543210", 0), "234 15 9876543210");
    for (const char *country :
         {"302", "310", "311", "312", "313", "314", "315", "316", "334", "405"})
        EXPECT_EQ(split(std::string(country) + "150123456789", 0),
                  std::string(country) + " 150 123456789");
    EXPECT_EQ(split("450081234567890", 0), "450 08 1234567890");
}

TEST(Imsi, ACountryThatNobodyKnowsIsSplitAllTheSame)
{
    EXPECT_EQ(split("999011234567890", 0), "999 01 1234567890");
}

TEST(Imsi, ALongNumberIsCutAndTerminated)
{
    EXPECT_EQ(split("26201123456789012345", 2), "262 01 1234567890");
    EXPECT_EQ(split(std::string(1000, '4'), 0), "444 44 4444444444");
}

TEST(Imsi, TheShortestNumberHasOneDigitOfASubscriber)
{
    EXPECT_EQ(split("262017", 0), "262 01 7");
    EXPECT_EQ(split("26201", 0), "refused");
    EXPECT_EQ(split("310150", 0), "refused");
}

TEST(Imsi, WhatIsNoNumberIsRefused)
{
    for (const char *imsi :
         {"", "2", "26", "262", "26201abc", "2620112345678 0", "+262011234567890"})
        EXPECT_EQ(split(imsi, 0), "refused") << imsi;
    EXPECT_EQ(split(std::string("26201\0"
                                "1234",
                                10),
                    0),
              "refused");
}

} // namespace
