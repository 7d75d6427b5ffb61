// What stands between the phone and the server, and what it may do to a share.
#include "FaultPlan.h"
#include "World.h"

#include <JsonValue.h>

#include <csignal>
#include <filesystem>
#include <fstream>
#include <iterator>

using pelliko::test::JsonValue;
namespace fs = std::filesystem;

namespace
{
constexpr int64_t mebibyte = 1024 * 1024;

std::string contentOf(const std::string &path)
{
    std::ifstream file(path, std::ios::binary);
    return {std::istreambuf_iterator<char>(file), {}};
}

class UploadProxy : public World
{
protected:
    void start(const std::vector<std::string> &rules, std::vector<std::string> options = {})
    {
        startServer();
        startFaults(plan(rules));
        options.insert(options.end(), {"--longest-retry", "100"});
        startService(options);
    }

    void expectArrived(const std::string &file)
    {
        ASSERT_EQ(application.launches.size(), 1U) << "one link, told once";
        EXPECT_TRUE(contentOf(downloadOf(application.launches[0].texts.at("url"))) ==
                    contentOf(file));
        EXPECT_EQ(JsonValue::parse(askServer("GET", "/api/v1/shares"))["shares"].size(), 1U);
    }

    /** The list has the newest first. */
    std::string stateOfFirstShare()
    {
        const auto shares = JsonValue::parse(askServer("GET", "/api/v1/shares"))["shares"];
        return shares[shares.size() - 1]["state"].text();
    }

    size_t stalled() const
    {
        size_t count = 0;
        for (const std::string &line : proxy_->lines()) {
            count += line.starts_with("stalled") ? 1 : 0;
        }
        return count;
    }

    RecordingApplication application;
};
} // namespace

