#include "PushDelivery.h"
#include "Fakes.h"

#include <gmock/gmock.h>

using namespace pelliko::service;
using testing::ElementsAre;
using testing::IsEmpty;

namespace
{
constexpr const char *record = R"({"id":1,"sender":"+447700900555","created":900,"expires":2000000,
  "state":"available","files":[{"index":0,"name":"a.jpg","size":10,"type":"image/jpeg"}]})";

class Delivery : public testing::Test
{
protected:
    void arrive(const std::string &token)
    {
        journal.announce(*hands.account, ++id_, token, hands.timers.epochSeconds());
        delivery->kick();
    }
    void restart()
    {
        delivery = std::make_unique<PushDelivery>(hands.context, journal, [] {});
    }

    Hands hands;
    ReceivedJournal journal{hands.queue};
    std::unique_ptr<PushDelivery> delivery =
        std::make_unique<PushDelivery>(hands.context, journal, [] {});

private:
    int64_t id_ = 0;
};
} // namespace

TEST_F(Delivery, tokensThatWaitTogetherGoTogether)
{
    arrive("one");
    arrive("two");
    hands.http.answerTo("/received/one", 200, record);
    EXPECT_THAT(hands.launcher.pushes, IsEmpty());
    hands.http.answerTo("/received/two", 200, record);
    ASSERT_EQ(hands.launcher.pushes.size(), 1U);
    EXPECT_THAT(hands.launcher.pushes[0], ElementsAre("one", "two"));
    arrive("three");
    EXPECT_FALSE(hands.http.asked("/received/three")) << "the application has not taken the first";
    hands.launcher.answerPush(LaunchResult::received);
    hands.http.answerTo("/received/three", 200, record);
    ASSERT_EQ(hands.launcher.pushes.size(), 2U);
    EXPECT_THAT(hands.launcher.pushes[1], ElementsAre("three"));
    hands.launcher.answerPush(LaunchResult::received);
    restart();
    delivery->kick();
    EXPECT_EQ(hands.launcher.pushes.size(), 2U) << "what was taken is not told again";
}

TEST_F(Delivery, aLaunchWithoutReceiptIsRepeatedAlsoAfterARestart)
{
    arrive("one");
    hands.http.answerTo("/received/one", 200, record);
    hands.launcher.answerPush(LaunchResult::notSent);
    EXPECT_EQ(hands.launcher.pushes.size(), 1U);
    hands.timers.pass(2'000);
    EXPECT_EQ(hands.launcher.pushes.size(), 2U);
    restart(); // in the middle of the launch
    delivery->kick();
    EXPECT_EQ(hands.launcher.pushes.size(), 3U);
    EXPECT_THAT(hands.launcher.pushes[2], ElementsAre("one"));
}

TEST_F(Delivery, anApplicationThatDiesOfALaunchIsLeftInPeaceInTheEnd)
{
    arrive("one");
    hands.http.answerTo("/received/one", 200, record);
    for (int i = 0; i < 20; ++i) {
        if (hands.launcher.answerPush) {
            std::exchange(hands.launcher.answerPush, nullptr)(LaunchResult::unknown);
        }
        hands.timers.pass(600'000);
    }
    EXPECT_EQ(hands.launcher.pushes.size(), 5U);
    EXPECT_TRUE(journal.find("one")) << "the list still has it";
}

TEST_F(Delivery, aShareThatIsGoneIsNotTold)
{
    arrive("one");
    hands.http.answerTo("/received/one", 404, R"({"error":"not_found"})");
    EXPECT_THAT(hands.launcher.pushes, IsEmpty());
    EXPECT_THAT(journal.unread(), IsEmpty());
    arrive("two");
    std::string withdrawn = record;
    withdrawn.replace(withdrawn.find("available"), 9, "withdrawn");
    hands.http.answerTo("/received/two", 200, withdrawn);
    EXPECT_THAT(hands.launcher.pushes, IsEmpty());
}

TEST_F(Delivery, aServerThatCannotBeReachedIsAskedAgain)
{
    arrive("one");
    hands.http.refuseConnection();
    EXPECT_FALSE(hands.http.asked("/received/one"));
    hands.timers.pass(2'000);
    hands.http.answerTo("/received/one", 200, "a hotel's login page");
    hands.timers.pass(4'000);
    hands.http.answerTo("/received/one", 200, record);
    EXPECT_EQ(hands.launcher.pushes.size(), 1U);
}

TEST_F(Delivery, moreThanThirtyGoInSeveralLaunches)
{
    for (int i = 0; i < 31; ++i) {
        arrive("token" + std::to_string(i));
    }
    for (int i = 0; i < 31; ++i) {
        hands.http.answerTo("/received/token" + std::to_string(i), 200, record);
    }
    ASSERT_EQ(hands.launcher.pushes.size(), 1U);
    EXPECT_EQ(hands.launcher.pushes[0].size(), 30U);
    hands.launcher.answerPush(LaunchResult::received);
    ASSERT_EQ(hands.launcher.pushes.size(), 2U);
    EXPECT_THAT(hands.launcher.pushes[1], ElementsAre("token30"));
}
