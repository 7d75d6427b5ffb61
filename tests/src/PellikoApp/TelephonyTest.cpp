#include "PellikoApp/Telephony.h"
#include "PellikoApp/CountryCodes.h"
#include "support/AppWorld.h"

#include <filesystem>
#include <fstream>
#include <glib.h>
#include <gmock/gmock.h>
#include <kor_account.h>
#include <sstream>
#include <tapi_common.h>
#include <vconf-keys.h>

namespace pelliko::test
{
namespace
{

namespace fs = std::filesystem;
using ::testing::Contains;
using ::testing::ElementsAre;
using ::testing::IsEmpty;
using ::testing::StartsWith;

using Row = std::pair<std::string, std::string>;

// The rows of one table in the list beside this file.
std::vector<Row> listed(const std::string &table)
{
    std::ifstream list(PELLIKO_SOURCE_DIR "/tests/src/PellikoApp/country-codes.tsv");
    std::vector<Row> rows;
    for (std::string line; std::getline(list, line);) {
        std::istringstream words(line);
        std::string name, from, to;
        words >> name >> from >> to;
        if (name == table)
            rows.emplace_back(from, to);
    }
    return rows;
}

TEST(CountryCodes, MobileCodesAreThoseOfTheListInItsOrder)
{
    std::vector<Row> rows;
    for (const MobileCountry &row : mobileCountries())
        rows.emplace_back(row.mcc, row.country);
    EXPECT_EQ(rows.size(), 230u);
    EXPECT_EQ(rows, listed("mobile"));
}

TEST(CountryCodes, CallingCodesAreThoseOfTheListInItsOrder)
{
    std::vector<Row> rows;
    for (const CallingCode &row : callingCodes())
        rows.emplace_back(row.country, row.code);
    EXPECT_EQ(rows.size(), 224u);
    EXPECT_EQ(rows, listed("calling"));
}

TEST(CountryCodes, EveryListedCodeIsFound)
{
    for (const auto &[mcc, country] : listed("mobile"))
        EXPECT_STREQ(countryOfMobileCode(mcc.c_str()), country.c_str()) << mcc;
    for (const auto &[country, code] : listed("calling"))
        EXPECT_STREQ(callingCodeOfCountry(country.c_str()), code.c_str()) << country;
}

TEST(CountryCodes, EveryCountryOfASimCanBeCalled)
{
    for (const MobileCountry &row : mobileCountries())
        EXPECT_NE(callingCodeOfCountry(row.country), nullptr) << row.country;
}

TEST(CountryCodes, OnlyWholeCodesAreFound)
{
    for (const char *mcc : {"", "31", "3100", "001", "999", "abc"})
        EXPECT_EQ(countryOfMobileCode(mcc), nullptr) << mcc;
    for (const char *country : {"", "U", "us", "USA", "XX"})
        EXPECT_EQ(callingCodeOfCountry(country), nullptr) << country;
    EXPECT_EQ(countryOfMobileCode(nullptr), nullptr);
    EXPECT_EQ(callingCodeOfCountry(nullptr), nullptr);
}

// No modem service runs here: the account's SIM stands in, when there is one.
class Telephony : public AppWorld
{
protected:
    Telephony() { removeSim(); }
    ~Telephony() override
    {
        vconf_ignore_key_changed(VCONFKEY_TELEPHONY_READY, _telReadyCb);
        vconf_ignore_key_changed(VCONFKEY_TELEPHONY_READY, heard);
        for (TapiHandle *&handle : ad->tapi_handle) {
            tel_deinit(handle);
            handle = nullptr;
        }
        g_strfreev(ad->cp_name_list);
        ad->cp_name_list = nullptr;
        removeSim();
    }

    static void insertSim(const std::string &imsi)
    {
        const fs::path file = korrin::defaultAccountFile();
        fs::create_directories(file.parent_path());
        std::ofstream(file) << R"({"server":"http://h","number":"+49","token":"t","imsi":")" << imsi
                            << "\"}";
        lookAtModems();
    }
    static void removeSim()
    {
        fs::remove(korrin::defaultAccountFile());
        lookAtModems();
    }

    // A reader of the key sets it when the modems say something new; after that it is the test's.
    static void lookAtModems()
    {
        int ready = 0;
        vconf_get_bool(VCONFKEY_TELEPHONY_READY, &ready);
    }

    // Sets the readiness and waits until everybody who listens has heard of it.
    void setReady(int ready)
    {
        heardCount = 0;
        vconf_notify_key_changed(VCONFKEY_TELEPHONY_READY, heard, nullptr);
        ASSERT_EQ(vconf_set_bool(VCONFKEY_TELEPHONY_READY, ready), 0);
        ASSERT_TRUE(loop.runUntil([] { return heardCount > 0; }));
        loop.settle();
    }

