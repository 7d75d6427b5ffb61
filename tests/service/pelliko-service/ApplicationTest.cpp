#include "World.h"

#include <JsonValue.h>
#include <gmock/gmock.h>

using pelliko::test::JsonValue;
using testing::ElementsAre;

namespace
{
constexpr const char *operationDefault = "http://tizen.org/appcontrol/operation/default";
constexpr const char *operationSendText = "http://tizen.org/appcontrol/operation/send_text";

/** What the service does with the application when its clients come and go. */
class ApplicationLaunch : public World
{
protected:
    std::unique_ptr<Process> client(const std::string &word, const std::string &argument)
    {
        auto process = std::make_unique<Process>(
            std::vector<std::string>{PELLIKO_BUILD_DIR "/tests/upload-client", word, argument});
        EXPECT_TRUE(runUntil([&] { return !process->lines().empty(); }));
        return process;
    }

    static int32_t idOf(const Process &client)
    {
        return static_cast<int32_t>(std::stol(client.lines().front().substr(3)));
    }

    std::string shareState()
    {
        return JsonValue::parse(askServer("GET", "/api/v1/shares"))["shares"][0]["state"].text();
    }

    // What the service answers, as text; empty when it does not.
    static std::string callService(const char *method, GVariant *arguments = nullptr)
    {
        g_autoptr(GDBusConnection) bus = g_bus_get_sync(G_BUS_TYPE_SESSION, nullptr, nullptr);
        g_autoptr(GVariant) answer = g_dbus_connection_call_sync(
            bus, "com.velmora.pelliko.Service", "/com/velmora/pelliko/Service",
            "com.velmora.pelliko.Service1", method, arguments, nullptr, G_DBUS_CALL_FLAGS_NONE, -1,
            nullptr, nullptr);
        if (!answer) {
            return {};
        }
        g_autofree char *text = g_variant_print(answer, FALSE);
        return text;
    }

    static size_t count(const RecordingApplication &application, const char *operation)
    {
        return static_cast<size_t>(std::count_if(
            application.launches.begin(), application.launches.end(),
            [operation](const SeenLaunch &launch) { return launch.operation == operation; }));
    }
};
} // namespace

TEST_F(ApplicationLaunch, aClientThatDiesHasTheApplicationLaunchedToResume)
{
    startServer();
    startProxy(2'000'000);
    startService();
    RecordingApplication application;
    auto first = client("request", makeFile("film.mp4", 6'000'000));
    const int32_t id = idOf(*first);
    ASSERT_TRUE(runUntil([&] { return proxy_->lines().back() == "stalled"; }));
    int claimed = -1;
    application.onLaunch = [&](const SeenLaunch &launch) {
        if (launch.operation == operationDefault) {
            claimed = resume(id);
        }
    };
    first->end(SIGKILL);
    ASSERT_TRUE(runUntil([&] { return count(application, operationDefault) > 0; }));
    EXPECT_TRUE(application.launches[0].replyWanted);
    EXPECT_THAT(application.launches[0].lists.at("upload_resume"), ElementsAre(std::to_string(id)));
    EXPECT_EQ(claimed, 0);
    proxy_->signal(SIGUSR1);
    ASSERT_TRUE(waitForEnd(id));
    EXPECT_EQ(reportsOf(id).back().status, 7);
    EXPECT_EQ(count(application, operationDefault), 1U);
    EXPECT_EQ(count(application, operationSendText), 1U);
}

TEST_F(ApplicationLaunch, whatTheApplicationDoesNotClaimIsCancelledOnTheServer)
{
    startServer();
    startProxy(2'000'000);
    startService();
    RecordingApplication application;
    auto first = client("request", makeFile("film.mp4", 6'000'000));
    ASSERT_TRUE(runUntil([&] { return proxy_->lines().back() == "stalled"; }));
    EXPECT_EQ(shareState(), "uploading");
    first->end(SIGKILL);
    ASSERT_TRUE(runUntil([&] { return count(application, operationDefault) > 0; }));
    proxy_->signal(SIGUSR1);
    ASSERT_TRUE(runUntil([&] { return shareState() != "uploading"; }));
    EXPECT_EQ(count(application, operationDefault), 1U);
}

