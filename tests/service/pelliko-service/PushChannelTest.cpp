#include "PushChannel.h"
#include "Fakes.h"

#include <gmock/gmock.h>

#include <glib.h>

using namespace pelliko::service;
using testing::Contains;
using testing::ElementsAre;
using testing::IsEmpty;
using testing::Not;

namespace
{
class Channel : public testing::Test
{
protected:
    Channel() { hands.settings.pushSilenceMs = 60'000; }

    void start() { channel.accountChanged(); }
    /** The server sends bytes on the stream that is open. */
    void stream(const std::string &bytes)
    {
        const auto found = hands.http.to("/api/v1/push");
        ASSERT_NE(found, hands.http.open.end());
        ASSERT_TRUE(found->second.request.sink->take(bytes));
        while (g_main_context_iteration(nullptr, FALSE)) {
        }
    }
    void push(int id, const std::string &token)
    {
        stream("id: " + std::to_string(id) + "\nevent: share\ndata: {\"content_token\":\"" + token +
               "\"}\n\n");
    }
    std::vector<std::string> streamHeaders()
    {
        return hands.http.to("/api/v1/push")->second.request.headers;
    }
    bool connected() { return hands.http.asked("/api/v1/push"); }
    bool acknowledges() { return hands.http.asked("/api/v1/push/ack"); }

    Hands hands;
    ReceivedJournal journal{hands.queue};
    int arrived = 0;
    PushChannel channel{hands.context, journal, [this] { ++arrived; }};
};
} // namespace

TEST_F(Channel, aPushIsOnDiskBeforeItIsAcknowledged)
{
    start();
    EXPECT_THAT(streamHeaders(), Contains("Authorization: Bearer token"));
    EXPECT_THAT(streamHeaders(), Not(Contains(testing::HasSubstr("Last-Event-ID"))));
    push(3, "one");
    EXPECT_EQ(arrived, 1);
    EXPECT_THAT(journal.unread(), ElementsAre("one"));
    ASSERT_TRUE(acknowledges());
    EXPECT_EQ(hands.http.to("/ack")->second.request.body, R"({"up_to":3})");
    EXPECT_EQ(journal.position(*hands.account).acknowledged, 0);
    push(4, "two");
    hands.http.answerTo("/ack", 204, "");
    EXPECT_EQ(journal.position(*hands.account).acknowledged, 3);
    EXPECT_EQ(hands.http.to("/ack")->second.request.body, R"({"up_to":4})")
        << "what came meanwhile goes with the next";
}

TEST_F(Channel, aBrokenStreamGoesOnAfterTheLastPushThatIsOnDisk)
{
    start();
    push(3, "one");
    hands.http.answerTo("/ack", 204, "");
    hands.http.answerTo("/api/v1/push", 200, ""); // the server stops
    EXPECT_FALSE(connected());
    hands.timers.pass(1'999);
    EXPECT_FALSE(connected());
    hands.timers.pass(1);
    ASSERT_TRUE(connected());
    EXPECT_THAT(streamHeaders(), Contains("Last-Event-ID: 3"));
    EXPECT_FALSE(acknowledges());
    hands.http.answerTo("/api/v1/push", 502, "");
    hands.timers.pass(3'999);
    EXPECT_FALSE(connected()) << "the waits double";
    hands.timers.pass(1);
    EXPECT_TRUE(connected());
}

TEST_F(Channel, aLostAcknowledgementIsRepeatedAlsoAfterARestart)
{
    start();
    push(3, "one");
    hands.http.answerTo("/ack", 500, "");
    EXPECT_FALSE(acknowledges());
    hands.timers.pass(2'000);
    ASSERT_TRUE(acknowledges());
    PushChannel restarted(hands.context, journal, [] {});
    hands.http.open.clear();
    restarted.accountChanged();
    ASSERT_TRUE(acknowledges());
    EXPECT_EQ(hands.http.to("/ack")->second.request.body, R"({"up_to":3})");
}

TEST_F(Channel, aSilentStreamIsOpenedAnewAndALineOfCommentIsNoSilence)
{
    start();
    hands.timers.pass(59'000);
    const uint64_t first = hands.http.to("/api/v1/push")->first;
    stream(":\n\n");
    hands.timers.pass(59'000);
    EXPECT_EQ(hands.http.to("/api/v1/push")->first, first);
    hands.timers.pass(1'000);
    EXPECT_FALSE(connected());
    hands.timers.pass(2'000);
    EXPECT_TRUE(connected());
}

TEST_F(Channel, waitsForTheNetworkAndForAnAccount)
{
    hands.account.reset();
    start();
    EXPECT_FALSE(connected());
    hands.account = Account{"http://server", "+447700900100", "token"};
    hands.gate.network = false;
    channel.accountChanged();
    EXPECT_FALSE(connected());
    hands.gate.network = true;
    channel.networkChanged();
    EXPECT_TRUE(connected());
    hands.gate.network = false;
    channel.networkChanged();
    EXPECT_FALSE(connected()) << "what is open over a lost network is dead";
    hands.gate.network = true;
    channel.networkChanged();
    hands.account->token = "renewed";
    channel.accountChanged();
    EXPECT_THAT(streamHeaders(), Contains("Authorization: Bearer renewed"));
    hands.account.reset();
    channel.accountChanged();
    EXPECT_THAT(hands.http.open, IsEmpty());
}

TEST_F(Channel, aServerThatWasPutBackIsListenedToFromTheBeginning)
{
    start();
    push(9, "one");
    hands.http.answerTo("/ack", 409, R"({"error":"conflict"})");
    hands.timers.pass(2'000);
    ASSERT_TRUE(connected());
    EXPECT_THAT(streamHeaders(), Not(Contains(testing::HasSubstr("Last-Event-ID"))));
    EXPECT_FALSE(acknowledges());
}

TEST_F(Channel, aRefusalIsNotAskedAgainSoon)
{
    start();
    hands.http.answerTo("/api/v1/push", 401, "");
    hands.timers.pass(299'999);
    EXPECT_FALSE(connected());
    hands.timers.pass(1);
    EXPECT_TRUE(connected());
}

TEST_F(Channel, aWishToBeLeftAloneOutlastsTheNetworkAndIsOneServers)
{
    const auto comeBack = [this] {
        hands.gate.network = false;
        channel.networkChanged();
        hands.gate.network = true;
        channel.networkChanged();
    };
    start();
    hands.http.answer(503, "", {{"retry-after", "600"}});
    comeBack();
    EXPECT_FALSE(connected());
    hands.timers.pass(599'999);
    EXPECT_FALSE(connected());
    hands.timers.pass(1);
    EXPECT_TRUE(connected());
    hands.http.answer(503, "", {{"retry-after", "600"}});
    hands.account->server = "http://another";
    channel.accountChanged();
    EXPECT_TRUE(connected());
}

TEST_F(Channel, whatIsNoPushIsSkipped)
{
    start();
    stream("id: 1\nevent: news\ndata: {\"content_token\":\"one\"}\n\n");
    stream("event: share\nid: 2\ndata: {\"content_token\":\"../../account\"}\n\n");
    stream("event: share\nid: 3\ndata: {\"content_token\":17}\n\n");
    stream("event: share\nid: none\ndata: {\"content_token\":\"one\"}\n\n");
    EXPECT_EQ(arrived, 0);
    EXPECT_THAT(journal.unread(), IsEmpty());
}
