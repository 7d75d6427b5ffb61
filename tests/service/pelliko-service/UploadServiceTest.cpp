#include "World.h"

#include <JsonValue.h>
#include <gmock/gmock.h>

#include <csignal>
#include <cstring>
#include <filesystem>

using pelliko::test::JsonValue;
using testing::ElementsAre;
namespace fs = std::filesystem;

namespace
{
class UploadService : public World
{
};

bool sameContent(const std::string &one, const std::string &other)
{
    g_autofree char *first = nullptr;
    g_autofree char *second = nullptr;
    gsize firstLength = 0;
    gsize secondLength = 0;
    return g_file_get_contents(one.c_str(), &first, &firstLength, nullptr) &&
           g_file_get_contents(other.c_str(), &second, &secondLength, nullptr) &&
           firstLength == secondLength && memcmp(first, second, firstLength) == 0;
}
} // namespace

TEST_F(UploadService, sharesOneFileAndHasTheApplicationTellTheRecipients)
{
    startServer();
    makeAccount();
    RecordingApplication application;
    startService();
    const std::string file = makeFile("photo.jpg", 3'000'000);
    int32_t id = 0;
    application.onLaunch = [&](const SeenLaunch &) {
        // All files were reported as sent before the messages are asked for.
        runUntil([&] { return !reportsOf(id).empty() && reportsOf(id).back().status == 3; }, 2);
    };
    ASSERT_EQ(request({file}, &id), 0);
    EXPECT_GT(id, 0);
    EXPECT_TRUE(reportsOf(id).empty()) << "a report came from inside the call";
    ASSERT_TRUE(waitForEnd(id));
    EXPECT_THAT(statusesOf(id), ElementsAre(1, 2, 3, 7));
    EXPECT_EQ(reportsOf(id).back().error, 0);
    EXPECT_EQ(reportsOf(id).back().input, std::nullopt);

    ASSERT_EQ(application.launches.size(), 1U);
    const SeenLaunch &launch = application.launches[0];
    EXPECT_EQ(launch.operation, "http://tizen.org/appcontrol/operation/send_text");
    EXPECT_TRUE(launch.replyWanted);
    EXPECT_EQ(launch.texts.at("from_msisdn"), "+447700900100");
    EXPECT_EQ(launch.texts.at("req_id"), std::to_string(id));
    EXPECT_EQ(launch.texts.at("file_count"), "1");
    EXPECT_THAT(launch.lists.at("to_msisdn"), ElementsAre("+447700900111", "+447700900222"));
    const int64_t expires = reportsOf(id).back().expired;
    EXPECT_EQ(launch.texts.at("expired_time"), std::to_string(expires));
    EXPECT_NEAR(static_cast<double>(expires), static_cast<double>(time(nullptr) + 2 * 86400), 60);
    EXPECT_TRUE(sameContent(downloadOf(launch.texts.at("url")), file));
}

TEST_F(UploadService, namesTheTemporaryFileOfATextAtTheEnd)
{
    startServer();
    makeAccount();
    RecordingApplication application;
    startService();
    const std::string memo = "/opt/usr/apps/com.velmora.pelliko/shared/data/memo.txt";
    fs::copy_file(makeFile("memo.txt", 20), memo, fs::copy_options::overwrite_existing);
    int32_t id = 0;
    ASSERT_EQ(request({memo}, &id), 0);
    ASSERT_TRUE(waitForEnd(id));
    EXPECT_EQ(reportsOf(id).back().status, 7);
    EXPECT_EQ(reportsOf(id).back().input, memo);
}

