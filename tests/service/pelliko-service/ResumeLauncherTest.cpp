#include "ResumeLauncher.h"

#include "Fakes.h"

#include <gmock/gmock.h>

#include <set>

using namespace pelliko::service;
using testing::ElementsAre;

namespace
{
struct Resume : testing::Test, Orphans {
    Hands hands;
    std::set<int32_t> open{3, 8};
    std::vector<int32_t> given_up;
    ResumeLauncher launcher{hands.context, *this};

    std::vector<int32_t> orphans() const override { return {open.begin(), open.end()}; }
    bool isOrphan(int32_t id) const override { return open.count(id) != 0; }
    void abandon(int32_t id) override
    {
        open.erase(id);
        given_up.push_back(id);
    }
    void claim(int32_t id)
    {
        open.erase(id);
        launcher.claimed(id);
    }
    void launch()
    {
        launcher.lookAfter(0);
        hands.timers.pass(0);
    }
    size_t launches() const { return hands.launcher.resumes.size(); }
};
} // namespace

TEST_F(Resume, launchesTheApplicationOnceForAllOrphans)
{
    launch();
    launcher.lookAfter(0);
    hands.timers.pass(100'000);
    ASSERT_EQ(launches(), 1U) << "the first launch has not been answered";
    EXPECT_THAT(hands.launcher.resumes[0], ElementsAre(3, 8));
}

TEST_F(Resume, whatIsNotClaimedInTimeIsGivenUp)
{
    launch();
    hands.launcher.answerResume(true);
    claim(8);
    hands.timers.pass(hands.settings.claimMs - 1);
    EXPECT_TRUE(given_up.empty());
    hands.timers.pass(1);
    EXPECT_THAT(given_up, ElementsAre(3));
}

TEST_F(Resume, anApplicationThatDoesNotTakeThemOverIsAskedAgainLater)
{
    launch();
    hands.launcher.answerResume(false);
    EXPECT_EQ(hands.timers.next(), hands.settings.firstLaunchRetryMs);
    hands.timers.pass(hands.settings.firstLaunchRetryMs);
    EXPECT_EQ(launches(), 2U);
    EXPECT_TRUE(given_up.empty());
}

TEST_F(Resume, anApplicationThatEndsBeforeItClaimsIsAskedOnceMore)
{
    launch();
    hands.launcher.answerResume(true);
    launcher.applicationGone();
    EXPECT_TRUE(given_up.empty());
    hands.timers.pass(hands.timers.next());
    ASSERT_EQ(launches(), 2U);
    hands.launcher.answerResume(true);
    launcher.applicationGone();
    EXPECT_THAT(given_up, ElementsAre(3, 8));
}

TEST_F(Resume, crashesAfterClaimingNeverGiveARequestUp)
{
    int64_t longest = 0;
    launch();
    for (int i = 0; i < 10; ++i) {
        hands.launcher.answerResume(true);
        claim(3);
        claim(8);
        open = {3, 8}; // the application has crashed
        launcher.applicationGone();
        longest = std::max(longest, hands.timers.next());
        hands.timers.pass(hands.timers.next());
    }
    EXPECT_TRUE(given_up.empty());
    EXPECT_EQ(launches(), 11U);
    EXPECT_GE(longest, hands.settings.longestLaunchRetryMs)
        << "the launches come more and more slowly";
}

TEST_F(Resume, anApplicationThatCameForSomethingElseDelaysNothing)
{
    launcher.lookSoon();
    const int64_t wait = hands.timers.next();
    for (int i = 0; i < 5; ++i) {
        launcher.applicationGone();
    }
    EXPECT_EQ(hands.timers.next(), wait);
    hands.timers.pass(wait);
    EXPECT_EQ(launches(), 1U);
}

TEST_F(Resume, launchesThatHelpedDoNotDelayThoseForOthers)
{
    for (int32_t id = 1; id <= 10; ++id) {
        open = {id};
        launcher.lookSoon();
        EXPECT_LE(hands.timers.next(), 2 * hands.settings.firstLaunchRetryMs);
        hands.timers.pass(hands.timers.next());
        ASSERT_EQ(launches(), static_cast<size_t>(id));
        hands.launcher.answerResume(true);
        claim(id);
        launcher.applicationGone();
    }
}

TEST_F(Resume, withoutOrphansNothingIsLaunched)
{
    open.clear();
    launch();
    EXPECT_EQ(launches(), 0U);
    EXPECT_EQ(hands.timers.next(), -1);
}
