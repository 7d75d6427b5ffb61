// Messages through the real oFono to a network that reads their units.
#include "../messaging/MessageBuilder.h"
#include "Phone.h"

#include <chrono>
#include <future>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

namespace
{

using Clock = std::chrono::steady_clock;

int send(const std::string &to, const std::string &text, int sim = 1)
{
    msg_handle_t handle = nullptr;
    EXPECT_EQ(msg_open_msg_handle(&handle), MSG_SUCCESS);
    const int result = sendOne(handle, to, text, sim);
    msg_close_msg_handle(&handle);
    return result;
}

std::string repeated(const std::string &text, int times)
{
    std::string result;
    for (int i = 0; i < times; ++i)
        result += text + std::to_string(i) + " ";
    return result;
}

class Sms : public testing::Test
{
protected:
    void SetUp() override
    {
        ASSERT_EQ(phone::tell("reset"), "ok");
        phone::forgetMessages();
    }

    static void expectArrives(const std::string &text)
    {
        phone::forgetMessages();
        EXPECT_EQ(send("+4915112345678", text), MSG_SUCCESS);
        const auto messages = phone::messages();
        ASSERT_EQ(messages.size(), 1u) << text;
        EXPECT_EQ(messages[0]["text"], text);
        EXPECT_EQ(messages[0]["to"], "+4915112345678");
        EXPECT_EQ(messages[0]["sim"], 1);
    }

