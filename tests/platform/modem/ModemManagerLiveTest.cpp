// Changes of ModemManager's modems, heard on the main loop.
#include <gmock/gmock.h>

#include "ModemManagerDouble.h"
#include "ModemManagerService.h"
#include "ModemWatch.h"
#include "Modems.h"

namespace
{

using modem_testing::ModemManagerDouble;
using modem_testing::waitUntil;
using pelliko::modem::ModemList;
using pelliko::modem::ModemManagerService;
using pelliko::modem::ModemWatch;

constexpr unsigned unlocked = 1, pin = 2;

class ModemManagerChange : public testing::Test
{
protected:
    ModemManagerChange()
    {
        listener_.listen([this] { ++heard_; });
    }

    // Whether a change is heard after `action`.
    template <typename Action> bool isHeard(const Action &action)
    {
        heard_ = 0;
        action();
        return waitUntil([&] { return heard_ > 0; });
    }

    ModemManagerDouble service_;
    ModemManagerService listener_;
    int heard_ = 0;
};

} // namespace

TEST_F(ModemManagerChange, IsHeardWhenAModemComesAndGoes)
{
    std::string modem;
    EXPECT_TRUE(isHeard([&] { modem = service_.addModem(1); }));
    EXPECT_TRUE(isHeard([&] { service_.removeModem(modem); }));
}

TEST_F(ModemManagerChange, IsHeardOfTheSim)
{
    const auto modem = service_.addModem(1);
    EXPECT_TRUE(isHeard([&] { service_.takeSim(modem); }));
    EXPECT_TRUE(isHeard([&] { service_.insertSim(modem, "", ""); }));
    EXPECT_TRUE(isHeard([&] { service_.readSim(modem, "262011234567890", "26201"); }));
    EXPECT_TRUE(isHeard([&] { service_.lock(modem, pin); }));
    EXPECT_TRUE(isHeard([&] { service_.lock(modem, unlocked); }));
    EXPECT_TRUE(isHeard([&] { service_.connect(modem); }));
}

TEST_F(ModemManagerChange, OfTheSignalIsNoneThatMatters)
{
    const auto modem = service_.addModem(1);
    EXPECT_TRUE(waitUntil([&] { return heard_ == 1; }));
    service_.setSignal(modem, 20);
    service_.setSignal(modem, 30);
    service_.lock(modem, pin);
    EXPECT_TRUE(waitUntil([&] { return heard_ > 1; }));
    EXPECT_EQ(heard_, 2);
}

TEST_F(ModemManagerChange, IsNotToldToOneThatIsGone)
{
    int told = 0;
    {
        ModemManagerService gone;
        gone.listen([&] { ++told; });
    }
    EXPECT_TRUE(isHeard([&] { service_.addModem(1); }));
    EXPECT_EQ(told, 0);
}

TEST(ModemWatch, FollowsAModemManagerThatComesAndGoes)
{
    std::vector<size_t> counts;
    ModemList last;
    const ModemWatch watch([&](const ModemList &list) { last = list; });
    {
        ModemManagerDouble service;
        const auto modem = service.addModem(1);
        EXPECT_TRUE(waitUntil([&] { return anySimReady(last); }));
        service.lock(modem, pin);
        EXPECT_TRUE(waitUntil([&] { return !anySimReady(last); }));
        EXPECT_EQ(last.modems.size(), 1U);
        service.lock(modem, unlocked);
        EXPECT_TRUE(waitUntil([&] { return anySimReady(last); }));
    }
    EXPECT_TRUE(waitUntil([&] { return last.modems.empty(); }));
}
