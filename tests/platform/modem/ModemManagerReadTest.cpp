// What is read of ModemManager's modems and SIMs.
#include <chrono>

#include <gmock/gmock.h>

#include "ModemManagerDouble.h"
#include "ModemManagerService.h"

namespace
{

using namespace std::chrono_literals;
using modem_testing::ModemManagerDouble;
using pelliko::modem::ModemList;
using pelliko::modem::ModemManagerService;
using pelliko::modem::SimState;
using testing::HasSubstr;

constexpr unsigned unlocked = 1, pin = 2, pin2 = 3, puk = 4, networkPin = 9, lockUnknown = 0;
constexpr int failed = -1, starting = 1;
constexpr unsigned simMissing = 2, simError = 3;

ModemList read()
{
    return ModemManagerService().read().value_or(ModemList{{}, -1, "not on the bus"});
}

std::vector<std::string> imsis(const ModemList &list)
{
    std::vector<std::string> result;
    for (const auto &modem : list.modems)
        result.push_back(modem.imsi);
    return result;
}

SimState onlySim()
{
    const ModemList list = read();
    EXPECT_EQ(list.modems.size(), 1U);
    return list.modems.empty() ? SimState::Unknown : list.modems.front().sim;
}

} // namespace

TEST(ModemManager, IsNotThereWhenNobodyHasItsName)
{
    EXPECT_FALSE(ModemManagerService().read().has_value());
}

TEST(ModemManager, HasNoModemWhenNoneIsPluggedIn)
{
    const ModemManagerDouble service;
    const ModemList list = read();
    EXPECT_TRUE(list.modems.empty());
    EXPECT_EQ(list.dataModem, -1);
    EXPECT_EQ(list.error, "");
}

TEST(ModemManager, TellsTheSimOfTheOnlyModem)
{
    ModemManagerDouble service;
    const std::string path = service.addModem(1, "262011234567890", "26201");
    const ModemList list = read();
    ASSERT_EQ(list.modems.size(), 1U);
    EXPECT_EQ(list.modems[0].name, path);
    EXPECT_EQ(list.modems[0].sim, SimState::Ready);
    EXPECT_EQ(list.modems[0].imsi, "262011234567890");
    EXPECT_EQ(list.modems[0].mncLength, 2);
    EXPECT_EQ(list.dataModem, 0);
}

TEST(ModemManager, TakesTheLengthOfTheNetworkCodeFromTheOperator)
{
    ModemManagerDouble service;
    service.addModem(1, "310410123456789", "310410");
    service.addModem(2, "262011234567890", "");
    service.addModem(3, "262011234567890", "31041");
    service.addModem(4, "262011234567890", "2620112");
    std::vector<int> lengths;
    for (const auto &modem : read().modems)
        lengths.push_back(modem.mncLength);
    EXPECT_EQ(lengths, (std::vector{3, 0, 0, 0}));
}

TEST(ModemManager, PutsSlotsInTheirOrder)
{
    ModemManagerDouble service;
    service.addModem(2, "262020000000002", "26202");
    service.addModem(1, "262010000000001", "26201");
    EXPECT_EQ(imsis(read()), (std::vector<std::string>{"262010000000001", "262020000000002"}));
}

TEST(ModemManager, KeepsThePlaceOfAModemThatWasReset)
{
    ModemManagerDouble service;
    const auto first = service.addModem(0, "262010000000001", "26201", "/sys/devices/usb1");
    service.addModem(0, "262020000000002", "26202", "/sys/devices/usb2");
    const auto before = imsis(read());
    service.removeModem(first);
    const auto again = service.addModem(0, "262010000000001", "26201", "/sys/devices/usb1");
    ASSERT_NE(again, first);
    EXPECT_EQ(imsis(read()), before);
}

TEST(ModemManager, OrdersModemsOfOneDeviceByNumberNotByText)
{
    ModemManagerDouble service;
    std::vector<std::string> added;
    for (int i = 10; i < 22; ++i) {
        added.push_back("2620100000000" + std::to_string(i));
        service.addModem(1, added.back());
    }
    EXPECT_EQ(imsis(read()), added);
}