    /// The network never answers; once it has the message `event` happens. The result of the send.
    static int sendInterruptedBy(const std::string &event)
    {
        EXPECT_EQ(phone::tell("silent 1"), "ok");
        auto result = std::async(std::launch::async, [] { return send("+491511", "lost"); });
        EXPECT_EQ(phone::tell("wait-message 1 1"), "ok");
        EXPECT_EQ(phone::tell(event), "ok");
        const auto before = Clock::now();
        EXPECT_EQ(result.wait_for(std::chrono::seconds(20)), std::future_status::ready);
        EXPECT_LT(Clock::now() - before, std::chrono::seconds(10));
        return result.get();
    }
};

TEST_F(Sms, AShortTextArrives)
{
    expectArrives(
        "Files have been shared via Pelliko. http://share.example/s/abcdefghijklmnopqrstuv");
}

TEST_F(Sms, GermanAndExtensionCharactersArrive)
{
    expectArrives("Grüße, Öl & Ärger für 5 € {[~^|\\]} ß @ £ _ §");
}

TEST_F(Sms, OtherAlphabetsArrive)
{
    expectArrives("Файлы 文件 ملفات ☎ ❤ ✈ ☺");
}

TEST_F(Sms, ALongTextArrivesAsOneFromThreeParts)
{
    const std::string text = repeated("Zeile mit Ümläuten und € ", 14);
    ASSERT_GT(text.size(), 320u);
    expectArrives(text);
    EXPECT_EQ(phone::tell("wait-message 1 3"), "ok");
}

TEST_F(Sms, ALongTextOfAnotherAlphabetArrives)
{
    expectArrives(repeated("Файлы ☎ ", 25));
}

// oFono's messages are made of characters of two bytes.
TEST_F(Sms, ACharacterThatOfonoCannotSendIsAFailure)
{
    EXPECT_NE(send("+491511", "all there but one: 😀"), MSG_SUCCESS);
    EXPECT_TRUE(phone::messages().empty());
}

TEST_F(Sms, TheNumberArrivesAsItWasGiven)
{
    for (const char *to : {"+447700900123", "07700900123", "110"}) {
        phone::forgetMessages();
        EXPECT_EQ(send(to, "hello"), MSG_SUCCESS);
        ASSERT_EQ(phone::messages().size(), 1u);
        EXPECT_EQ(phone::messages()[0]["to"], to);
    }
}

TEST_F(Sms, ANumberThatIsNoneIsAFailure)
{
    for (const char *to : {"Anna", "+49 abc", "+", "12345678901234567890123456789"})
        EXPECT_NE(send(to, "hello"), MSG_SUCCESS) << to;
    EXPECT_TRUE(phone::messages().empty());
}

TEST_F(Sms, TheSlotChoosesTheModem)
{
    EXPECT_EQ(send("+491511", "from two", 2), MSG_SUCCESS);
    EXPECT_EQ(send("+491511", "from one", 1), MSG_SUCCESS);
    ASSERT_EQ(phone::messages().size(), 2u);
    EXPECT_EQ(phone::messages()[0]["sim"], 2);
    EXPECT_EQ(phone::messages()[1]["sim"], 1);
    EXPECT_NE(send("+491511", "from three", 3), MSG_SUCCESS);
    EXPECT_NE(send("+491511", "from none", 0), MSG_SUCCESS);
    EXPECT_EQ(phone::messages().size(), 2u);
}

TEST_F(Sms, ATextCutInsideACharacterIsSent)
{
    EXPECT_EQ(send("+491511", "ab\xc3"), MSG_SUCCESS);
    ASSERT_EQ(phone::messages().size(), 1u);
    EXPECT_EQ(phone::messages()[0]["text"], "ab");
}

TEST_F(Sms, ARefusalByTheNetworkIsAFailure)
{
    ASSERT_EQ(phone::tell("refuse 1"), "ok");
    EXPECT_NE(send("+491511", "refused"), MSG_SUCCESS);
    EXPECT_EQ(send("+491511", "by the other network", 2), MSG_SUCCESS);
    ASSERT_EQ(phone::tell("accept 1"), "ok");
    EXPECT_EQ(send("+491511", "taken"), MSG_SUCCESS);
    ASSERT_EQ(phone::messages().size(), 2u);
    EXPECT_EQ(phone::messages()[1]["text"], "taken");
}

TEST_F(Sms, NoUsableSimIsAFailureAndNeverTheOutbox)
{
    ASSERT_EQ(phone::tell("power 1 off"), "ok");
    EXPECT_NE(send("+491511", "modem off"), MSG_SUCCESS);
    ASSERT_EQ(phone::tell("sim 1 locked"), "ok");
    ASSERT_EQ(phone::tell("power 1 on"), "ok");
    EXPECT_NE(send("+491511", "locked"), MSG_SUCCESS);
    EXPECT_TRUE(phone::messages().empty());
    ASSERT_EQ(phone::tell("service stop"), "ok");
    phone::OfonoDouble ofono;
    ASSERT_TRUE(ofono.isReady());
    ofono.setSim("Present", g_variant_new_boolean(FALSE));
    EXPECT_NE(send("+491511", "no SIM"), MSG_SUCCESS);
    EXPECT_TRUE(phone::messages().empty());
}

TEST_F(Sms, WithoutAModemTheOutboxTakesIt)
{
    ASSERT_EQ(phone::tell("service stop"), "ok");
    EXPECT_EQ(send("+491511", "to the file", 2), MSG_SUCCESS);
    ASSERT_EQ(phone::messages().size(), 1u);
    EXPECT_EQ(phone::messages()[0]["sim"], 2);
}

TEST_F(Sms, TheServiceDiesWhileSending)
{
    EXPECT_NE(sendInterruptedBy("service kill"), MSG_SUCCESS);
    EXPECT_TRUE(phone::messages().empty());
}

TEST_F(Sms, AServiceThatHangsIsAFailure)
{
    ASSERT_EQ(phone::tell("service hang"), "ok");
    EXPECT_NE(send("+491511", "lost"), MSG_SUCCESS);
    EXPECT_TRUE(phone::messages().empty());
}

TEST_F(Sms, TheModemIsSwitchedOffWhileSending)
{
    EXPECT_NE(sendInterruptedBy("power 1 off"), MSG_SUCCESS);
}

TEST_F(Sms, TheModemClosesItsLineWhileSending)
{
    EXPECT_NE(sendInterruptedBy("drop 1"), MSG_SUCCESS);
}

TEST_F(Sms, ThreadsSendAtTheSameTimeWithoutAMainLoop)
{
    std::vector<std::future<int>> results;
    for (int i = 0; i < 4; ++i)
        results.push_back(std::async(std::launch::async, [i] {
            return send("+49151" + std::to_string(i), repeated("text ", 60), 1 + i % 2);
        }));
    for (auto &result : results)
        EXPECT_EQ(result.get(), MSG_SUCCESS);
    EXPECT_EQ(phone::messages().size(), 4u);
}

} // namespace