TEST_F(ApplicationLaunch, anApplicationThatDoesNotAnswerLosesNothing)
{
    startServer();
    startProxy(2'000'000);
    startService();
    RecordingApplication application;
    application.resumes = false;
    auto first = client("request", makeFile("film.mp4", 6'000'000));
    const int32_t id = idOf(*first);
    ASSERT_TRUE(runUntil([&] { return proxy_->lines().back() == "stalled"; }));
    first->end(SIGKILL);
    ASSERT_TRUE(runUntil([&] { return count(application, operationDefault) >= 3; }))
        << "it is launched again and again";
    proxy_->signal(SIGUSR1);
    EXPECT_EQ(resume(id), 0);
    ASSERT_TRUE(waitForEnd(id));
    EXPECT_EQ(reportsOf(id).back().status, 7);
}

TEST_F(ApplicationLaunch, anEndThatNobodyHeardIsKeptUntilItIsAskedFor)
{
    startServer();
    makeAccount();
    startService({"--claim", "60000"});
    RecordingApplication application;
    application.resumes = false;
    const std::string file = makeFile("photo.jpg", 100'000);
    server_->signal(SIGSTOP);
    auto first = client("request", file);
    const int32_t id = idOf(*first);
    first->end(SIGKILL);
    server_->signal(SIGCONT);
    ASSERT_TRUE(runUntil([&] { return count(application, operationSendText) > 0; }));
    service_->end(SIGKILL);
    startService({"--claim", "60000"});
    ASSERT_TRUE(runUntil([&] { return resume(id) == 0; }));
    EXPECT_TRUE(reportsOf(id).empty());
    ASSERT_TRUE(waitForEnd(id));
    EXPECT_EQ(reportsOf(id).back().status, 7);
    ASSERT_TRUE(runUntil([&] { return resume(id) != 0; })) << "a delivered end is told once";
}

TEST_F(ApplicationLaunch, anEndThatIsConfirmedAfterARestartIsNotToldAgain)
{
    startServer();
    makeAccount();
    startService();
    RecordingApplication application;
    application.resumes = false;
    server_->signal(SIGSTOP);
    auto first = client("request", makeFile("photo.jpg", 1000));
    const int32_t id = idOf(*first);
    first->end(SIGKILL);
    server_->signal(SIGCONT);
    ASSERT_TRUE(runUntil(
        [&] { return callService("ListRequests").find("'shared'") != std::string::npos; }));
    service_->end(SIGKILL);
    startService();
    callService("ConfirmEnd", g_variant_new("(i)", id));
    EXPECT_NE(resume(id), 0) << "it counts as told";
}

TEST_F(ApplicationLaunch, aLaunchWithoutReceiptIsRepeatedAndOneWithIsNot)
{
    startServer();
    makeAccount();
    startService();
    auto application = std::make_unique<RecordingApplication>();
    application->confirms = false;
    int32_t id = 0;
    ASSERT_EQ(request({makeFile("photo.jpg", 100'000)}, &id), 0);
    ASSERT_TRUE(runUntil([&] { return count(*application, operationSendText) == 1; }));
    EXPECT_EQ(reportsOf(id).back().status, 3);
    service_->end(SIGKILL);
    application.reset();
    application = std::make_unique<RecordingApplication>();
    startService();
    ASSERT_TRUE(waitForEnd(id));
    EXPECT_EQ(reportsOf(id).back().status, 7);
    EXPECT_EQ(count(*application, operationSendText), 1U);
    service_->end(SIGKILL);
    startService();
    int32_t next = 0;
    ASSERT_EQ(request({makeFile("photo.jpg", 1000)}, &next), 0);
    ASSERT_TRUE(waitForEnd(next));
    ASSERT_EQ(count(*application, operationSendText), 2U) << "only the second request was told";
    EXPECT_EQ(application->launches.back().texts.at("req_id"), std::to_string(next));
}

TEST_F(ApplicationLaunch, messagesThatWereNotSettledAreAskedForAgainBeforeTheShareEnds)
{
    startServer();
    makeAccount();
    startService();
    RecordingApplication application;
    application.messagesResult = -1;
    std::vector<int> reported;
    int32_t id = 0;
    application.onLaunch = [&](const SeenLaunch &) {
        reported = statusesOf(id);
        application.messagesResult = 0;
    };
    ASSERT_EQ(request({makeFile("photo.jpg", 1000)}, &id), 0);
    ASSERT_TRUE(waitForEnd(id));
    EXPECT_EQ(reported.back(), 3) << "the share had not ended when it asked again";
    EXPECT_EQ(reportsOf(id).back().status, 7);
    ASSERT_EQ(count(application, operationSendText), 2U);
    EXPECT_EQ(application.launches[0].texts.at("sms_key"),
              application.launches[1].texts.at("sms_key"));
}