    // The code that a SIM gives.
    std::string cccOf(const std::string &imsi)
    {
        insertSim(imsi);
        g_free(ad->sender_ccc);
        ad->sender_ccc = nullptr;
        _initializeTelephony(ad);
        log.restart();
        EXPECT_EQ(_getCcc(ad, 0), 0);
        return ad->sender_ccc ? ad->sender_ccc : "(null)";
    }

    static void heard(keynode_t *, void *) { ++heardCount; }
    static inline int heardCount = 0;
};

TEST_F(Telephony, SimTellsTheCountryCode)
{
    EXPECT_EQ(cccOf("310150123456789"), "1");
    EXPECT_EQ(cccOf("450051234567890"), "82");
    EXPECT_EQ(cccOf("262011234567890"), "49");
    EXPECT_EQ(cccOf("234150000900100"), "44");
    EXPECT_EQ(cccOf("348170000000001"), "1");
    EXPECT_THAT(log.messages(), IsEmpty());
}

TEST_F(Telephony, SimOfAnUnknownCountryIsNoFailure)
{
    EXPECT_EQ(cccOf("999011234567890"), "(null)");
    EXPECT_THAT(log.messages(), ElementsAre("account_country_code is NULL !!"));
}

TEST_F(Telephony, CountryCodeIsFoundOnce)
{
    ASSERT_EQ(cccOf("310150123456789"), "1");
    insertSim("262011234567890");
    const char *before = ad->sender_ccc;
    EXPECT_EQ(_getCcc(ad, 0), 0);
    EXPECT_EQ(ad->sender_ccc, before);
    EXPECT_STREQ(ad->sender_ccc, "1");
    EXPECT_THAT(log.messages(), ElementsAre("sender_ccc already exist !!"));
}

TEST_F(Telephony, SlotsThatNoPhoneHasAreRefused)
{
    const std::string refusal = "[ERROR][(index < 0 || index >= TAPI_HANDLE_MAX)] Return value : "
                                "-1, message : invalid index = ";
    ad->sender_ccc = g_strdup("44"); // comes second
    EXPECT_EQ(_getCcc(ad, 2), -1);
    EXPECT_EQ(_getCcc(ad, -1), -1);
    EXPECT_THAT(log.messages(), ElementsAre(refusal + "2", refusal + "-1"));
}

TEST_F(Telephony, NothingIsDoneWithoutARecord)
{
    _initializeTelephony(nullptr);
    EXPECT_EQ(_getCcc(nullptr, 0), -1);
    _telReadyCb(nullptr, nullptr);
    EXPECT_THAT(log.messages(),
                ElementsAre("[ERROR][(ad == NULL)] Return message : Data is NULL",
                            "[ERROR][(ad == NULL)] Return value : -1, message : Data is NULL",
                            StartsWith("[ERROR][(ad == NULL)] Return message : data is NULL.")));
}

TEST_F(Telephony, NumberThatIsNoneIsAnErrorOfTheSim)
{
    insertSim("262011234567890");
    _initializeTelephony(ad);
    for (const char *imsi : {"26", "26a011234567890", "2"}) {
        insertSim(imsi);
        log.restart();
        EXPECT_EQ(_getCcc(ad, 0), -1) << imsi;
        EXPECT_THAT(log.messages(),
                    ElementsAre(StartsWith("tel_get_sim_imsi error (SIM might be missing)= -")));
        EXPECT_EQ(ad->sender_ccc, nullptr);
    }
}

TEST_F(Telephony, SlotWithoutAModemHasNoCode)
{
    insertSim("262011234567890");
    _initializeTelephony(ad);
    ASSERT_NE(ad->tapi_handle[0], nullptr);
    EXPECT_EQ(_getCcc(ad, 1), -1);
    EXPECT_THAT(log.messages(), ElementsAre("[ERROR][(handle == NULL)] Return value : -1, message "
                                            ": Tapi handle is NULL"));
}

TEST_F(Telephony, HandlesThatAreOpenStay)
{
    insertSim("262011234567890");
    _initializeTelephony(ad);
    TapiHandle *first = ad->tapi_handle[0];
    ASSERT_NE(first, nullptr);
    EXPECT_EQ(ad->tapi_handle[1], nullptr);
    _initializeTelephony(ad);
    EXPECT_EQ(ad->tapi_handle[0], first);
    EXPECT_THAT(log.messages(), ElementsAre("0 tapi_handle is already initialized."));
}

TEST_F(Telephony, MachineWithoutAModemHasNoHandles)
{
    _initializeTelephony(ad);
    EXPECT_EQ(ad->tapi_handle[0], nullptr);
    EXPECT_EQ(ad->cp_name_list, nullptr);
    EXPECT_THAT(log.messages(), ElementsAre("Dual-sim - Could not get the cp_name_list"));
}

TEST_F(Telephony, AccountThatCannotBeReadIsNoSim)
{
    fs::create_directories(korrin::defaultAccountFile());
    startTelephony(ad);
    EXPECT_THAT(log.messages(), ElementsAre("tapi_ready_state isn't yet ready !!"));
}

TEST_F(Telephony, MoreModemsThanTheRecordHoldsAreLeftOut)
{
    insertSim("262011234567890");
    ad->cp_name_list = g_strsplit("account,nobody,account,account,account", ",", 0);
    _initializeTelephony(ad);
    EXPECT_NE(ad->tapi_handle[0], nullptr);
    EXPECT_EQ(ad->tapi_handle[1], nullptr);
    EXPECT_NE(ad->tapi_handle[2], nullptr);
    EXPECT_EQ(ad->tapi_handle[3], nullptr);
}

TEST_F(Telephony, ReadyPhoneIsReadAtTheStartAndNotWatched)
{
    insertSim("262011234567890");
    setReady(1);
    ad->sim_index = 7;
    log.restart();
    startTelephony(ad);
    EXPECT_THAT(log.messages(), ElementsAre("SIM index = 0"));
    EXPECT_EQ(ad->sim_index, 0);
    EXPECT_STREQ(ad->sender_ccc, "49");
    const TapiHandle *handle = ad->tapi_handle[0];
    setReady(0);
    EXPECT_EQ(ad->tapi_handle[0], handle);
    EXPECT_THAT(log.messages(), ElementsAre("SIM index = 0"));
}

TEST_F(Telephony, ReadyPhoneWhoseDataSimIsUnknownIsReadAtSlot0)
{
    setReady(1);
    ad->sim_index = 7;
    log.restart();
    startTelephony(ad);
    EXPECT_THAT(
        log.messages(),
        ElementsAre("Dual-sim - Could not get the cp_name_list",
                    StartsWith("tel_get_network_default_data_subscription is failed, err_code is "
                               "-"),
                    "[ERROR][(handle == NULL)] Return value : -1, message : Tapi handle is NULL",
                    "_getCcc() failed !! ret = -1"));
    EXPECT_EQ(ad->sim_index, 0);
}

TEST_F(Telephony, PhoneThatBecomesReadyLaterKeepsItsSimIndex)
{
    insertSim("262011234567890");
    setReady(0);
    log.restart();
    startTelephony(ad);
    EXPECT_THAT(log.messages(), ElementsAre("tapi_ready_state isn't yet ready !!"));
    EXPECT_EQ(ad->sim_index, 0);
    EXPECT_EQ(ad->tapi_handle[0], nullptr);
    ad->sim_index = 7;
    log.restart();
    setReady(1);
    EXPECT_THAT(log.messages(), ElementsAre("tel status[1]", "index = 0"));
    EXPECT_EQ(ad->sim_index, 7);
    EXPECT_STREQ(ad->sender_ccc, "49");
}

TEST_F(Telephony, PhoneThatIsNoLongerReadyLosesItsHandlesUntilItIsReadyAgain)
{
    insertSim("262011234567890");
    setReady(0);
    startTelephony(ad);
    setReady(1);
    ASSERT_NE(ad->tapi_handle[0], nullptr);
    log.restart();
    setReady(0);
    EXPECT_THAT(log.messages(), ElementsAre("tel status[0]"));
    for (const TapiHandle *handle : ad->tapi_handle)
        EXPECT_EQ(handle, nullptr);
    EXPECT_EQ(ad->cp_name_list, nullptr);
    EXPECT_STREQ(ad->sender_ccc, "49");
    log.restart();
    setReady(1);
    EXPECT_NE(ad->tapi_handle[0], nullptr);
    EXPECT_NE(ad->cp_name_list, nullptr);
    EXPECT_THAT(log.messages(),
                ElementsAre("tel status[1]", "index = 0", "sender_ccc already exist !!"));
}

TEST_F(Telephony, FailuresWhenThePhoneBecomesReadyAreLoggedOnly)
{
    setReady(0);
    startTelephony(ad);
    log.restart();
    setReady(1);
    EXPECT_THAT(log.messages(),
                Contains(StartsWith("tel_get_network_default_data_subscription is failed, "
                                    "err_code is -")));
    EXPECT_EQ(log.messages().back(), "_getCcc() failed !! ret = -1");
    EXPECT_EQ(ad->sender_ccc, nullptr);
}

} // namespace
} // namespace pelliko::test
