#include "PellikoApp/SmsSender.h"
#include "PellikoApp/Workers.h"
#include "PellikoUploadManager/UsagePreferences.h"
#include "support/AppWorld.h"
#include "support/Catalogue.h"
#include "support/UsageRecords.h"

#include <JsonValue.h>
#include <app_control.h>
#include <app_preference.h>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <msg.h>

namespace pelliko::test
{
namespace
{

constexpr const char *textId =
    "IDS_RSH_BODY_FILES_HAVE_BEEN_SHARED_VIA_PELLIKO_C_NP1SS_HEXPIRES_C_P2SS_ABB";
constexpr const char *sendSms = "PK09 [Pelliko_Send_SMS notification]";
constexpr const char *may5 = "1777982400"; // 2026-05-05 12:00 UTC

class SmsSender : public AppWorld
{
protected:
    SmsSender() : texts_({{textId, "Shared: %1$s until %2$s"}})
    {
        setenv("TZ", "UTC", 1);
        tzset();
        std::filesystem::remove_all(outbox());
        app_control_create(&request);
    }
    ~SmsSender() override { app_control_destroy(request); }

    static std::string outbox() { return getenv("PELLIKO_SMS_OUTBOX"); }

    static std::vector<JsonValue> sent() { return JsonValue::linesOf(outbox()); }

    void text(const char *key, const char *value)
    {
        ASSERT_EQ(app_control_add_extra_data(request, key, value), APP_CONTROL_ERROR_NONE);
    }

    void recipients(std::vector<const char *> numbers)
    {
        ASSERT_EQ(app_control_add_extra_data_array(request, "to_msisdn", numbers.data(),
                                                   static_cast<int>(numbers.size())),
                  APP_CONTROL_ERROR_NONE);
    }

    void fullRequest(std::vector<const char *> numbers)
    {
        text("url", "http://host/s/abc");
        text("from_msisdn", "+447700900100");
        text("expired_time", may5);
        text("req_id", "7");
        text("file_count", "2");
        recipients(std::move(numbers));
        _getSmsData(request, ad);
    }

    std::vector<std::string> numbersKept() const
    {
        std::vector<std::string> all;
        for (const Eina_List *l = ad->to_msisdn_list; l; l = eina_list_next(l))
            all.emplace_back(static_cast<const char *>(eina_list_data_get(l)));
        return all;
    }