TEST_F(UploadProxy, nothingThatItSaysIsTakenForTheServersAnswer)
{
    const std::string create = "/shares$";
    const std::string record = "/shares/[^/]+$";
    const std::string upload = "/uploads/";
    const std::string finish = "/finish$";
    // In the order in which a share meets them; the PATCH of a conflict leads to a HEAD.
    start({hotelPage("POST", create), answers("POST", create, 404), answers("POST", create, 502),
           rule("POST", create, "reset"), rule("POST", create, "cut", R"("after": 20)"),
           hotelPage("PATCH", upload), hotelPage("GET", record), answers("GET", record, 403),
           answers("PATCH", upload, 409), hotelPage("HEAD", upload), answers("PATCH", upload, 409),
           answers("HEAD", upload, 401), answers("PATCH", upload, 502),
           answers("PATCH", upload, 204), rule("PATCH", upload, "cut", R"("after": 10)"),
           hotelPage("POST", "/joined$"), hotelPage("POST", finish), answers("POST", finish, 410),
           rule("POST", finish, "cut", R"("after": 30)")});
    const std::string file = makeFile("photo.jpg", 300'000);
    int32_t id = 0;
    ASSERT_EQ(request({file}, &id), 0);
    ASSERT_TRUE(waitForEnd(id, 60));
    EXPECT_EQ(statusesOf(id).back(), 7);
    expectArrived(file);
    size_t met = 0;
    for (const SeenExchange &seen : exchanges()) {
        met += seen.fault.empty() ? 0 : 1;
    }
    EXPECT_EQ(met, 19U) << "every rule was met";
}

TEST_F(UploadProxy, silenceEndsATransferSlownessDoesNotAndAWishToBeLeftAloneIsKept)
{
    start({rule("POST", "/shares$", "delay", R"("seconds": 0.4)"), rest("POST", "/shares$", 503),
           rule("PATCH", "/uploads/", "stall", R"("after": 1000)"), rest("PATCH", "/uploads/", 429),
           rest("GET", "/shares/", 503)},
          {"--stall", "1"});
    const std::string file = makeFile("photo.jpg", 300'000);
    int32_t first = 0;
    int32_t second = 0;
    ASSERT_EQ(request({file}, &first), 0);
    ASSERT_TRUE(runUntil([this] { return stalled() == 1; }));
    ASSERT_EQ(request({file}, &second), 0);
    ASSERT_TRUE(waitForEnd(second));
    EXPECT_EQ(reportsOf(second).back().status, 7);
    int64_t wished = 0;
    int wishes = 0;
    for (const SeenExchange &seen : exchanges()) {
        if (wished != 0) {
            EXPECT_GE(seen.at - wished, 1000) << seen.request;
        }
        wished = seen.fault == "answer" ? seen.at : 0;
        wishes += seen.fault == "answer" ? 1 : 0;
    }
    EXPECT_EQ(wishes, 3);
    ASSERT_TRUE(waitForEnd(first));
    EXPECT_EQ(reportsOf(first).back().status, 7);
    EXPECT_EQ(application.launches.size(), 2U);
    EXPECT_EQ(JsonValue::parse(askServer("GET", "/api/v1/shares"))["shares"].size(), 2U)
        << "a slow answer is waited for";
}

TEST_F(UploadProxy, connectionsThatBreakSendNoByteTwice)
{
    std::vector<std::string> rules;
    for (int i = 0; i < 5; ++i) {
        rules.push_back(rule("PATCH", "/uploads/", "reset", R"("after": 700000)"));
    }
    start(rules, {"--chunk", "1048576"});
    const std::string file = makeFile("film.mp4", 6 * mebibyte);
    int32_t id = 0;
    ASSERT_EQ(request({file}, &id), 0);
    ASSERT_TRUE(waitForEnd(id));
    EXPECT_EQ(reportsOf(id).back().status, 7);
    expectArrived(file);
    const auto total = [this] {
        int64_t bytes = 0;
        for (const SeenExchange &seen : exchanges()) {
            bytes += seen.request.starts_with("PATCH") ? seen.bytes : 0;
        }
        return bytes;
    };
    // An exchange is told of when its connections are closed.
    EXPECT_TRUE(runUntil([&] { return total() >= 6 * mebibyte; }));
    EXPECT_EQ(total(), 6 * mebibyte);
}

TEST_F(UploadProxy, aFileThatGrowsFailsAndOneThatIsRemovedIsSentFromWhatIsOpen)
{
    start({rule("PATCH", "/uploads/", "stall", R"("after": 100000, "times": 2)"),
           answers("DELETE", "/shares/", 404), hotelPage("DELETE", "/shares/")},
          {"--chunk", "1048576"});
    const std::string growing = makeFile("growing.mp4", 3 * mebibyte);
    const std::string removed = makeFile("removed.mp4", 3 * mebibyte);
    const std::string kept = folder_ + "/kept.mp4";
    fs::copy_file(removed, kept);
    int32_t first = 0;
    int32_t second = 0;
    ASSERT_EQ(request({growing}, &first), 0);
    ASSERT_EQ(request({removed}, &second), 0);
    ASSERT_TRUE(runUntil([this] { return stalled() == 2; }));
    std::ofstream(growing, std::ios::app) << "more";
    fs::remove(removed);
    proxy_->signal(SIGUSR1);
    ASSERT_TRUE(waitForEnd(first));
    ASSERT_TRUE(waitForEnd(second));
    EXPECT_EQ(reportsOf(first).back().status, 4);
    EXPECT_EQ(reportsOf(first).back().error, -5);
    EXPECT_EQ(reportsOf(second).back().status, 7);
    ASSERT_EQ(application.launches.size(), 1U) << "nobody is told of the other";
    ASSERT_TRUE(runUntil([this] { return stateOfFirstShare() == "withdrawn"; }))
        << "whoever else says that there is none";
    EXPECT_TRUE(contentOf(downloadOf(application.launches[0].texts.at("url"))) == contentOf(kept));
}
