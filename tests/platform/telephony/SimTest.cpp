// The telephony calls on the real oFono.
#include "Phone.h"

#include <ITapiNetwork.h>
#include <ITapiSim.h>
#include <tapi_common.h>

#include <filesystem>
#include <fstream>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

using testing::ElementsAre;
using testing::IsEmpty;

namespace
{

std::vector<std::string> modemNames()
{
    char **list = tel_get_cp_name_list();
    std::vector<std::string> names;
    for (char **name = list; name && *name; ++name)
        names.emplace_back(*name);
    g_strfreev(list);
    return names;
}

std::string imsiOf(TapiHandle *handle)
{
    TelSimImsiInfo_t imsi{"mcc", "mnc", "msin"};
    const int result = tel_get_sim_imsi(handle, &imsi);
    const std::string parts = std::string(imsi.szMcc) + " " + imsi.szMnc + " " + imsi.szMsin;
    return result == TAPI_API_SUCCESS ? parts : std::to_string(result) + " " + parts;
}

std::string imsiOf(const char *modem)
{
    TapiHandle *handle = tel_init(modem);
    const std::string imsi = handle ? imsiOf(handle) : "no modem";
    if (handle)
        tel_deinit(handle);
    return imsi;
}

/// The data SIM's index; -9 when the call failed and left its output alone.
int dataSim()
{
    auto slot = static_cast<TelNetworkDefaultDataSubs_t>(-1);
    TapiHandle *handle = tel_init(nullptr);
    const int result = tel_get_network_default_data_subscription(handle, &slot);
    if (handle)
        tel_deinit(handle);
    return result == TAPI_API_SUCCESS ? slot : -9;
}

std::string failureThatLeavesTheOutput(int code)
{
    return std::to_string(code) + " mcc mnc msin";
}

class Sim : public testing::Test
{
protected:
    void SetUp() override { ASSERT_EQ(phone::tell("reset"), "ok"); }