    app_control_h request = nullptr;
    const UsageRecords usage;

private:
    Catalogue texts_;
};

TEST_F(SmsSender, ReadsTheRequestIntoTheRecord)
{
    fullRequest({"+4479001", "+4479002"});
    EXPECT_STREQ(ad->url, "http://host/s/abc");
    EXPECT_STREQ(ad->from_msisdn, "+447700900100");
    EXPECT_STREQ(ad->expired_time, may5);
    EXPECT_STREQ(ad->req_id, "7");
    EXPECT_EQ(ad->file_count, 2);
    EXPECT_EQ(ad->to_msisdn_count, 2);
    EXPECT_EQ(numbersKept(), (std::vector<std::string>{"+4479001", "+4479002"}));
    EXPECT_EQ(log.text(), "sms to msisdn array len = 2, ret = 0 \n");
}

TEST_F(SmsSender, AMissingKeyKeepsTheValueOfTheRequestBefore)
{
    fullRequest({"+4479001"});
    app_control_h second = nullptr;
    app_control_create(&second);
    app_control_add_extra_data(second, "url", "http://host/s/new");
    _getSmsData(second, ad);
    app_control_destroy(second);
    EXPECT_STREQ(ad->url, "http://host/s/new");
    EXPECT_STREQ(ad->req_id, "7");
    EXPECT_EQ(ad->file_count, 2);
}

TEST_F(SmsSender, ARequestWithoutRecipientsKeepsThoseOfTheRequestBefore)
{
    fullRequest({"+4479001", "+4479002"});
    app_control_h second = nullptr;
    app_control_create(&second);
    log.restart();
    _getSmsData(second, ad);
    app_control_destroy(second);
    EXPECT_EQ(numbersKept(), (std::vector<std::string>{"+4479001", "+4479002"}));
    EXPECT_EQ(ad->to_msisdn_count, 2);
    EXPECT_TRUE(log.has("There is no receiver msisdn!")) << log.text();
}

TEST_F(SmsSender, ALaterRequestReplacesTheRecipients)
{
    fullRequest({"+4479001", "+4479002"});
    fullRequest({"+4479003"});
    EXPECT_EQ(numbersKept(), (std::vector<std::string>{"+4479003"}));
    EXPECT_EQ(ad->to_msisdn_count, 1);
}

TEST_F(SmsSender, ThreeRecipientsGetThreeMessagesWithTheSameText)
{
    fullRequest({"+4479001", "+4479002", "+4479003"});
    log.restart();
    _sendSms(makeSmsJob(ad));
    const auto messages = sent();
    ASSERT_EQ(messages.size(), 3u);
    for (size_t i = 0; i < messages.size(); ++i) {
        EXPECT_EQ(messages[i]["to"], "+447900" + std::to_string(i + 1));
        EXPECT_EQ(messages[i]["text"], "Shared: http://host/s/abc until 2026/05/05");
        EXPECT_EQ(messages[i]["sim"], 1);
    }
    EXPECT_EQ(log.text(), "expired_time=1777982400\n"
                          "to_msisdn_count=3\n"
                          "SIM index = 0\n"
                          "SIM index = 0\n"
                          "SIM index = 0\n" +
                              usageLine(sendSms));
    EXPECT_EQ(usage.features(), std::vector<std::string>{"PK09"});
}

TEST_F(SmsSender, TheSecondSimSendsFromTheSecondSlot)
{
    fullRequest({"+4479001"});
    ad->sim_index = 1;
    _sendSms(makeSmsJob(ad));
    ASSERT_EQ(sent().size(), 1u);
    EXPECT_EQ(sent()[0]["sim"], 2);
    EXPECT_TRUE(log.has("SIM index = 1"));
}

TEST_F(SmsSender, AnExpiryInMillisecondsIsCutToItsSeconds)
{
    fullRequest({"+4479001"});
    SmsJob job = makeSmsJob(ad);
    job.expired_time = "1777982400123";
    _sendSms(job);
    ASSERT_EQ(sent().size(), 1u);
    EXPECT_EQ(sent()[0]["text"], "Shared: http://host/s/abc until 2026/05/05");
}

TEST_F(SmsSender, ARequestWithoutExpirySendsWithoutADate)
{
    fullRequest({"+4479001"});
    SmsJob job = makeSmsJob(ad);
    job.expired_time.reset();
    _sendSms(job);
    ASSERT_EQ(sent().size(), 1u);
    EXPECT_EQ(sent()[0]["text"], "Shared: http://host/s/abc until ");
    EXPECT_TRUE(log.has("expired_time=(null)"));
}

TEST_F(SmsSender, ALongTextIsCutBetweenCharacters)
{
    fullRequest({"+4479001"});
    SmsJob job = makeSmsJob(ad);
    job.text_format = "%s%s";
    std::string url = "a";
    while (url.size() < 300)
        url += "ä";
    job.url = url;
    _sendSms(job);
    ASSERT_EQ(sent().size(), 1u);
    EXPECT_EQ(sent()[0]["text"], url.substr(0, 255));
    job.url = "ab" + url.substr(1);
    _sendSms(job);
    ASSERT_EQ(sent().size(), 2u);
    EXPECT_EQ(sent()[1]["text"], job.url->substr(0, 254));
}

TEST_F(SmsSender, WithoutWhatIsNeededNothingIsSent)
{
    fullRequest({"+4479001"});
    const SmsJob whole = makeSmsJob(ad);
    std::vector<SmsJob> jobs(4, whole);
    jobs[0].from_msisdn.reset();
    jobs[1].to_msisdn_list.clear();
    jobs[2].url.reset();
    jobs[3].file_count = 0;
    for (const SmsJob &job : jobs) {
        log.restart();
        _sendSms(job);
        EXPECT_EQ(log.text(), "Fail:Invalid Input Parameter\n");
    }
    EXPECT_TRUE(sent().empty());
    EXPECT_TRUE(usage.features().empty());
}

TEST_F(SmsSender, ANegativeFileCountMakesAnEmptyText)
{
    fullRequest({"+4479001"});
    SmsJob job = makeSmsJob(ad);
    job.file_count = -1;
    log.restart();
    _sendSms(job);
    EXPECT_EQ(log.text(), "expired_time=1777982400\n"
                          "invalid file_count -1\n"
                          "to_msisdn_count=1\n"
                          "SIM index = 0\n" +
                              usageLine(sendSms));
    ASSERT_EQ(sent().size(), 1u);
    EXPECT_EQ(sent()[0]["text"], "");
}

TEST_F(SmsSender, OneRefusedMessageDoesNotStopTheOthers)
{
    fullRequest({"+4479001", "+4479002"});
    SmsJob job = makeSmsJob(ad);
    job.to_msisdn_list = {"", "+4479002"};
    log.restart();
    _sendSms(job);
    ASSERT_EQ(sent().size(), 1u);
    EXPECT_EQ(sent()[0]["to"], "+4479002");
    EXPECT_TRUE(log.has("msg_sms_send_message Failed")) << log.text();
}

TEST_F(SmsSender, AFailedSendGoesOnWithTheNext)
{
    fullRequest({"+4479001", "+4479002", "+4479003"});
    std::filesystem::create_directory(outbox()); // nothing can be written to it
    log.restart();
    _sendSms(makeSmsJob(ad));
    EXPECT_EQ(log.text(), "expired_time=1777982400\n"
                          "to_msisdn_count=3\n"
                          "SIM index = 0\n"
                          "msg_sms_send_message Failed\n"
                          "SIM index = 0\n"
                          "msg_sms_send_message Failed\n"
                          "SIM index = 0\n"
                          "msg_sms_send_message Failed\n" +
                              usageLine(sendSms));
    EXPECT_EQ(usage.features(), std::vector<std::string>{"PK09"});
}

TEST_F(SmsSender, TheMessagesAreDoneEvenWhenEverySendFailed)
{
    fullRequest({"+4479001"});
    std::filesystem::create_directory(outbox());
    preference_set_int(shareSmsDoneKey, 0);
    log.restart();
    runSmsJob(makeSmsJob(ad));
    ASSERT_TRUE(loop.runUntil([this] { return log.has("req_id = 7"); }));
    EXPECT_TRUE(log.has("msg_sms_send_message Failed")) << log.text();
    int done = 0;
    ASSERT_EQ(preference_get_int(shareSmsDoneKey, &done), PREFERENCE_ERROR_NONE);
    EXPECT_EQ(done, 1);
}

TEST_F(SmsSender, ARequestWithNothingSendsWhatTheRequestBeforeBrought)
{
    fullRequest({"+4479001", "+4479002"});
    app_control_h empty = nullptr;
    app_control_create(&empty);
    _getSmsData(empty, ad);
    app_control_destroy(empty);
    _sendSms(makeSmsJob(ad));
    ASSERT_EQ(sent().size(), 2u);
    for (const auto &message : sent())
        EXPECT_EQ(message["text"], "Shared: http://host/s/abc until 2026/05/05");
}

TEST_F(SmsSender, AWorkerKeepsItsDataWhenTheNextRequestArrives)
{
    fullRequest({"+4479001"});
    const SmsJob first = makeSmsJob(ad);
    app_control_h second = nullptr;
    app_control_create(&second);
    app_control_add_extra_data(second, "url", "http://host/s/second");
    const char *numbers[] = {"+4479009"};
    app_control_add_extra_data_array(second, "to_msisdn", numbers, 1);
    _getSmsData(second, ad);
    app_control_destroy(second);
    _sendSms(first);
    ASSERT_EQ(sent().size(), 1u);
    EXPECT_EQ(sent()[0]["to"], "+4479001");
    EXPECT_EQ(sent()[0]["text"], "Shared: http://host/s/abc until 2026/05/05");
}

TEST_F(SmsSender, TheWorkerAnnouncesThatTheMessagesAreDone)
{
    fullRequest({"+4479001", "+4479002"});
    log.restart();
    ASSERT_TRUE(startDetachedWorker([job = makeSmsJob(ad)] { runSmsJob(job); }));
    ASSERT_TRUE(loop.runUntil(
        [this] { return log.has("No upload_data request id exist so app is exiting"); }));
    ASSERT_TRUE(waitForWorkers(std::chrono::seconds(20)));
    EXPECT_EQ(sent().size(), 2u);
    // The worker and the loop write at the same time; each keeps its own order.
    std::string worker;
    std::string onLoop;
    for (const std::string &line : log.messages())
        (line.starts_with("req_id") || line.starts_with("No upload") ? onLoop : worker) +=
            line + "\n";
    EXPECT_EQ(worker, "expired_time=1777982400\n"
                      "to_msisdn_count=2\n"
                      "SIM index = 0\n"
                      "SIM index = 0\n" +
                          usageLine(sendSms) + "Updating preference for sms_done with value = 1\n");
    EXPECT_EQ(onLoop, "req_id = 7\n"
                      "No upload_data request id exist so app is exiting\n");
}

TEST_F(SmsSender, TheMessagesAreDoneEvenWhenNothingCouldBeSent)
{
    log.restart();
    runSmsJob(SmsJob{});
    ASSERT_TRUE(loop.runUntil([this] { return log.has("req_id = 0"); }));
    EXPECT_TRUE(log.has("Fail:Invalid Input Parameter"));
    EXPECT_TRUE(log.has("Updating preference for sms_done with value = 1"));
}

} // namespace
} // namespace pelliko::test
