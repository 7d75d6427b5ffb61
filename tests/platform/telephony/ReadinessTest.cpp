// The readiness key while modems, SIMs and the modem service come and go.
#include "Phone.h"

#include <vconf.h>

#include <filesystem>
#include <fstream>

#include <gtest/gtest.h>

namespace
{

constexpr const char *kReady = VCONFKEY_TELEPHONY_READY;

std::vector<int> heard;

void listen(keynode_t *node, void *)
{
    heard.push_back(vconf_keynode_get_bool(node));
}

int readyNow()
{
    int value = -1;
    return vconf_get_bool(kReady, &value) == 0 ? value : -1;
}

/// Waits until the last set that was heard of is `value`, and looks whether the modems say the
/// same.
bool becomes(int value)
{
    const bool said = phone::turnUntil([&] { return !heard.empty() && heard.back() == value; });
    heard.clear();
    return said && readyNow() == value;
}

class Readiness : public testing::Test
{
protected:
    void SetUp() override
    {
        ASSERT_EQ(phone::tell("reset"), "ok");
        ASSERT_EQ(readyNow(), 1);
        heard.clear();
        ASSERT_EQ(vconf_notify_key_changed(kReady, listen, nullptr), 0);
    }
    void TearDown() override { vconf_ignore_key_changed(kReady, listen); }

    static void tell(const char *command) { ASSERT_EQ(phone::tell(command), "ok"); }
};

TEST_F(Readiness, TheServiceGoesAndComes)
{
    tell("service kill");
    EXPECT_TRUE(becomes(0));
    tell("service start");
    EXPECT_TRUE(becomes(1));
}

TEST_F(Readiness, OneUsableSimIsEnough)
{
    tell("power 1 off");
    EXPECT_EQ(readyNow(), 1);
    tell("power 2 off");
    EXPECT_TRUE(becomes(0));
    tell("power 1 on");
    EXPECT_TRUE(becomes(1));
}

TEST_F(Readiness, ALockedSimCountsWhenItsPinWasEntered)
{
    tell("power 2 off");
    tell("power 1 off");
    EXPECT_TRUE(becomes(0));
    tell("sim 1 locked");
    tell("power 1 on");
    EXPECT_EQ(readyNow(), 0);
    tell("enter-pin 1 1234");
    EXPECT_TRUE(becomes(1));
}

TEST_F(Readiness, AModemThatClosesItsLineIsGone)
{
    tell("power 2 off");
    tell("drop 1");
    EXPECT_TRUE(becomes(0));
    tell("power 1 on");
    EXPECT_TRUE(becomes(1));
}

TEST_F(Readiness, AValueSetByHandStaysUntilTheModemsChange)
{
    ASSERT_EQ(vconf_set_bool(kReady, 0), 0);
    EXPECT_TRUE(becomes(0));
    tell("power 1 off"); // the other SIM is still there: no change
    EXPECT_EQ(readyNow(), 0);
    tell("power 2 off");
    EXPECT_TRUE(becomes(0));
    ASSERT_EQ(vconf_set_bool(kReady, 1), 0);
    EXPECT_TRUE(becomes(1));
    tell("power 2 on");
    EXPECT_TRUE(becomes(1));
}

TEST_F(Readiness, TheAccountsSimStandsInLive)
{
    const std::filesystem::path folder = std::string(g_get_user_config_dir()) + "/pelliko";
    tell("service stop");
    EXPECT_TRUE(becomes(0));
    std::filesystem::create_directories(folder);
    std::ofstream(folder / "account.json") << R"({"imsi":"234159876543210"})";
    EXPECT_TRUE(becomes(1));
    std::filesystem::remove(folder / "account.json");
    EXPECT_TRUE(becomes(0));
}

TEST_F(Readiness, ACardThatIsTakenOutAndPutBack)
{
    tell("service stop");
    EXPECT_TRUE(becomes(0));
    {
        phone::OfonoDouble ofono;
        ASSERT_TRUE(ofono.isReady());
        EXPECT_TRUE(becomes(1));
        ofono.setSim("Present", g_variant_new_boolean(FALSE));
        EXPECT_TRUE(becomes(0));
        ofono.setSim("Present", g_variant_new_boolean(TRUE));
        EXPECT_TRUE(becomes(1));
    }
    EXPECT_TRUE(becomes(0));
}

} // namespace
