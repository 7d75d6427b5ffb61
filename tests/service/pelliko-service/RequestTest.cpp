#include "Request.h"

#include "Fakes.h"

#include <JsonValue.h>
#include <gmock/gmock.h>

using namespace pelliko::service;
using pelliko::test::JsonValue;
using testing::ElementsAre;

namespace
{
constexpr const char *shareRecord =
    R"({"share":"S","state":"uploading","files":[{"index":0,"upload":"/u/1","offset":0}]})";
constexpr const char *finishedRecord = R"({"url":"http://s/T","expires":9000000,"sms":["+442"]})";

struct OneRequest : testing::Test {
    Hands hands;
    std::vector<RequestReport> reports;
    std::unique_ptr<Request> request;

    void begin(const QueuedRequest &record, bool fromEarlierRun = false)
    {
        request = std::make_unique<Request>(
            hands.context, record, fromEarlierRun,
            [this](const RequestReport &report) { reports.push_back(report); });
        request->start();
    }
    std::vector<int> statuses() const
    {
        std::vector<int> result;
        for (const RequestReport &report : reports) {
            result.push_back(static_cast<int>(report.status));
        }
        return result;
    }
    void upload(const std::string &length)
    {
        hands.http.answer(204, "", {{"upload-offset", length}});
    }
    /** Answers the question that comes before the finish. */
    void sayWhoHasJoined(const std::string &numbers = "")
    {
        ASSERT_EQ(hands.http.oldest().url, "http://server/api/v1/joined");
        hands.http.answer(200, R"({"joined":[)" + numbers + "]}");
    }
    void toTheQuestion(const std::vector<Recipient> &recipients)
    {
        begin(hands.queued("0123456789", false, recipients));
        hands.http.answer(201, shareRecord);
        upload("10");
    }
    std::vector<std::string> numbersIn(const char *member) const
    {
        const auto entries = JsonValue::parse(hands.http.oldest().body)[member];
        std::vector<std::string> numbers;
        for (size_t i = 0; i < entries.size(); ++i) {
            const auto entry = entries[i];
            numbers.push_back(entry.contains("number") ? entry["number"].text() : entry.text());
        }
        return numbers;
    }
    std::vector<Recipient> kept() { return hands.queue.find(request->record().id)->recipients; }
};
} // namespace

TEST_F(OneRequest, goesFromCreatingToTheEndInOrder)
{
    begin(hands.queued("0123456789"));
    EXPECT_EQ(hands.http.oldest().method, "POST");
    EXPECT_EQ(hands.http.oldest().url, "http://server/api/v1/shares");
    hands.http.answer(201, shareRecord);
    EXPECT_EQ(hands.http.oldest().method, "PATCH");
    EXPECT_EQ(hands.http.oldest().url, "http://server/u/1");
    upload("10");
    hands.timers.pass(200);
    sayWhoHasJoined();
    EXPECT_EQ(hands.http.oldest().url, "http://server/api/v1/shares/S/finish");
    hands.http.answer(200, finishedRecord);
    EXPECT_EQ(reports.back().status, Status::finished);
    EXPECT_TRUE(hands.launcher.launches.empty()) << "finished is told before the launch";
    hands.timers.pass(0);
    ASSERT_EQ(hands.launcher.launches.size(), 1U);
    EXPECT_EQ(hands.launcher.launches[0].url, "http://s/T");
    EXPECT_FALSE(request->ended());
    hands.launcher.answer(LaunchResult::received);
    EXPECT_EQ(reports.back().status, Status::shareFinished);
    EXPECT_EQ(reports.back().expires, 9000000);
    EXPECT_EQ(hands.queue.find(request->record().id)->endStatus, 7);
}

TEST_F(OneRequest, aFirstFailureIsNoPauseASecondIs)
{
    begin(hands.queued("0123456789"));
    hands.http.refuseConnection();
    EXPECT_THAT(statuses(), ElementsAre());
    hands.timers.pass(2000);
    hands.http.refuseConnection();
    EXPECT_THAT(statuses(), ElementsAre(6));
    hands.timers.pass(4000);
    hands.http.refuseConnection();
    EXPECT_THAT(statuses(), ElementsAre(6)) << "one pause is told once";
    EXPECT_EQ(hands.timers.next(), 8000);
}

