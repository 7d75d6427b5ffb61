// Telephony and messages of the platform, over ModemManager.
#include <gmock/gmock.h>

#include "ITapiNetwork.h"
#include "ITapiSim.h"
#include "ModemManagerDouble.h"
#include "Modems.h"
#include "tapi_common.h"

namespace
{

using modem_testing::Attempt;
using modem_testing::ModemManagerDouble;
using pelliko::modem::sendThroughModem;

constexpr unsigned pin = 2;

std::vector<std::string> modemNames()
{
    std::vector<std::string> result;
    char **names = tel_get_cp_name_list();
    for (char **name = names; name && *name; ++name)
        result.emplace_back(*name);
    g_strfreev(names);
    return result;
}

// "mcc mnc msin", or "error" when the SIM has none to give.
std::string imsiOf(const std::string &modem)
{
    TapiHandle *handle = tel_init(modem.c_str());
    TelSimImsiInfo_t imsi{};
    const int result = tel_get_sim_imsi(handle, &imsi);
    tel_deinit(handle);
    if (result != TAPI_API_SUCCESS)
        return "error";
    return std::string(imsi.szMcc) + " " + imsi.szMnc + " " + imsi.szMsin;
}

} // namespace

TEST(TelephonyOverModemManager, NamesTheModemsBySlot)
{
    EXPECT_TRUE(modemNames().empty());
    ModemManagerDouble service;
    const auto second = service.addModem(2);
    const auto first = service.addModem(1);
    EXPECT_EQ(modemNames(), (std::vector{first, second}));
}

TEST(TelephonyOverModemManager, SplitsTheNumberAsTheOperatorDoes)
{
    ModemManagerDouble service;
    EXPECT_EQ(imsiOf(service.addModem(1, "262011234567890", "26201")), "262 01 1234567890");
    EXPECT_EQ(imsiOf(service.addModem(2, "310410123456789", "310410")), "310 410 123456789");
    EXPECT_EQ(imsiOf(service.addModem(3, "999991234567890", "99999")), "999 99 1234567890");
}

TEST(TelephonyOverModemManager, HasNoNumberWhereTheSimHasNone)
{
    ModemManagerDouble service;
    EXPECT_EQ(imsiOf(service.addModem(1, "26", "")), "error");
    EXPECT_EQ(imsiOf(service.addModem(2, "", "")), "error");
    EXPECT_EQ(imsiOf(service.addModem(3, "26201x2345", "26201")), "error");
    const auto locked = service.addModem(4);
    service.lock(locked, pin);
    EXPECT_EQ(imsiOf(locked), "error");
    const auto empty = service.addModem(5);
    service.takeSim(empty);
    EXPECT_EQ(imsiOf(empty), "error");
}

TEST(TelephonyOverModemManager, TellsTheDataSim)
{
    ModemManagerDouble service;
    const auto first = service.addModem(1);
    const auto second = service.addModem(2);
    TapiHandle *handle = tel_init(first.c_str());
    TelNetworkDefaultDataSubs_t slot = TAPI_NETWORK_DEFAULT_DATA_SUBS_UNKNOWN;
    EXPECT_NE(tel_get_network_default_data_subscription(handle, &slot), TAPI_API_SUCCESS);
    service.connect(second);
    EXPECT_EQ(tel_get_network_default_data_subscription(handle, &slot), TAPI_API_SUCCESS);
    EXPECT_EQ(slot, TAPI_NETWORK_DEFAULT_DATA_SUBS_SIM2);
    tel_deinit(handle);
}

TEST(ModemsOverModemManager, TakeMessages)
{
    EXPECT_EQ(sendThroughModem(0, "+4915112345678", "Hello"), std::nullopt);
    ModemManagerDouble service;
    EXPECT_EQ(sendThroughModem(0, "+4915112345678", "Hello"), std::nullopt);
    const auto modem = service.addModem(1);
    EXPECT_EQ(sendThroughModem(0, "+4915112345678", "Hello"), "");
    EXPECT_EQ(service.attempts(), (std::vector<Attempt>{{modem, "+4915112345678", "Hello"}}));
    service.setSending("refuse");
    EXPECT_EQ(sendThroughModem(0, "+4915112345678", "Hello"),
              "cannot send the message: Network timeout");
}
