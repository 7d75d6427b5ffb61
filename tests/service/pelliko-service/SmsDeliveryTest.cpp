#include "SmsDelivery.h"

#include "Fakes.h"

using namespace pelliko::service;

namespace
{
struct Sms : testing::Test {
    Hands hands;
    QueuedRequest record;
    std::optional<bool> result;

    Sms()
    {
        const int32_t id = hands.queued("x").id;
        hands.queue.setFinished(id, {"http://s/T", hands.timers.epochSeconds() + 3600, {"+442"}});
        record = *hands.queue.find(id);
    }
    std::unique_ptr<SmsDelivery> start()
    {
        auto delivery = std::make_unique<SmsDelivery>(hands.context, record);
        delivery->start([this](bool received) { result = received; });
        hands.timers.pass(0);
        return delivery;
    }
    SmsState stored() { return hands.queue.find(record.id)->smsState; }
};
} // namespace

TEST_F(Sms, isNotedBeforeTheLaunchAndAfterTheReceipt)
{
    const auto delivery = start();
    ASSERT_EQ(hands.launcher.launches.size(), 1U);
    EXPECT_EQ(stored(), SmsState::launching);
    hands.launcher.answer(LaunchResult::received);
    EXPECT_EQ(stored(), SmsState::delivered);
    EXPECT_EQ(result, true);
}

TEST_F(Sms, anApplicationThatCannotBeStartedIsTriedUntilTheShareExpires)
{
    const auto delivery = start();
    int launches = 0;
    while (!result) {
        hands.launcher.answer(LaunchResult::notSent);
        EXPECT_EQ(stored(), SmsState::wanted);
        hands.timers.pass(hands.timers.next());
        ++launches;
    }
    EXPECT_EQ(result, false);
    EXPECT_GT(launches, 5);
    EXPECT_GE(hands.timers.epochSeconds(), record.expires);
}

TEST_F(Sms, missingReceiptsAreNotTriedForever)
{
    const auto delivery = start();
    for (int i = 0; i < 5 && !result; ++i) {
        hands.launcher.answer(LaunchResult::unknown);
        EXPECT_EQ(stored(), SmsState::launching);
        hands.timers.pass(hands.timers.next());
    }
    EXPECT_EQ(result, false);
    EXPECT_EQ(hands.launcher.launches.size(), 5U);
}

TEST_F(Sms, everyLaunchOfAShareHasTheSameKey)
{
    const auto delivery = start();
    hands.launcher.answer(LaunchResult::unknown);
    hands.timers.pass(hands.timers.next());
    const auto &launches = hands.launcher.launches;
    ASSERT_EQ(launches.size(), 2U);
    EXPECT_EQ(launches[0].key.size(), 22U);
    EXPECT_EQ(launches[1].key, launches[0].key);
    EXPECT_NE(hands.queued("another").key, launches[0].key);
}

TEST_F(Sms, aLaunchInFlightDoesNotReachADeliveryThatHasEnded)
{
    auto delivery = start();
    delivery.reset();
    hands.launcher.answer(LaunchResult::received);
    EXPECT_FALSE(result);
}