TEST(ModemManager, SaysThatTheSimIsMissing)
{
    ModemManagerDouble service;
    const auto modem = service.addModem(1);
    service.takeSim(modem);
    EXPECT_EQ(onlySim(), SimState::Missing);
    service.insertSim(modem, "310410123456789", "310410");
    EXPECT_EQ(onlySim(), SimState::Ready);
    EXPECT_EQ(imsis(read()), std::vector<std::string>{"310410123456789"});
}

TEST(ModemManager, SaysThatTheSimIsLocked)
{
    ModemManagerDouble service;
    const auto modem = service.addModem(1);
    for (const unsigned lock : {pin, puk, networkPin}) {
        service.lock(modem, lock);
        EXPECT_EQ(onlySim(), SimState::Locked) << lock;
    }
    service.lock(modem, pin2);
    EXPECT_EQ(onlySim(), SimState::Ready) << "the second PIN guards nothing that is used";
    service.lock(modem, lockUnknown);
    EXPECT_EQ(onlySim(), SimState::Unknown);
    service.lock(modem, unlocked);
    EXPECT_EQ(onlySim(), SimState::Ready);
}

TEST(ModemManager, TellsAModemThatFailedFromOneThatStarts)
{
    ModemManagerDouble service;
    const auto modem = service.addModem(1);
    service.setState(modem, failed, simError);
    EXPECT_EQ(onlySim(), SimState::Locked);
    service.setState(modem, failed, simMissing);
    EXPECT_EQ(onlySim(), SimState::Missing);
    service.setState(modem, failed, 1);
    EXPECT_EQ(onlySim(), SimState::Unknown);
    service.takeSim(modem);
    service.setState(modem, starting);
    EXPECT_EQ(onlySim(), SimState::Unknown) << "it has not looked for a SIM yet";
}

TEST(ModemManager, DoesNotCallASimReadyThatHasNotToldItsNumber)
{
    ModemManagerDouble service;
    const auto modem = service.addModem(1, "", "");
    EXPECT_EQ(onlySim(), SimState::Unknown);
    service.readSim(modem, "440101234567890", "44010");
    EXPECT_EQ(onlySim(), SimState::Ready);
}

TEST(ModemManager, PassesOnWhateverTheSimTells)
{
    ModemManagerDouble service;
    service.addModem(1, "26", "");
    service.addModem(2, "999991234567890", "99999");
    service.addModem(3, "2620112345678901234567890", "26201");
    service.addModem(4, "not a number", "262");
    EXPECT_EQ(imsis(read()),
              (std::vector<std::string>{"26", "999991234567890", "2620112345678901234567890",
                                        "not a number"}));
}

TEST(ModemManager, FindsTheModemThatCarriesData)
{
    ModemManagerDouble service;
    const auto first = service.addModem(1);
    const auto second = service.addModem(2);
    EXPECT_EQ(read().dataModem, -1) << "either of two may";
    service.connect(second);
    EXPECT_EQ(read().dataModem, 1);
    service.connect(first);
    EXPECT_EQ(read().dataModem, -1) << "both do";
    service.connect(first, false);
    service.connect(second, false);
    service.takeSim(first);
    EXPECT_EQ(read().dataModem, 1) << "only one could";
    service.removeModem(second);
    EXPECT_EQ(read().dataModem, 0) << "there is no other";
}

TEST(ModemManager, ThatDoesNotAnswerIsAnErrorInTime)
{
    ModemManagerDouble service;
    service.addModem(1);
    service.freeze();
    const auto list = ModemManagerService(300ms).read();
    service.wake();
    ASSERT_TRUE(list.has_value());
    EXPECT_TRUE(list->modems.empty());
    EXPECT_THAT(list->error, HasSubstr("did not answer in time"));
}

TEST(ModemManager, IsGoneWhenItDied)
{
    ModemManagerDouble service;
    service.addModem(1);
    service.kill();
    EXPECT_FALSE(ModemManagerService().read().has_value());
}
