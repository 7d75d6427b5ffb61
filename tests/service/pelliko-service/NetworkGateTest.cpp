#include "NetworkGate.h"

#include <gtest/gtest.h>

using pelliko::service::onLoopback;

TEST(NetworkGate, knowsWhichServersAreThisMachine)
{
    EXPECT_TRUE(onLoopback("http://127.0.0.1:8080"));
    EXPECT_TRUE(onLoopback("http://127.1.2.3"));
    EXPECT_TRUE(onLoopback("http://[::1]:8080"));
    EXPECT_TRUE(onLoopback("https://localhost/base"));
    EXPECT_FALSE(onLoopback("http://192.0.2.1"));
    EXPECT_FALSE(onLoopback("http://localhost.example.org"));
    EXPECT_FALSE(onLoopback("nonsense"));
}
