#include "Backoff.h"

#include <gtest/gtest.h>

using namespace pelliko::service;

TEST(Backoff, waitsDoubleUpToTheLongestAndBeginAnewAfterASuccess)
{
    Backoff backoff(100, 1000, [] { return 1.0; });
    EXPECT_EQ(backoff.next(), 100);
    EXPECT_EQ(backoff.next(), 200);
    EXPECT_EQ(backoff.next(), 400);
    EXPECT_EQ(backoff.next(), 800);
    EXPECT_EQ(backoff.next(), 1000);
    EXPECT_EQ(backoff.next(), 1000);
    backoff.reset();
    EXPECT_EQ(backoff.next(), 100);
}

TEST(Backoff, chanceTakesAtMostHalfOfAWait)
{
    Backoff backoff(100, 1000, [] { return 0.0; });
    EXPECT_EQ(backoff.next(), 50);
}

TEST(Backoff, aThousandFailuresStillWaitTheLongest)
{
    Backoff backoff(100, 1000, [] { return 1.0; });
    for (int i = 0; i < 1000; ++i) {
        backoff.next();
    }
    EXPECT_EQ(backoff.next(), 1000);
}