TEST_F(OneRequest, repeatsCreatingWithTheSameKey)
{
    begin(hands.queued("0123456789"));
    const auto first = hands.http.oldest().headers;
    hands.http.refuseConnection();
    hands.timers.pass(2000);
    EXPECT_EQ(hands.http.oldest().headers, first);
}

TEST_F(OneRequest, givesUpWhenTheServerStaysAway)
{
    begin(hands.queued("0123456789"));
    while (!request->ended()) {
        hands.http.refuseConnection();
        hands.timers.pass(std::max<int64_t>(hands.timers.next(), 0));
    }
    EXPECT_EQ(reports.back().error, -7);
    EXPECT_GE(hands.timers.steadyMs(), hands.settings.giveUpMs);
}

TEST_F(OneRequest, withoutANetworkItWaitsForTheNetworkAlone)
{
    hands.gate.network = false;
    begin(hands.queued("0123456789"));
    EXPECT_THAT(statuses(), ElementsAre(6));
    EXPECT_EQ(hands.timers.next(), -1) << "nothing polls";
    EXPECT_EQ(hands.http.count, 0U);
    hands.gate.network = true;
    request->networkChanged();
    EXPECT_EQ(hands.http.open.size(), 1U);
}

TEST_F(OneRequest, aWishToBeLeftAloneOutlastsTheNetwork)
{
    begin(hands.queued("0123456789"));
    hands.http.answer(503, "<html>", {{"retry-after", "600"}});
    EXPECT_THAT(statuses(), ElementsAre(6)) << "so long a wait is told";
    hands.gate.network = false;
    request->networkChanged();
    hands.gate.network = true;
    request->networkChanged();
    EXPECT_TRUE(hands.http.open.empty());
    hands.timers.pass(599'999);
    EXPECT_TRUE(hands.http.open.empty());
    hands.timers.pass(1);
    EXPECT_EQ(hands.http.oldest().method, "POST");
}

TEST_F(OneRequest, aRefusalEndsItAndLeavesNothingToWithdraw)
{
    begin(hands.queued("0123456789"));
    hands.http.answer(429, R"({"error":"daily_limit","message":"x"})");
    EXPECT_EQ(reports.back().error, -16);
    EXPECT_TRUE(hands.queue.withdrawals().empty());
}

TEST_F(OneRequest, aCancelWhileTheShareIsMadeIsWithdrawnLater)
{
    begin(hands.queued("0123456789"));
    request->cancel();
    EXPECT_EQ(reports.back().status, Status::cancelled);
    EXPECT_TRUE(hands.http.open.empty());
    EXPECT_THAT(hands.queue.withdrawals(), ElementsAre(request->record().id));
    request->cancel();
    EXPECT_EQ(reports.size(), 1U) << "it ends once";
}

TEST_F(OneRequest, anOffsetThatDisagreesIsAskedForAndTheRestIsSentFromThere)
{
    begin(hands.queued("0123456789"));
    hands.http.answer(201, shareRecord);
    hands.http.answer(409, R"({"error":"conflict","message":"x"})");
    EXPECT_EQ(hands.http.oldest().method, "HEAD");
    hands.http.answer(200, "", {{"upload-offset", "4"}});
    EXPECT_EQ(hands.http.oldest().method, "PATCH");
    EXPECT_EQ(hands.http.oldest().range.offset, 4);
    EXPECT_EQ(hands.http.oldest().range.length, 6);
}

TEST_F(OneRequest, largeFilesGoInChunks)
{
    hands.settings.chunkBytes = 4;
    begin(hands.queued("0123456789"));
    hands.http.answer(201, shareRecord);
    EXPECT_EQ(hands.http.oldest().range.length, 4);
    upload("4");
    EXPECT_EQ(hands.http.oldest().range.offset, 4);
    upload("8");
    EXPECT_EQ(hands.http.oldest().range.length, 2);
}

TEST_F(OneRequest, whereTheWayIsFastAppendsBecomeLonger)
{
    constexpr int64_t mib = 1024 * 1024;
    QueuedRequest record = hands.queued("");
    std::filesystem::resize_file(record.files[0].path, 300 * mib);
    stampOf(record.files[0].path, record.files[0].stamp);
    begin(record);
    hands.http.answer(201, shareRecord);
    EXPECT_EQ(hands.http.oldest().range.length, 8 * mib);
    hands.timers.pass(100);
    upload(std::to_string(8 * mib));
    EXPECT_EQ(hands.http.oldest().range.length, 32 * mib);
    hands.timers.pass(300);
    upload(std::to_string(40 * mib));
    EXPECT_EQ(hands.http.oldest().range.length, 32 * mib) << "that took long enough";
    hands.timers.pass(5'000);
    upload(std::to_string(72 * mib));
    EXPECT_EQ(hands.http.oldest().range.length, 8 * mib);
}

TEST_F(OneRequest, anOffsetThatDoesNotGrowIsNoProgress)
{
    begin(hands.queued("0123456789"));
    hands.http.answer(201, shareRecord);
    upload("0");
    EXPECT_TRUE(hands.http.open.empty()) << "it waits instead of going round";
    EXPECT_GT(hands.timers.next(), 0);
}

TEST_F(OneRequest, aFileThatChangesDuringAChunkIsADeviceError)
{
    begin(hands.queued("0123456789"));
    hands.http.answer(201, shareRecord);
    std::filesystem::resize_file(hands.folder.file("photo.jpg"), 3);
    upload("10");
    EXPECT_EQ(reports.back().error, -5);
    EXPECT_THAT(hands.queue.withdrawals(), ElementsAre(request->record().id));
}

TEST_F(OneRequest, afterARestartItAsksTheServerWhereItStands)
{
    QueuedRequest record = hands.queued("0123456789");
    hands.queue.setShare(record.id, "S");
    begin(*hands.queue.find(record.id), true);
    EXPECT_EQ(hands.http.oldest().method, "GET");
    hands.http.answer(
        200, R"({"share":"S","state":"uploading","files":[{"upload":"/u/1","offset":6}]})");
    EXPECT_EQ(hands.http.oldest().range.offset, 6);
}

TEST_F(OneRequest, afterAPauseThePercentIsToldAgain)
{
    hands.settings.chunkBytes = 4;
    QueuedRequest record = hands.queued("0123456789", true);
    begin(record);
    hands.http.answer(201, shareRecord);
    upload("4");
    hands.timers.pass(200);
    hands.gate.metered = true;
    request->networkChanged();
    hands.gate.metered = false;
    request->networkChanged();
    hands.http.answer(
        200, R"({"share":"S","state":"uploading","files":[{"upload":"/u/1","offset":4}]})");
    EXPECT_THAT(statuses(), ElementsAre(1, 2, 2, 6));
    hands.timers.pass(200);
    upload("8");
    EXPECT_EQ(reports.back().status, Status::progressing);
    EXPECT_EQ(reports.back().percent, 80);
}

TEST_F(OneRequest, withoutRecipientsForAnSmsItEndsAfterFinishing)
{
    begin(hands.queued("0123456789"));
    hands.http.answer(201, shareRecord);
    upload("10");
    sayWhoHasJoined();
    hands.http.answer(200, R"({"url":"http://s/T","expires":9000000,"sms":[]})");
    EXPECT_EQ(reports.back().status, Status::shareFinished);
    EXPECT_TRUE(hands.launcher.launches.empty());
}

TEST_F(OneRequest, aPersonWrittenInThreeWaysIsToldOnce)
{
    begin(hands.queued("0123456789", false,
                       {{"44", "07700 900111", 1},
                        {"", "+49 (0)151 12345678", 2},
                        {"44", "00447700900111", 3},
                        {"44", "+44 7700 900111", 4}}));
    EXPECT_THAT(numbersIn("recipients"), ElementsAre("+447700900111", "+4915112345678"));
    EXPECT_EQ(kept()[2].number, "00447700900111") << "what the client gave stays";
    EXPECT_EQ(kept()[2].e164, "+447700900111");
    hands.http.answer(201, shareRecord);
    upload("10");
    EXPECT_THAT(numbersIn("numbers"), ElementsAre("+447700900111", "+4915112345678"));
    sayWhoHasJoined(R"("+447700900111")");
    EXPECT_EQ(kept()[0].joined, Joined::yes);
    EXPECT_EQ(kept()[1].joined, Joined::no);
    EXPECT_EQ(kept()[2].joined, Joined::yes) << "they are one person";
}

TEST_F(OneRequest, withoutACountryCodeTheOwnNumberGivesTheCountry)
{
    begin(hands.queued("0123456789", false, {{"", "07700 900111", 1}}));
    EXPECT_THAT(numbersIn("recipients"), ElementsAre("+447700900111"));
}

TEST_F(OneRequest, whoCannotBeReachedIsLeftOutAndTheOthersGetTheirs)
{
    begin(hands.queued("0123456789", false,
                       {{"44", "999", 1}, {"44", "07700 900111", 2}, {"44", "Anna", 3}}));
    EXPECT_THAT(numbersIn("recipients"), ElementsAre("+447700900111"));
    EXPECT_EQ(kept()[0].fault, "too_short");
    EXPECT_EQ(kept()[1].fault, "");
    EXPECT_EQ(kept()[2].fault, "not_a_number");
}

TEST_F(OneRequest, withNobodyToReachItEndsWithoutAskingTheServer)
{
    begin(hands.queued("0123456789", false, {{"44", "999", 1}, {"44", "Anna", 2}}));
    EXPECT_THAT(statuses(), ElementsAre(4));
    EXPECT_EQ(reports.back().error, -5);
    EXPECT_EQ(hands.http.count, 0U);
    EXPECT_TRUE(hands.queue.withdrawals().empty());
}

TEST_F(OneRequest, aQuestionWithoutAnAnswerDoesNotStopTheShare)
{
    const std::vector<std::function<void()>> failures{
        [this] { hands.http.answer(429, R"({"error":"numbers_limit","message":"x"})"); },
        [this] { hands.http.answer(404, R"({"error":"not_found","message":"x"})"); },
        [this] { hands.http.answer(200, "<html>"); },
        [this] { hands.http.answer(200, R"({"joined":[1]})"); },
        [this] { hands.http.refuseConnection(); },
        [this] { hands.timers.pass(10'000); }};
    for (const auto &fail : failures) {
        toTheQuestion({{"44", "+447700900111", 7}});
        fail();
        ASSERT_FALSE(hands.http.open.empty());
        EXPECT_EQ(hands.http.oldest().url, "http://server/api/v1/shares/S/finish");
        EXPECT_EQ(hands.http.open.size(), 1U) << "nothing goes on beside it";
        EXPECT_EQ(kept()[0].joined, Joined::unknown);
        hands.http.answer(200, finishedRecord);
        EXPECT_EQ(reports.back().status, Status::finished);
        request.reset();
    }
}

TEST_F(OneRequest, whatIsKnownIsNotAskedAgain)
{
    toTheQuestion({{"44", "+447700900111", 7}});
    sayWhoHasJoined(R"("+447700900111")");
    hands.http.refuseConnection();
    const QueuedRequest record = *hands.queue.find(request->record().id);
    request.reset();
    begin(record, true);
    hands.http.answer(
        200, R"({"share":"S","state":"uploading","files":[{"upload":"/u/1","offset":10}]})");
    EXPECT_EQ(hands.http.oldest().url, "http://server/api/v1/shares/S/finish");
}

TEST_F(OneRequest, aCancelDuringTheQuestionEndsBoth)
{
    toTheQuestion({{"44", "+447700900111", 7}});
    request->cancel();
    EXPECT_TRUE(hands.http.open.empty());
    hands.timers.pass(20'000);
    EXPECT_EQ(reports.back().status, Status::cancelled);
    EXPECT_TRUE(hands.http.open.empty());
}

TEST_F(OneRequest, manyNumbersAreAskedInBatches)
{
    std::vector<std::string> numbers;
    for (int i = 1000; i < 1250; ++i) {
        numbers.push_back("+44770090" + std::to_string(i));
    }
    JoinedQuestion question(hands.http, hands.timers, *hands.account);
    std::optional<JoinedFindings> findings;
    question.ask(numbers, [&](const JoinedFindings &found) { findings = found; });
    EXPECT_EQ(numbersIn("numbers").size(), 100U);
    sayWhoHasJoined(R"("+447700901000")");
    sayWhoHasJoined();
    EXPECT_EQ(numbersIn("numbers").size(), 50U);
    EXPECT_FALSE(findings);
    hands.http.answer(429, R"({"error":"numbers_limit"})", {{"retry-after", "77"}});
    ASSERT_TRUE(findings);
    EXPECT_EQ(findings->asked.size(), 200U);
    EXPECT_THAT(findings->joined, ElementsAre("+447700901000"));
    EXPECT_TRUE(findings->refused);
    EXPECT_EQ(findings->waitSeconds, 77);
}
