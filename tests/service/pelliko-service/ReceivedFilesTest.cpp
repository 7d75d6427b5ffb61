// What a received share tells and gives: its files are saved, or it is said why not.
#include "FaultPlan.h"
#include "ReceivedScene.h"

#include <JsonValue.h>
#include <gmock/gmock.h>

#include <fstream>
#include <iterator>

using pelliko::test::JsonValue;
using testing::ElementsAre;
using testing::IsEmpty;

namespace
{
std::string contentOf(const std::string &path)
{
    std::ifstream file(path, std::ios::binary);
    return {std::istreambuf_iterator<char>(file), {}};
}
} // namespace

TEST_F(Received, aShareArrivesWithEverythingThatTheApplicationAsksFor)
{
    start();
    const RecordingApplication application;
    const std::string one = makeFile("one.jpg", 70'000);
    const std::string empty = makeFile("empty.txt", 0);
    int32_t id = 0;
    ASSERT_EQ(requestTo({{"44", self}, {"44", "+447700900222"}, {"", "12"}}, {one, empty}, &id), 0);
    ASSERT_TRUE(waitForEnd(id));
    ASSERT_TRUE(waitForTokens(application, 1));
    const std::string token = tokens(application)[0];
    EXPECT_LE(token.size(), 24U);
    const Info info = infoOf(token);
    EXPECT_EQ(info.result, 0);
    EXPECT_THAT(info.sizes, ElementsAre(70'000U, 0U));
    EXPECT_EQ(static_cast<int64_t>(info.expires), reportsOf(id).back().expired);
    EXPECT_EQ(info.sender, self);
    EXPECT_THAT(receivedList(), ElementsAre(std::pair(token, int(PELLIKO_SHARE_AVAILABLE))));
    const auto sent = sentList();
    ASSERT_EQ(sent.size(), 1U);
    EXPECT_EQ(sent[0].state, PELLIKO_SHARE_AVAILABLE);
    EXPECT_THAT(sent[0].told,
                ElementsAre(PELLIKO_TOLD_PUSH, PELLIKO_TOLD_SMS, PELLIKO_TOLD_NOBODY));

    const Saved saved = save(token);
    EXPECT_EQ(saved.result, 0);
    ASSERT_THAT(saved.paths, ElementsAre(downloads() + "/one.jpg", downloads() + "/empty.txt"));
    EXPECT_TRUE(contentOf(saved.paths[0]) == contentOf(one));
    EXPECT_EQ(saved.done, 70'000);
    EXPECT_EQ(saved.total, 70'000);
    EXPECT_THAT(save(token, 0).paths, ElementsAre(downloads() + "/one (2).jpg"));
    EXPECT_EQ(save(token, 2).result, PELLIKO_SHARES_ERROR_INVALID_PARAMETER);
}

TEST_F(Received, aShareThatIsTakenBackSaysSoEverywhere)
{
    start();
    const RecordingApplication application;
    const int32_t id = share({makeFile("a.jpg", 100)});
    ASSERT_TRUE(waitForTokens(application, 1));
    const std::string token = tokens(application)[0];
    EXPECT_EQ(resultOf([&](auto done, void *data) {
                  return pelliko_shares_withdraw(id, done, data, nullptr);
              }),
              0);
    ASSERT_TRUE(runUntil([&] { return sentList()[0].state == PELLIKO_SHARE_WITHDRAWN; }));
    const Saved saved = save(token);
    EXPECT_EQ(saved.result, PELLIKO_SHARES_ERROR_WITHDRAWN);
    EXPECT_THAT(saved.paths, IsEmpty());
    EXPECT_THAT(receivedList(), ElementsAre(std::pair(token, int(PELLIKO_SHARE_WITHDRAWN))));
    EXPECT_EQ(infoOf(token).result, PELLIKO_SHARES_ERROR_WITHDRAWN);
    EXPECT_EQ(resultOf([&](auto done, void *data) {
                  return pelliko_shares_forget_received(token.c_str(), done, data, nullptr);
              }),
              0);
    EXPECT_THAT(receivedList(), IsEmpty());
    EXPECT_EQ(resultOf([&](auto done, void *data) {
                  return pelliko_shares_forget_sent(id, done, data, nullptr);
              }),
              0);
    EXPECT_THAT(sentList(), IsEmpty());
    EXPECT_EQ(infoOf("unknownToken").result, PELLIKO_SHARES_ERROR_NOT_FOUND);
}

TEST_F(Received, nothingOfAHotelsNetworkIsTakenForTheServersAnswer)
{
    startServer();
    std::vector<std::string> rules(3, hotelPage("GET", "/push$"));
    rules.push_back(hotelPage("POST", "/push/ack$"));
    for (const std::string method : {"GET", "DELETE"}) {
        rules.push_back(answers(method, "/received/[^/]+$", 404));
        rules.push_back(hotelPage(method, "/received/[^/]+$"));
    }
    // As long as the file, and all of it and the rest of it.
    const std::string bytes = R"("length": 70000)";
    rules.push_back(rule("GET", "/files/0$", "cut", R"("after": 30000)"));
    rules.push_back(answers("GET", "/files/0$", 200, bytes));
    rules.push_back(answers("GET", "/files/0$", 206, bytes));
    startFaults(plan(rules));
    startService();
    const RecordingApplication application;
    const std::string file = makeFile("one.jpg", 70'000);
    share({file});
    ASSERT_TRUE(waitForTokens(application, 1));
    const std::string token = tokens(application)[0];
    const Saved saved = save(token);
    EXPECT_EQ(saved.result, 0);
    ASSERT_EQ(saved.paths.size(), 1U);
    EXPECT_TRUE(contentOf(saved.paths[0]) == contentOf(file));
    EXPECT_EQ(resultOf([&](auto done, void *data) {
                  return pelliko_shares_forget_received(token.c_str(), done, data, nullptr);
              }),
              0);
    ASSERT_TRUE(runUntil([&] {
        return JsonValue::parse(askServer("GET", "/api/v1/received"))["received"].size() == 0;
    }));
    std::vector<int64_t> streams;
    size_t met = 0;
    for (const SeenExchange &seen : exchanges()) {
        met += seen.fault.empty() ? 0 : 1;
        if (seen.request == "GET /api/v1/push" && !seen.fault.empty()) {
            streams.push_back(seen.at);
        }
    }
    EXPECT_EQ(met, rules.size());
    ASSERT_EQ(streams.size(), 3U);
    EXPECT_GE(streams[2] - streams[1], 100) << "a page is no success: the waits grow";
}

TEST_F(Received, aServerThatGoesWhileAFileIsSavedIsWaitedForThenTheRestIsFetched)
{
    start();
    const RecordingApplication application;
    const std::string film = makeFile("film.mp4", 30'000'000);
    share({film});
    ASSERT_TRUE(waitForTokens(application, 1));
    const std::string token = tokens(application)[0];
    // A part as an interrupted download leaves it: the rest is asked for.
    Saved saved;
    ASSERT_EQ(pelliko_shares_download(token.c_str(), 0, downloads().c_str(), onBytes, onSaved,
                                      &saved, nullptr),
              0);
    ASSERT_TRUE(runUntil([&] { return saved.done > 0 || saved.over; }));
    server_->end(SIGKILL);
    if (!saved.over) {
        startServer();
    }
    ASSERT_TRUE(runUntil([&] { return saved.over; }, 60));
    EXPECT_EQ(saved.result, 0);
    ASSERT_EQ(saved.paths.size(), 1U);
    EXPECT_TRUE(contentOf(saved.paths[0]) == contentOf(film));
}

TEST_F(Received, aServerThatStaysAwayIsToldApartAndNothingHalfHasAName)
{
    start();
    const RecordingApplication application;
    share({makeFile("a.jpg", 100)});
    ASSERT_TRUE(waitForTokens(application, 1));
    server_->end(SIGKILL);
    const Saved saved = save(tokens(application)[0]);
    EXPECT_EQ(saved.result, PELLIKO_SHARES_ERROR_UNREACHABLE);
    EXPECT_THAT(saved.paths, IsEmpty());
    EXPECT_EQ(infoOf(tokens(application)[0]).result, 0) << "what is known needs no server";
}