    static void insert(const std::string &sim)
    {
        ASSERT_EQ(phone::tell("power 1 off"), "ok");
        ASSERT_EQ(phone::tell("sim 1 " + sim), "ok");
        ASSERT_EQ(phone::tell("power 1 on"), "ok");
    }
};

TEST_F(Sim, EveryModemHasANameAndAHandle)
{
    EXPECT_THAT(modemNames(), ElementsAre("/phonesim1", "/phonesim2"));
    EXPECT_EQ(imsiOf("/phonesim1"), "262 01 1234567890");
    EXPECT_EQ(imsiOf("/phonesim2"), "310 150 123456789");
    EXPECT_EQ(tel_init("/phonesim3"), nullptr);
    EXPECT_EQ(tel_init(""), nullptr);
}

TEST_F(Sim, NullHandlesAreErrors)
{
    TelSimImsiInfo_t imsi{};
    auto slot = TAPI_NETWORK_DEFAULT_DATA_SUBS_SIM2;
    EXPECT_NE(tel_get_sim_imsi(nullptr, &imsi), TAPI_API_SUCCESS);
    EXPECT_NE(tel_get_network_default_data_subscription(nullptr, &slot), TAPI_API_SUCCESS);
    EXPECT_EQ(slot, TAPI_NETWORK_DEFAULT_DATA_SUBS_SIM2);
    EXPECT_NE(tel_deinit(nullptr), TAPI_API_SUCCESS);
    TapiHandle *handle = tel_init(nullptr);
    ASSERT_NE(handle, nullptr);
    EXPECT_NE(tel_get_sim_imsi(handle, nullptr), TAPI_API_SUCCESS);
    EXPECT_NE(tel_get_network_default_data_subscription(handle, nullptr), TAPI_API_SUCCESS);
    EXPECT_EQ(tel_deinit(handle), TAPI_API_SUCCESS);
}

TEST_F(Sim, OfTwoUsableSimsNoneIsKnownToCarryTheData)
{
    EXPECT_EQ(dataSim(), -9);
}

TEST_F(Sim, TheOnlyUsableSimCarriesTheData)
{
    insert("locked");
    EXPECT_EQ(dataSim(), 1);
    ASSERT_EQ(phone::tell("enter-pin 1 1234"), "ok");
    ASSERT_EQ(phone::tell("power 2 off"), "ok");
    EXPECT_EQ(dataSim(), 0);
}

TEST_F(Sim, ALockedSimTellsNothingUntilThePinIsEntered)
{
    insert("locked");
    EXPECT_EQ(imsiOf("/phonesim1"), failureThatLeavesTheOutput(TAPI_API_SIM_LOCKED));
    EXPECT_EQ(imsiOf("/phonesim2"), "310 150 123456789");
    ASSERT_EQ(phone::tell("enter-pin 1 1234"), "ok");
    EXPECT_EQ(imsiOf("/phonesim1"), "262 01 1234567890");
}

TEST_F(Sim, ACardThatCannotBeReadIsAnError)
{
    insert("unreadable");
    EXPECT_EQ(imsiOf("/phonesim1"), failureThatLeavesTheOutput(TAPI_API_OPERATION_FAILED));
}

TEST_F(Sim, BadNumbersAreErrorsAndLongOnesAreCut)
{
    for (const char *imsi : {"26", "310150", "26201abc"}) {
        insert(imsi);
        EXPECT_EQ(imsiOf("/phonesim1"), failureThatLeavesTheOutput(TAPI_API_OPERATION_FAILED))
            << imsi;
    }
    insert("26201123456789012345");
    EXPECT_EQ(imsiOf("/phonesim1"), "262 01 1234567890");
    insert("999011234567890");
    EXPECT_EQ(imsiOf("/phonesim1"), "999 01 1234567890");
}

TEST_F(Sim, AHandleOutlivesTheServiceAndWorksAgain)
{
    TapiHandle *handle = tel_init("/phonesim2");
    ASSERT_NE(handle, nullptr);
    ASSERT_EQ(phone::tell("service kill"), "ok");
    EXPECT_EQ(imsiOf(handle), failureThatLeavesTheOutput(TAPI_API_OPERATION_FAILED));
    EXPECT_THAT(modemNames(), IsEmpty());
    EXPECT_EQ(tel_init(nullptr), nullptr);
    ASSERT_EQ(phone::tell("service start"), "ok");
    EXPECT_EQ(imsiOf(handle), "310 150 123456789");
    tel_deinit(handle);
}

TEST_F(Sim, WithoutAModemTheAccountNamesTheSim)
{
    ASSERT_EQ(phone::tell("service stop"), "ok");
    const std::filesystem::path folder = std::string(g_get_user_config_dir()) + "/pelliko";
    std::filesystem::create_directories(folder);
    std::ofstream(folder / "account.json") << R"({"number":"+4479","imsi":"234159876543210"})";
    EXPECT_THAT(modemNames(), ElementsAre("account"));
    EXPECT_EQ(imsiOf("account"), "234 15 9876543210");
    EXPECT_EQ(dataSim(), 0);
    for (const char *none : {R"({"number":"+4479"})", R"({"imsi":234159876543210})", "{", ""}) {
        std::ofstream(folder / "account.json") << none;
        EXPECT_THAT(modemNames(), IsEmpty()) << none;
    }
    std::ofstream(folder / "account.json") << R"({"imsi":"234159876543210"})";
    ASSERT_EQ(phone::tell("service start"), "ok");
    EXPECT_THAT(modemNames(), ElementsAre("/phonesim1", "/phonesim2"));
    std::filesystem::remove(folder / "account.json");
}

TEST_F(Sim, AMissingCardAndAnEmptyNumber)
{
    ASSERT_EQ(phone::tell("service stop"), "ok");
    phone::OfonoDouble ofono;
    ASSERT_TRUE(ofono.isReady());
    EXPECT_THAT(modemNames(), ElementsAre("/ril_0"));
    ofono.setSim("Present", g_variant_new_boolean(FALSE));
    EXPECT_EQ(imsiOf("/ril_0"), failureThatLeavesTheOutput(TAPI_API_SIM_NOT_FOUND));
    EXPECT_EQ(dataSim(), -9);
    ofono.setSim("Present", g_variant_new_boolean(TRUE));
    ofono.setSim("SubscriberIdentity", g_variant_new_string(""));
    EXPECT_EQ(imsiOf("/ril_0"), failureThatLeavesTheOutput(TAPI_API_OPERATION_FAILED));
    ofono.setSim("SubscriberIdentity", g_variant_new_string("262011234567890"));
    EXPECT_EQ(imsiOf("/ril_0"), "262 011 234567890") << "this SIM's network code has three digits";
}

TEST_F(Sim, OfTwoUsableSimsTheConnectedOneCarriesTheData)
{
    ASSERT_EQ(phone::tell("service stop"), "ok");
    phone::OfonoDouble ofono;
    ASSERT_TRUE(ofono.isReady());
    ofono.addModem("ril_10");
    ofono.addModem("ril_2");
    EXPECT_THAT(modemNames(), ElementsAre("/ril_0", "/ril_2", "/ril_10"));
    EXPECT_EQ(dataSim(), -9);
    ofono.setConnection("/ril_0", false);
    ofono.setConnection("/ril_2", true);
    EXPECT_EQ(dataSim(), 1);
    ofono.setConnection("/ril_0", true);
    EXPECT_EQ(dataSim(), -9) << "two are connected";
}

} // namespace
