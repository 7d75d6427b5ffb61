#include "ProgressReporter.h"

#include "Fakes.h"

#include <gmock/gmock.h>

using namespace pelliko::service;
using testing::ElementsAre;

namespace
{
struct Progress : testing::Test {
    HandTimers timers;
    std::vector<int> seen;
    ProgressReporter reporter{timers, 1000, [this](int percent) { seen.push_back(percent); }};
};
} // namespace

TEST_F(Progress, aPercentIsReportedOnce)
{
    reporter.update(400);
    timers.pass(200);
    reporter.update(401);
    reporter.update(409);
    timers.pass(200);
    reporter.update(410);
    EXPECT_THAT(seen, ElementsAre(40, 41));
}

TEST_F(Progress, tenReportsASecondAtMostAndTheLastIsNotLost)
{
    for (int bytes = 0; bytes < 1000; bytes += 10) {
        reporter.update(bytes);
        timers.pass(10);
    }
    timers.pass(100);
    EXPECT_LE(seen.size(), 11U);
    EXPECT_EQ(seen.back(), 99);
}

TEST_F(Progress, afterAPauseTheSamePercentIsToldAgain)
{
    reporter.update(400);
    timers.pass(200);
    reporter.repeatNext();
    reporter.update(400);
    EXPECT_THAT(seen, ElementsAre(40, 40));
}

TEST_F(Progress, wholePercentsAreRoundedDown)
{
    reporter.update(999);
    EXPECT_THAT(seen, ElementsAre(99));
}
