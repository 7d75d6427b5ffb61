// Messages through ModemManager: the result says what became of them.
#include <chrono>
#include <thread>

#include <gmock/gmock.h>

#include "ModemManagerDouble.h"
#include "ModemManagerService.h"
#include "msg_fate.h"

namespace
{

using namespace std::chrono_literals;
using modem_testing::Attempt;
using modem_testing::ModemManagerDouble;
using pelliko::modem::ModemManagerService;
using testing::HasSubstr;
using testing::IsEmpty;

constexpr const char *number = "+4915112345678";
constexpr unsigned pin = 2;

std::string send(int slot, const std::string &text = "Hello", const std::string &to = number)
{
    return ModemManagerService().sendSms(slot, to, text);
}

} // namespace

TEST(ModemManagerSms, ReachesTheNetworkWithEveryCharacter)
{
    ModemManagerDouble service;
    const auto modem = service.addModem(1);
    const std::string text = "Grüße [€] für 2 Dateien 🎉 → http://share/s/x";
    EXPECT_EQ(send(0, text), "");
    EXPECT_EQ(service.attempts(), (std::vector<Attempt>{{modem, number, text}}));
}

TEST(ModemManagerSms, GoesThroughTheModemOfItsSlot)
{
    ModemManagerDouble service;
    const auto second = service.addModem(2);
    const auto first = service.addModem(1);
    EXPECT_EQ(send(1, "through the second"), "");
    EXPECT_EQ(send(0, "through the first"), "");
    EXPECT_EQ(service.attempts(), (std::vector<Attempt>{{second, number, "through the second"},
                                                        {first, number, "through the first"}}));
}

TEST(ModemManagerSms, IsHandedOverWholeHoweverLong)
{
    ModemManagerDouble service;
    service.addModem(1);
    const std::string text(2000, 'x');
    EXPECT_EQ(send(0, text), "");
    ASSERT_EQ(service.attempts().size(), 1U);
    EXPECT_EQ(service.attempts()[0].text, text);
}

TEST(ModemManagerSms, LeavesNothingInTheModemsStore)
{
    ModemManagerDouble service;
    const auto modem = service.addModem(1);
    EXPECT_EQ(send(0), "");
    EXPECT_EQ(service.attempts().size(), 1U);
    EXPECT_EQ(service.stored(modem), 0U);
    service.setSending("refuse");
    EXPECT_NE(send(0), "");
    EXPECT_EQ(service.stored(modem), 0U);
}

TEST(ModemManagerSms, NeedsNoMainLoop)
{
    ModemManagerDouble service;
    service.addModem(1);
    std::string result = "not tried";
    // The loop of this thread stands still all the while.
    std::thread([&] { result = send(0, "from a worker"); }).join();
    EXPECT_EQ(result, "");
    EXPECT_EQ(service.attempts().size(), 1U);
}

TEST(ModemManagerSms, OfSeveralThreadsAllArrive)
{
    ModemManagerDouble service;
    service.addModem(1);
    ModemManagerService sender;
    std::vector<std::string> results(6, "not tried");
    {
        std::vector<std::jthread> threads;
        for (size_t i = 0; i < results.size(); ++i)
            threads.emplace_back([&, i] { results[i] = sender.sendSms(0, number, "x"); });
    }
    EXPECT_EQ(results, std::vector<std::string>(6, ""));
    EXPECT_EQ(service.attempts().size(), 6U);
}

TEST(ModemManagerSms, RefusedByTheNetworkFailsWithItsReason)
{
    ModemManagerDouble service;
    service.addModem(1);
    service.setSending("refuse");
    EXPECT_EQ(send(0), "cannot send the message: Network timeout");
    EXPECT_EQ(service.attempts().size(), 1U);
}

TEST(ModemManagerSms, ThatTheModemCannotStoreFails)
{
    ModemManagerDouble service;
    service.addModem(1);
    service.setSending("refuse-create");
    EXPECT_EQ(send(0), "cannot make the message: Memory full");
    EXPECT_THAT(service.attempts(), IsEmpty());
}