TEST_F(UploadService, percentsOfManyFilesNeverRepeatAndComeAtMostTenASecond)
{
    startServer();
    makeAccount();
    RecordingApplication application;
    startService({"--chunk", "100000"});
    std::vector<std::string> files;
    for (int i = 0; i < 30; ++i) {
        files.push_back(makeFile("f" + std::to_string(i), 50'000 + i * 7'000));
    }
    files.push_back(makeFile("empty.txt", 0));
    int32_t id = 0;
    const gint64 began = g_get_monotonic_time();
    ASSERT_EQ(request(files, &id), 0);
    ASSERT_TRUE(waitForEnd(id, 60));
    const double seconds = static_cast<double>(g_get_monotonic_time() - began) / 1e6;
    int last = -1;
    int count = 0;
    for (const SeenReport &report : reportsOf(id)) {
        if (report.status == 2) {
            EXPECT_NE(report.percent, last);
            last = report.percent;
            ++count;
        }
    }
    EXPECT_GT(count, 0);
    EXPECT_LE(count, seconds * 10 + 1);
    EXPECT_EQ(reportsOf(id).back().status, 7);
}

TEST_F(UploadService, cancelReportsTheEndAndTakesTheShareOffTheServer)
{
    startServer();
    RecordingApplication application;
    startProxy(2'000'000);
    startService();
    int32_t id = 0;
    ASSERT_EQ(request({makeFile("film.mp4", 6'000'000)}, &id), 0);
    ASSERT_TRUE(runUntil([&] { return proxy_->lines().back() == "stalled"; }));
    ASSERT_EQ(pelliko_cancel_upload(id), 0);
    ASSERT_TRUE(waitForEnd(id));
    EXPECT_EQ(reportsOf(id).back().status, 5);
    EXPECT_EQ(reportsOf(id).back().error, 0);
    proxy_->signal(SIGUSR1);
    ASSERT_TRUE(runUntil([&] {
        const auto shares = JsonValue::parse(askServer("GET", "/api/v1/shares"));
        return shares["shares"].size() == 1 && shares["shares"][0]["state"] == "withdrawn";
    }));
    EXPECT_NE(pelliko_cancel_upload(id), 0) << "a second cancel has nothing to cancel";
    EXPECT_TRUE(application.launches.empty());
}

