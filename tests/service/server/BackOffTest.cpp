#include "store/BackOff.h"

#include <gtest/gtest.h>

namespace pelliko::server
{
namespace
{

using namespace std::chrono_literals;

TEST(BackOff, EverybodyMayAskAStoreThatIsThere)
{
    BackOff backOff(1h);
    EXPECT_TRUE(backOff.mayTry());
    EXPECT_TRUE(backOff.mayTry());
    EXPECT_FALSE(backOff.isAway());
}

TEST(BackOff, NobodyTriesAStoreThatWasMissedAMomentAgo)
{
    BackOff backOff(1s);
    backOff.missed();
    EXPECT_FALSE(backOff.mayTry());
    EXPECT_TRUE(backOff.isAway());
}

TEST(BackOff, WhoReachedTheStoreLetsEverybodyIn)
{
    BackOff backOff(1s);
    backOff.missed();
    backOff.missed();
    backOff.reached();
    EXPECT_TRUE(backOff.mayTry());
    EXPECT_TRUE(backOff.mayTry());
    EXPECT_FALSE(backOff.isAway());
}

} // namespace
} // namespace pelliko::server