TEST(ModemManagerSms, FailsWhenTheServiceDiesWhileSending)
{
    ModemManagerDouble service;
    service.addModem(1);
    service.setSending("die");
    EXPECT_EQ(send(0), "cannot send the message: the modem service went away");
    EXPECT_FALSE(ModemManagerService().read().has_value());
}

TEST(ModemManagerSms, FailsInTimeWhenNoAnswerComes)
{
    ModemManagerDouble service;
    service.addModem(1);
    service.setSending("silent");
    const auto start = std::chrono::steady_clock::now();
    EXPECT_EQ(ModemManagerService(5s, 4s).sendSms(0, number, "Hello"),
              "cannot send the message: the modem service did not answer in time");
    EXPECT_LT(std::chrono::steady_clock::now() - start, 30s);
    EXPECT_EQ(service.attempts().size(), 1U);
}

TEST(ModemManagerSms, FailsInTimeWhenTheServiceStandsStill)
{
    ModemManagerDouble service;
    service.addModem(1);
    service.freeze();
    const std::string result = ModemManagerService(5s, 300ms).sendSms(0, number, "Hello");
    service.wake();
    EXPECT_THAT(result, HasSubstr("did not answer in time"));
    EXPECT_THAT(service.attempts(), IsEmpty());
}

TEST(ModemManagerSms, WaitsForASlowNetwork)
{
    ModemManagerDouble service;
    service.addModem(1);
    service.setSending("silent");
    std::string result = "not tried";
    std::thread sender([&] { result = send(0); });
    EXPECT_TRUE(modem_testing::waitUntil([&] { return service.attempts().size() == 1; }));
    service.setSending("succeed"); // which also answers what was left open
    sender.join();
    EXPECT_EQ(result, "");
}

TEST(ModemManagerSms, NeedsASlotWithAModem)
{
    EXPECT_EQ(send(0), "the modem service is not running");
    ModemManagerDouble service;
    EXPECT_EQ(send(0), "there is no modem for SIM slot 1");
    service.addModem(1);
    EXPECT_EQ(send(1), "there is no modem for SIM slot 2");
    EXPECT_EQ(send(-1), "there is no modem for SIM slot 0");
    EXPECT_THAT(service.attempts(), IsEmpty());
}

TEST(ModemManagerSms, NeedsASimThatCanBeUsed)
{
    ModemManagerDouble service;
    const auto modem = service.addModem(1);
    service.lock(modem, pin);
    EXPECT_EQ(send(0), "the SIM is locked");
    service.takeSim(modem);
    EXPECT_EQ(send(0), "there is no SIM in the modem");
    service.setState(modem, 0);
    EXPECT_EQ(send(0), "the modem is not ready");
    EXPECT_THAT(service.attempts(), IsEmpty());
}

TEST(ModemManagerSms, LosesOnlyTheCharacterInWhichItsTextWasCut)
{
    ModemManagerDouble service;
    service.addModem(1);
    EXPECT_EQ(send(0, "until 2026 \xF0\x9F\x8E"), "");
    EXPECT_EQ(send(0, "a\xFFz"), "");
    ASSERT_EQ(service.attempts().size(), 2U);
    EXPECT_EQ(service.attempts()[0].text, "until 2026 ");
    EXPECT_EQ(service.attempts()[1].text, "a\xEF\xBF\xBDz");
}

TEST(ModemManagerSms, GoesToANumberOnly)
{
    ModemManagerDouble service;
    service.addModem(1);
    EXPECT_EQ(send(0, "Hello", ""), "the number cannot be a phone number");
    EXPECT_EQ(send(0, "Hello", "+49\xFF"), "the number cannot be a phone number");
    EXPECT_THAT(service.attempts(), IsEmpty());
}

TEST(ModemManagerSms, HasNoKnownFateWhenItsSenderDied)
{
    msg_handle_t handle = nullptr;
    ASSERT_EQ(msg_open_msg_handle(&handle), MSG_SUCCESS);
    ModemManagerDouble service;
    EXPECT_EQ(msg_sms_fate(handle, number, "text"), MSG_FATE_NOT_TAKEN) << "there is no modem yet";
    service.addModem(1);
    EXPECT_EQ(msg_sms_fate(handle, number, "text"), MSG_FATE_UNKNOWN);
    msg_close_msg_handle(&handle);
}