TEST_F(UploadService, resharesWithoutUploadingAgain)
{
    startServer();
    makeAccount();
    RecordingApplication application;
    startService();
    const std::string file = makeFile("photo.jpg", 500'000);
    int32_t first = 0;
    ASSERT_EQ(request({file}, &first), 0);
    ASSERT_TRUE(waitForEnd(first));
    fs::remove(file);
    int32_t second = 0;
    ASSERT_EQ(reshare(first, &second), 0);
    EXPECT_GT(second, first);
    ASSERT_TRUE(waitForEnd(second));
    EXPECT_THAT(statusesOf(second), ElementsAre(1, 3, 7));
    ASSERT_EQ(application.launches.size(), 2U);
    EXPECT_THAT(application.launches[1].lists.at("to_msisdn"), ElementsAre("+447700900333"));
    EXPECT_EQ(fs::file_size(downloadOf(application.launches[1].texts.at("url"))), 500'000U);
}

TEST_F(UploadService, refusesToReshareWhatItDoesNotKnow)
{
    startServer();
    makeAccount();
    startService();
    int32_t id = 77;
    EXPECT_EQ(reshare(4711, &id), -16);
    EXPECT_EQ(id, 77);
}

TEST_F(UploadService, tellsTheFilesOfAFinishedRequest)
{
    startServer();
    makeAccount();
    RecordingApplication application;
    startService();
    const std::string one = makeFile("a b.jpg", 1000);
    const std::string two = makeFile("c.jpg", 234);
    int32_t id = 0;
    ASSERT_EQ(request({one, two}, &id), 0);
    ASSERT_TRUE(waitForEnd(id));
    pelliko_upload_info_h info = nullptr;
    ASSERT_EQ(pelliko_upload_info_get_handle(id, &info), 0);
    char **files = nullptr;
    int32_t count = 0;
    int64_t total = 0;
    ASSERT_EQ(pelliko_upload_info_get_file_info(info, &files, &count, &total), 0);
    ASSERT_EQ(count, 2);
    EXPECT_EQ(files[0], one);
    EXPECT_EQ(files[1], two);
    EXPECT_EQ(total, 1234);
    EXPECT_EQ(pelliko_upload_info_get_handle(4711, &info), -16);
}

TEST_F(UploadService, withoutAnAccountARequestIsRefusedAtOnce)
{
    startService();
    int32_t id = 5;
    EXPECT_EQ(request({makeFile("photo.jpg", 10)}, &id), -16);
    EXPECT_EQ(id, 5);
}

TEST_F(UploadService, resumingAnUnknownRequestIsAnError)
{
    startServer();
    makeAccount();
    startService();
    EXPECT_NE(resume(12345), 0);
}

TEST_F(UploadService, statusListsTheRequestsAsJson)
{
    startServer();
    makeAccount();
    RecordingApplication application;
    startService();
    int32_t id = 0;
    ASSERT_EQ(request({makeFile("photo.jpg", 4321)}, &id), 0);
    ASSERT_TRUE(waitForEnd(id));
    const auto list =
        JsonValue::parse(outputOf({PELLIKO_BUILD_DIR "/bin/pelliko-service", "status", "--json"}));
    ASSERT_EQ(list.size(), 1U);
    EXPECT_EQ(list[0]["id"], id);
    EXPECT_EQ(list[0]["state"], "shared");
    EXPECT_EQ(list[0]["percent"], 100);
    EXPECT_EQ(list[0]["size"], 4321);
}

TEST_F(UploadService, tellsAPersonWrittenInThreeWaysOnceAndKnowsWhoHasJoined)
{
    startServer();
    makeAccount();
    outputOf({PELLIKO_BUILD_DIR "/bin/pelliko-server", "account", "add", "--data",
              folder_ + "/server", "--number", "+447700900111"});
    RecordingApplication application;
    startService();
    int32_t id = 0;
    ASSERT_EQ(requestTo({{"44", "07700 900111"},
                         {"", "0044 7700 900111"},
                         {"1", "+44 7700 900111"},
                         {"44", "12"},
                         {"49", "0151 12345678"}},
                        {makeFile("photo.jpg", 1000)}, &id),
              0);
    ASSERT_TRUE(waitForEnd(id));
    EXPECT_EQ(reportsOf(id).back().status, 7);
    ASSERT_EQ(application.launches.size(), 1U);
    EXPECT_THAT(application.launches[0].lists.at("to_msisdn"), ElementsAre("+4915112345678"))
        << "who has joined has a push";
    const auto list =
        JsonValue::parse(outputOf({PELLIKO_BUILD_DIR "/bin/pelliko-service", "status", "--json"}));
    const auto people = list[0]["recipients"];
    ASSERT_EQ(people.size(), 5U);
    EXPECT_EQ(people[0],
              JsonValue::parse(
                  R"({"number":"07700 900111","e164":"+447700900111","fault":"","joined":"yes"})"));
    EXPECT_EQ(people[2]["joined"], "yes");
    EXPECT_EQ(people[3]["fault"], "too_short");
    EXPECT_EQ(people[4]["joined"], "no");
    EXPECT_NE(outputOf({PELLIKO_BUILD_DIR "/bin/pelliko-service", "status"})
                  .find("12 gets nothing: it has too few digits"),
              std::string::npos);
}

TEST_F(UploadService, withNobodyToReachItEndsWithADeviceError)
{
    startServer();
    makeAccount();
    startService();
    int32_t id = 0;
    ASSERT_EQ(requestTo({{"44", "12"}, {"44", "Anna"}}, {makeFile("photo.jpg", 1000)}, &id), 0);
    ASSERT_TRUE(waitForEnd(id));
    EXPECT_EQ(reportsOf(id).back().error, -5);
    EXPECT_EQ(JsonValue::parse(askServer("GET", "/api/v1/shares"))["shares"].size(), 0U);
}
