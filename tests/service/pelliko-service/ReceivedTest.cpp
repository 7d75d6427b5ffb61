// What others share arrives, over every restart on its way.
#include "ReceivedScene.h"

#include <JsonValue.h>
#include <gmock/gmock.h>

#include <filesystem>
#include <set>

using testing::ElementsAre;

TEST_F(Received, aPushWaitsForServiceAndApplicationAndIsShownOnce)
{
    start();
    auto application = std::make_unique<RecordingApplication>();
    application->confirms = false;
    int32_t id = 0;
    ASSERT_EQ(requestTo({{"44", self}}, {makeFile("a.jpg", 100)}, &id), 0);
    ASSERT_TRUE(waitForTokens(*application, 1));
    const std::string token = tokens(*application)[0];
    service_->end(SIGKILL); // between launch and receipt
    application.reset();
    startService(); // now there is no application to launch
    RecordingApplication second;
    ASSERT_TRUE(waitForTokens(second, 1));
    EXPECT_THAT(tokens(second), ElementsAre(token));
    share({makeFile("b.jpg", 100)}); // launched for when the receipt of the first is on disk
    ASSERT_TRUE(waitForTokens(second, 2));
    service_->end(SIGKILL);
    startService();
    share({makeFile("c.jpg", 100)});
    ASSERT_TRUE(runUntil([&] { return receivedList().size() == 3; }));
    ASSERT_TRUE(runUntil([&] {
        const auto all = tokens(second);
        return std::set<std::string>(all.begin(), all.end()).size() == 3;
    }));
    const auto seen = tokens(second);
    EXPECT_EQ(std::count(seen.begin(), seen.end(), token), 1);
}

TEST_F(Received, theStreamComesBackAfterTheServer)
{
    start();
    const RecordingApplication application;
    share({makeFile("a.jpg", 100)});
    ASSERT_TRUE(waitForTokens(application, 1));
    server_->end(SIGKILL);
    startServer();
    share({makeFile("b.jpg", 100)});
    ASSERT_TRUE(waitForTokens(application, 2));
    const auto seen = tokens(application);
    EXPECT_EQ(seen.size(), 2U);
    EXPECT_NE(seen[0], seen[1]);
}

TEST_F(Received, anAccountThatComesLaterIsNoticed)
{
    startServer();
    makeAccount();
    startService();
    {
        const RecordingApplication application;
        share({makeFile("a.jpg", 100)});
        ASSERT_TRUE(waitForTokens(application, 1));
    }
    const std::string account = folder_ + "/account.json";
    const std::string aside = folder_ + "/aside.json";
    std::filesystem::rename(account, aside);
    ASSERT_TRUE(runUntil([&] { return infoOf(std::string(22, 'x')).result != 0; }));
    std::filesystem::rename(aside, account);
    const RecordingApplication application;
    share({makeFile("b.jpg", 100)});
    EXPECT_TRUE(waitForTokens(application, 1));
}

TEST_F(Received, aContactThatHasJoinedIsMarkedAlsoWhenItComesLater)
{
    startServer();
    makeAccount();
    const std::string tool = PELLIKO_BUILD_DIR "/bin/contacts-tool";
    outputOf({tool, "add", "--name", "Joined One", "--number", "07700 900777"});
    outputOf({tool, "add", "--name", "Other One", "--number", "07700 900778"});
    outputOf({PELLIKO_BUILD_DIR "/bin/pelliko-server", "account", "add", "--data",
              folder_ + "/server", "--number", "+447700900777"});
    const auto joined = [&](const std::string &name) {
        const auto list = pelliko::test::JsonValue::parse(outputOf({tool, "list", "--json"}));
        for (size_t i = 0; i < list.size(); ++i) {
            if (list[i]["name"] == name) {
                return list[i]["joined"] == true;
            }
        }
        return false;
    };
    // What the service writes wakes this loop.
    const std::string store = std::string(std::getenv("XDG_DATA_HOME")) + "/pelliko-platform";
    g_autoptr(GFile) folder = g_file_new_for_path(store.c_str());
    g_autoptr(GFileMonitor) monitor =
        g_file_monitor_directory(folder, G_FILE_MONITOR_NONE, nullptr, nullptr);
    startService();
    ASSERT_TRUE(runUntil([&] { return joined("Joined One"); }));
    EXPECT_FALSE(joined("Other One"));
    // A contact that comes later is noticed.
    outputOf({PELLIKO_BUILD_DIR "/bin/pelliko-server", "account", "add", "--data",
              folder_ + "/server", "--number", "+447700900779"});
    outputOf({tool, "add", "--name", "Late One", "--number", "+447700900779"});
    EXPECT_TRUE(runUntil([&] { return joined("Late One"); }));
}
