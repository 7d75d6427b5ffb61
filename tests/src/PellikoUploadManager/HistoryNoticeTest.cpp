#include "PellikoUploadManager/HistoryNotice.h"
#include "PellikoUploadManager/UploadStatus.h"
#include "platform/quickpanel/support/RecordingApplication.h"
#include "support/AppWorld.h"
#include "support/LaunchRequest.h"

#include <aul.h>
#include <cstdlib>
#include <filesystem>
#include <fstream>

namespace pelliko::test
{
namespace
{

using panel_testing::RecordingApplication;

constexpr const char *historyName = "com.velmora.pelliko-history";
constexpr const char *shared = "http://tizen.org/appcontrol/operation/shared";
constexpr const char *reshared = "http://tizen.org/appcontrol/operation/reshared";
constexpr const char *marker = "http://tizen.org/appcontrol/operation/default";

class HistoryNotice : public AppWorld
{
protected:
    // Requests of one sender arrive in order: what comes before this one is all that was sent.
    void sendMarker()
    {
        const LaunchRequest last;
        app_control_set_app_id(last, historyName);
        app_control_set_operation(last, marker);
        ASSERT_EQ(app_control_send_launch_request(last, nullptr, nullptr), 0);
    }

    // "operation request_id" of everything that the history application received.
    std::vector<std::string> received(const RecordingApplication &history)
    {
        sendMarker();
        EXPECT_TRUE(loop.runUntil([&history] {
            return !history.launches().empty() && history.launches().back().operation == marker;
        }));
        std::vector<std::string> all;
        for (const auto &launch : history.launches()) {
            EXPECT_FALSE(launch.replyWanted);
            if (launch.operation != marker)
                all.push_back(launch.operation + " " + launch.extra("request_id"));
        }
        return all;
    }

    void finish(int32_t request_id)
    {
        addNode(request_id, {"/a"}, 10, "Ann?", "31?");
        uploadResponseStatusCb(7, nullptr, 0, 0, 0, 0, request_id, ad);
    }
};

TEST_F(HistoryNotice, ARunningHistoryIsToldOnceOfAFinishedShare)
{
    const RecordingApplication history(historyName);
    finish(7);
    EXPECT_EQ(received(history), (std::vector<std::string>{std::string(shared) + " 7"}));
    EXPECT_TRUE(log.has("request_id = 7, req_id = 7")) << log.text();
    EXPECT_FALSE(log.has("History app is NOT running"));
}

TEST_F(HistoryNotice, ARunningHistoryIsToldOnceOfAFinishedReshare)
{
    const RecordingApplication history(historyName);
    ad->reshared_request_id = 8;
    finish(8);
    EXPECT_EQ(received(history), (std::vector<std::string>{std::string(reshared) + " 8"}));
    EXPECT_TRUE(log.has("request_id = 8, req_id = 8")) << log.text();
}

TEST_F(HistoryNotice, AfterAReshareLaterNoticesNameTheReshare)
{
    const RecordingApplication history(historyName);
    ad->reshared_request_id = 8;
    finish(9);
    EXPECT_EQ(received(history), (std::vector<std::string>{std::string(reshared) + " 8"}));
}

TEST_F(HistoryNotice, AnErrorOrACancelTellsNothing)
{
    const RecordingApplication history(historyName);
    addNode(7, {"/a"}, 10, "Ann?", "31?");
    uploadResponseStatusCb(7, nullptr, 0, 0, 0, -5, 7, ad);
    addNode(8, {"/a"}, 10, "Ann?", "31?");
    uploadResponseStatusCb(5, nullptr, 0, 0, 0, 0, 8, ad);
    EXPECT_TRUE(received(history).empty());
}

// It is installed and could be started by a launch request.
TEST_F(HistoryNotice, AHistoryThatDoesNotRunIsNotStarted)
{
    const std::string started = std::string(getenv("XDG_DATA_HOME")) + "/history-started";
    const std::string file =
        std::string(getenv("XDG_DATA_HOME")) + "/dbus-1/services/" + historyName + ".service";
    std::ofstream(file) << "[D-BUS Service]\nName=" << historyName << "\nExec=/usr/bin/touch "
                        << started << "\n";
    panel_testing::Connection().call("org.freedesktop.DBus", "/org/freedesktop/DBus",
                                     "org.freedesktop.DBus", "ReloadConfig", nullptr);
    _sendSharedNotification(7);
    _sendResharedNotification(8);
    EXPECT_EQ(log.text(), "request_id = 7, req_id = 7\n"
                          "History app is NOT running\n"
                          "request_id = 8, req_id = 8\n"
                          "History app is NOT running\n");
    // The bus has taken every message of this connection before it answers this one.
    aul_app_is_running(historyName);
    EXPECT_FALSE(std::filesystem::exists(started));
    std::filesystem::remove(file);
}

} // namespace
} // namespace pelliko::test
