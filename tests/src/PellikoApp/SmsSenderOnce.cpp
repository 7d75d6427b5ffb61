// Messages that are asked for again because somebody was killed.
#include "PellikoApp/SmsSender.h"
#include "PellikoDatabaseManager/SmsJournal.h"
#include "support/AppWorld.h"
#include "support/LaunchRequest.h"

#include <JsonValue.h>
#include <filesystem>
#include <fstream>
#include <msg.h>
#include <thread>

namespace pelliko::test
{
namespace
{

namespace fs = std::filesystem;

constexpr const char *journal = "/opt/usr/apps/com.velmora.pelliko/data/.pelliko-messages.db";
constexpr const char *key = "one share";

class SmsOnce : public AppWorld
{
protected:
    SmsOnce()
    {
        fs::remove_all(outbox());
        removeJournal();
        job.from_msisdn = "+447700900100";
        job.to_msisdn_list = {"+4479001", "+4479002", "+4479003"};
        job.url = "http://host/s/abc";
        job.file_count = 1;
        job.expired_time = "1777982400";
        job.text_format = "%s %s";
        job.journal_key = key;
    }
    ~SmsOnce() override { removeJournal(); }

    static std::string outbox() { return getenv("PELLIKO_SMS_OUTBOX"); }
    static void removeJournal()
    {
        for (const char *end : {"", "-wal", "-shm"})
            fs::remove_all(std::string(journal) + end);
    }

    // What a process leaves that is killed when it has given the message away, or is about to.
    static void leaveBegun(const std::string &number, const std::string &text)
    {
        ASSERT_TRUE(SmsJournal::open(key)->begin(number, text));
    }

    static std::vector<std::string> toldNumbers()
    {
        std::vector<std::string> numbers;
        for (const JsonValue &message : JsonValue::linesOf(outbox()))
            numbers.push_back(message["to"].text());
        return numbers;
    }

    std::string text() // of the messages of this share
    {
        SmsJob other = job;
        other.journal_key = "another share";
        other.to_msisdn_list = {"+4470"};
        EXPECT_TRUE(_sendSms(other));
        const std::string sent = JsonValue::linesOf(outbox()).back()["text"].text();
        fs::remove(outbox());
        return sent;
    }

    using Numbers = std::vector<std::string>;
    SmsJob job;
};

TEST_F(SmsOnce, AShareThatIsAskedForAgainSendsNothing)
{
    EXPECT_TRUE(_sendSms(job));
    EXPECT_EQ(toldNumbers(), job.to_msisdn_list);
    job.url = "http://host/s/finished-again"; // not the link, the key says which share it is
    EXPECT_TRUE(_sendSms(job));
    EXPECT_EQ(toldNumbers(), job.to_msisdn_list);
    job.journal_key = "another share";
    EXPECT_TRUE(_sendSms(job));
    EXPECT_EQ(toldNumbers().size(), 6u);
}

TEST_F(SmsOnce, ARequestWithoutAKeySendsWheneverItIsMade)
{
    job.journal_key.clear();
    EXPECT_TRUE(_sendSms(job));
    EXPECT_TRUE(_sendSms(job));
    EXPECT_EQ(toldNumbers().size(), 6u);
    EXPECT_FALSE(fs::exists(journal));
}

TEST_F(SmsOnce, OnlyTheKeyOfTheRequestInHandCounts)
{
    LaunchRequest with;
    with.text("sms_key", "k");
    app_control_clone(&ad->app_control, with);
    _getSmsData(with, ad);
    EXPECT_EQ(makeSmsJob(ad).journal_key, "k");
    EXPECT_NE(makeSmsJob(ad).request, nullptr);
    _getSmsData(LaunchRequest(), ad);
    EXPECT_EQ(makeSmsJob(ad).journal_key, "");
    EXPECT_EQ(makeSmsJob(ad).request, nullptr);
}

TEST_F(SmsOnce, WhatWasInterruptedBeforeItWasSentIsSent)
{
    leaveBegun("+4479002", "a text in another language");
    EXPECT_TRUE(_sendSms(job));
    EXPECT_EQ(toldNumbers(), job.to_msisdn_list);
}

TEST_F(SmsOnce, WhatWasSentBeforeTheInterruptionIsNotSentAgain)
{
    const std::string sent = text();
    SmsJob first = job;
    first.journal_key.clear();
    first.to_msisdn_list = {"+4479001"};
    _sendSms(first);
    leaveBegun("+4479001", sent);
    job.text_format = "in another language by now: %s %s";
    EXPECT_TRUE(_sendSms(job));
    EXPECT_EQ(toldNumbers(), job.to_msisdn_list);
    EXPECT_TRUE(log.has("This message was sent before the interruption"));
}

TEST_F(SmsOnce, WhatNobodyKnowsTheFateOfIsNotSentAgainAndTheLogSaysSo)
{
    leaveBegun("+4479001", "text");
    fs::create_directory(outbox()); // it cannot be asked
    EXPECT_TRUE(_sendSms(job));
    EXPECT_TRUE(log.has("This message was interrupted, nobody knows whether it was sent; it is not "
                        "sent again"));
    fs::remove(outbox());
    EXPECT_TRUE(_sendSms(job));
    EXPECT_FALSE(fs::exists(outbox())) << "the others were refused, which is an end, too";
}

TEST_F(SmsOnce, WithoutAPlaceForTheJournalNothingIsSentAndItMustBeAskedAgain)
{
    fs::create_directory(journal);
    EXPECT_FALSE(_sendSms(job));
    EXPECT_FALSE(fs::exists(outbox()));
    fs::remove(journal);
    EXPECT_TRUE(_sendSms(job));
    EXPECT_EQ(toldNumbers(), job.to_msisdn_list);
}

TEST_F(SmsOnce, ABrokenJournalIsBegunAnew)
{
    std::ofstream(journal) << std::string(5000, 'x');
    EXPECT_TRUE(_sendSms(job));
    EXPECT_EQ(toldNumbers(), job.to_msisdn_list);
    EXPECT_TRUE(_sendSms(job));
    EXPECT_EQ(toldNumbers().size(), 3u);
}

TEST_F(SmsOnce, TwoWorkersForTheSameShareDoNotBothSend)
{
    std::vector<std::thread> workers;
    for (int i = 0; i < 3; ++i)
        workers.emplace_back([this] { EXPECT_TRUE(_sendSms(job)); });
    for (std::thread &worker : workers)
        worker.join();
    EXPECT_EQ(toldNumbers(), job.to_msisdn_list);
}

} // namespace
} // namespace pelliko::test
