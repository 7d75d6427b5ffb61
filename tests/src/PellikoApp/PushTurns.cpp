// Pushes that wait for another, that were kept, and that the end of the application meets.
#include "PushReceiverScene.h"

#include <gmock/gmock.h>
#include <thread>

namespace pelliko::test
{
namespace
{

using ::testing::ElementsAre;
using ::testing::IsEmpty;

TEST_F(PushReceiver, ASecondPushWaitsForTheFirst)
{
    service.hold("T2");
    push({"T1", "T2"});
    EXPECT_TRUE(loop.runUntil([this] { return log.has("T2, ad->data_index[1]"); }));
    push({"T3"});
    push({"T1"});
    EXPECT_EQ(kept(), "2 T1|T2");
    EXPECT_EQ(ad->token_length, 2);
    service.release();
    EXPECT_TRUE(waitFor(left)) << log.text();
    EXPECT_THAT(service.asked(), ElementsAre("T1", "T2", "T3", "T1"));
    EXPECT_EQ(kept(), "1 T1|");
    EXPECT_EQ(times(">>>>>>>>>>>>> noti create success <<<<<<<<<<<<<<<<"), 3);
    EXPECT_EQ(times(left), 1);
}

TEST_F(PushReceiver, APushThatWaitsDoesNotRepeatTheOperationBefore)
{
    service.hold("T1");
    push({"T1"});
    ad->operation_type = OPERATION_SEND_SMS; // asked for meanwhile, and done
    push({"T2"});
    EXPECT_EQ(ad->operation_type, OPERATION_PUSH);
    service.release();
    EXPECT_TRUE(waitFor(left)) << log.text();
}

TEST_F(PushReceiver, ASecondPushWithoutTokensDoesNotKeepTheApplication)
{
    service.hold("T1");
    push({"T1"});
    receivePush(ad, LaunchRequest());
    service.release();
    EXPECT_TRUE(waitFor(left)) << log.text();
    EXPECT_TRUE(log.has("error!! get shared token list info failed!!"));
}

// The record is broken by hand: requests carry no missing tokens.
TEST_F(PushReceiver, AChainThatBreaksOffEndsWithoutAWordAndWithoutLeaving)
{
    auto **tokens = static_cast<char **>(calloc(2, sizeof(char *)));
    tokens[0] = strdup("T1");
    replaceContentsTokens(ad, tokens, 2);
    _receiverLaunchPushNotiThread(ad);
    EXPECT_TRUE(waitFor("error res = -22")) << log.text();
    push({"T2"}); // waits, or begins at once when the end was noticed already
    EXPECT_TRUE(waitFor(left)) << log.text();
    EXPECT_TRUE(waitForWorkers(std::chrono::seconds(20)));
    EXPECT_EQ(times("write pipe success"), 1);
    EXPECT_EQ(posted("PUSH_NOTI")->title, "Bob Example");
}

TEST_F(PushReceiver, WithoutATokenNothingIsAsked)
{
    preference_set_int(shareNotiBackupedKey, 2);
    EXPECT_TRUE(announceKeptShares(ad));
    EXPECT_TRUE(waitFor("error!! ret = -22")) << log.text();
    EXPECT_TRUE(waitForWorkers(std::chrono::seconds(20)));
    EXPECT_TRUE(log.has("operation_type=[1]"));
    loop.settle();
    EXPECT_THAT(service.asked(), IsEmpty());
    EXPECT_FALSE(log.has(left));
    EXPECT_FALSE(posted("PUSH_NOTI"));
}

TEST_F(PushReceiver, KeptSharesAreAnnouncedAgain)
{
    preference_set_int(shareNotiBackupedKey, 2);
    preference_set_string(shareNotiTokensKey, "T1|T2");
    EXPECT_TRUE(announceKeptShares(ad));
    EXPECT_EQ(ad->operation_type, OPERATION_PUSH);
    EXPECT_TRUE(waitFor(left)) << log.text();
    EXPECT_TRUE(log.has("noti restored"));
    EXPECT_EQ(posted("PUSH_NOTI")->content, "Bob Example, Ann Example");
}

TEST_F(PushReceiver, KeptSharesAreAnnouncedAlsoRightAfterTheServiceWasSwitchedOff)
{
    abandonPushes();
    push({"T1"});
    EXPECT_TRUE(waitFor(left)) << log.text();
    EXPECT_FALSE(posted("PUSH_NOTI"));
    log.restart();
    EXPECT_TRUE(announceKeptShares(ad));
    EXPECT_TRUE(waitFor(left)) << log.text();
    EXPECT_TRUE(posted("PUSH_NOTI"));
}

TEST_F(PushReceiver, WithoutKeptSharesThereIsNothingToAnnounce)
{
    EXPECT_FALSE(announceKeptShares(ad));
    EXPECT_EQ(ad->operation_type, OPERATION_DEFAULT);
    EXPECT_THAT(service.asked(), IsEmpty());
}

TEST_F(PushReceiver, KeptSharesThatAreBeingAnnouncedAreNotAnnouncedTwice)
{
    service.hold("T1");
    push({"T1"});
    EXPECT_TRUE(announceKeptShares(ad));
    service.release();
    EXPECT_TRUE(waitFor(left)) << log.text();
    EXPECT_THAT(service.asked(), ElementsAre("T1"));
}

// The loop was asked to end while the library was still at it.
TEST_F(PushReceiver, APushIsFinishedBeforeTheApplicationIsGone)
{
    service.hold("T1");
    push({"T1"});
    push({"T2"});
    EXPECT_TRUE(loop.runUntil([this] { return !service.asked().empty(); }));
    std::thread later([this] { service.release(); });
    finishPushes();
    later.join();
    EXPECT_EQ(times(">>>>>>>>>>>>> noti create success <<<<<<<<<<<<<<<<"), 2);
    EXPECT_EQ(posted("PUSH_NOTI")->title, "Bob Example");
}

} // namespace
} // namespace pelliko::test
