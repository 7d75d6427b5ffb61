#include "World.h"

#include <app_control.h>
#include <aul.h>
#include <vconf.h>

#include <csignal>
#include <filesystem>
#include <fstream>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

using namespace pelliko::test;
using testing::Contains;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::StartsWith;

namespace
{

// The diary's line of a request that has only an operation.
std::string plain(const std::string &when, const std::string &operation)
{
    return when + " {\"extras\":{},\"operation\":\"" + operation + "\"}";
}

std::string task(const std::string &name)
{
    return "do=" + name;
}

// Sends without waiting, as an application does.
void send(const std::string &id, const char *task, const char *note)
{
    app_control_h request = nullptr;
    app_control_create(&request);
    app_control_set_app_id(request, id.c_str());
    app_control_add_extra_data(request, "do", task);
    app_control_add_extra_data(request, "note", note);
    EXPECT_EQ(APP_CONTROL_ERROR_NONE, app_control_send_launch_request(request, nullptr, nullptr));
    app_control_destroy(request);
}

std::string noteOf(const std::string &line)
{
    const std::string key = "\"note\":\"";
    const std::size_t at = line.find(key);
    return at == std::string::npos
               ? ""
               : line.substr(at + key.size(), line.find('"', at + key.size()) - at - key.size());
}

GVariant *callDesktop(const RecorderApp &app, const char *method, GVariant *arguments,
                      GError **error = nullptr)
{
    std::string path = "/" + app.id();
    std::replace(path.begin(), path.end(), '.', '/');
    g_autoptr(GDBusConnection) bus = g_bus_get_sync(G_BUS_TYPE_SESSION, nullptr, nullptr);
    return g_dbus_connection_call_sync(bus, app.id().c_str(), path.c_str(),
                                       "org.freedesktop.Application", method, arguments, nullptr,
                                       G_DBUS_CALL_FLAGS_NONE, -1, nullptr, error);
}

GVariant *callBus(const char *method)
{
    g_autoptr(GDBusConnection) bus = g_bus_get_sync(G_BUS_TYPE_SESSION, nullptr, nullptr);
    return g_dbus_connection_call_sync(bus, "org.freedesktop.DBus", "/org/freedesktop/DBus",
                                       "org.freedesktop.DBus", method, nullptr, nullptr,
                                       G_DBUS_CALL_FLAGS_NONE, -1, nullptr, nullptr);
}

constexpr const char *kDefault = APP_CONTROL_OPERATION_DEFAULT;

} // namespace

TEST(Frame, ARequestThatStartsTheProgramIsItsFirstAndNoDefaultFollows)
{
    const RecorderApp app("Activated");
    const Ended sent = appLaunch({"--app", app.id(), "--operation", "appcontrol/operation/share",
                                  "--uri", "/a.jpg", "--extra", task("exit")});
    EXPECT_EQ(0, sent.status) << sent.err;
    EXPECT_TRUE(app.waitUntilGone());
    EXPECT_THAT(app.diaryWith("ended"),
                ElementsAre("create",
                            "first {\"app_id\":\"com.velmora.testActivated\",\"extras\":{\"do\":"
                            "\"exit\"},\"operation\":\"http://tizen.org/appcontrol/operation/"
                            "share\",\"uri\":\"/a.jpg\"}",
                            "terminate", "ended 0"));
}

TEST(Frame, AStartByHandBringsOneDefaultRequestAndMayEndInIt)
{
    const RecorderApp app("ByHand");
    EXPECT_EQ(0, app.startByHand({}, {{"RECORDER_EXITS", "1"}}).status);
    EXPECT_THAT(app.diary(),
                ElementsAre("create", plain("first", kDefault), "terminate", "ended 0"));
}

TEST(Frame, AFileOnTheCommandLineIsShared)
{
    const RecorderApp app("OneFile");
    EXPECT_EQ(0, app.startByHand({"/tmp/my photo.jpg"}, {{"RECORDER_EXITS", "1"}}).status);
    EXPECT_THAT(app.diary(),
                Contains("first {\"extras\":{},\"operation\":\"http://tizen.org/"
                         "appcontrol/operation/share\",\"uri\":\"/tmp/my photo.jpg\"}"));
}

TEST(Frame, AProgramThatRefusesInCreateEndsWithoutLoop)
{
    const RecorderApp app("Refuses");
    EXPECT_EQ(1, app.startByHand({}, {{"RECORDER_REFUSES", "1"}}).status);
    EXPECT_THAT(app.diary(), ElementsAre("create", "ended 1"));
}

TEST(Frame, WithoutABusItSaysSoAndFails)
{
    const RecorderApp app("NoBus");
    const Ended ended =
        app.startByHand({}, {{"DBUS_SESSION_BUS_ADDRESS", "unix:path=/nowhere/bus"}});
    EXPECT_EQ(1, ended.status);
    EXPECT_THAT(ended.err, HasSubstr("app-recorder: no session bus: "));
    EXPECT_THAT(app.diary(), ElementsAre("ended 1"));
}

TEST(Frame, RequestsReachTheRunningInstanceInTheirOrder)
{
    constexpr int kRequests = 60;
    const RecorderApp app("Order");
    for (int i = 0; i < kRequests; ++i)
        send(app.id(), "note", std::to_string(i).c_str());
    appLaunch({"--app", app.id(), "--extra", task("exit")});
    const std::vector<std::string> diary = app.diaryWith("ended");
    ASSERT_EQ(std::size_t{kRequests} + 4, diary.size());
    EXPECT_THAT(diary[1], StartsWith("first"));
    for (int i = 0; i < kRequests; ++i)
        EXPECT_EQ(std::to_string(i), noteOf(diary[static_cast<std::size_t>(i) + 1]));
}

TEST(Frame, ASecondInstanceHandsItsStartToTheFirst)
{
    const RecorderApp app("Second");
    appLaunch({"--app", app.id(), "--extra", task("note")});
    EXPECT_EQ(0, app.startByHand().status);
    EXPECT_EQ(0, app.startByHand({"/a.jpg", "file:///b%20c.pdf"}).status);
    appLaunch({"--app", app.id(), "--extra", task("exit")});
    const std::vector<std::string> diary = app.diaryWith("terminate");
    EXPECT_EQ(1, std::count(diary.begin(), diary.end(), "create"));
    EXPECT_THAT(diary,
                Contains("later {\"app_id\":\"com.velmora.testSecond\",\"extras\":{},"
                         "\"operation\":\"http://tizen.org/appcontrol/operation/default\"}"));
    EXPECT_THAT(
        diary, Contains("later {\"app_id\":\"com.velmora.testSecond\",\"extras\":{\"http://"
                        "tizen.org/appcontrol/data/path\":[\"/a.jpg\",\"/b c.pdf\"]},\"operation\":"
                        "\"http://tizen.org/appcontrol/operation/multi_share\"}"));
}

TEST(Frame, RequestsBehindTheLastOneGoToANewInstance)
{
    const RecorderApp app("Leaving");
    appLaunch({"--app", app.id(), "--extra", task("note")});
    send(app.id(), "exit", "last");
    send(app.id(), "note", "after");
    send(app.id(), "note", "later");
    std::vector<std::string> steps;
    turnUntil([&] {
        steps.clear();
        for (const std::string &line : app.diary()) {
            const bool request = !noteOf(line).empty();
            // Two instances write here at the end of one and the beginning of the other.
            if (request || line == "create")
                steps.push_back(request ? noteOf(line) : line);
        }
        return steps.size() == 5;
    });
    ASSERT_EQ(5U, steps.size());
    EXPECT_THAT((std::vector<std::string>{steps.begin(), steps.begin() + 3}),
                ElementsAre("create", "last", "create"));
    // One of them may have been given back and the other have met the new instance directly.
    EXPECT_THAT((std::vector<std::string>{steps.begin() + 3, steps.end()}),
                testing::UnorderedElementsAre("after", "later"));
    appLaunch({"--app", app.id(), "--extra", task("exit")});
    EXPECT_TRUE(app.waitUntilGone());
}

TEST(Frame, ATerminationSignalEndsTheLoopInOrder)
{
    for (const int signal : {SIGTERM, SIGINT}) {
        const RecorderApp app("Signal" + std::to_string(signal), false);
        g_autoptr(GSubprocess) process = app.spawn();
        app.diaryWith("first");
        g_subprocess_send_signal(process, signal);
        g_subprocess_wait(process, nullptr, nullptr);
        EXPECT_TRUE(g_subprocess_get_successful(process));
        EXPECT_THAT(app.diary(),
                    ElementsAre("create", plain("first", kDefault), "terminate", "ended 0"));
    }
}

TEST(Frame, ALanguageChangeReachesTheApplication)
{
    const RecorderApp app("Language");
    appLaunch({"--app", app.id(), "--extra", task("note")});
    vconf_set_str(VCONFKEY_LANGSET, "de_DE.UTF-8");
    EXPECT_THAT(app.diaryWith("language"), Contains("language"));
    appLaunch({"--app", app.id(), "--extra", task("exit")});
}

TEST(Frame, ADesktopActivatesWithTheDefaultOperation)
{
    const RecorderApp app("Activate");
    g_autoptr(GVariant) reply = callDesktop(app, "Activate", g_variant_new("(a{sv})", nullptr));
    EXPECT_TRUE(reply);
    EXPECT_THAT(app.diaryWith("first"), ElementsAre("create", plain("first", kDefault)));
    appLaunch({"--app", app.id(), "--extra", task("exit")});
}

TEST(Frame, ADesktopOpensFilesAsShares)
{
    const RecorderApp app("Open");
    const char *one[] = {"file:///tmp/a%20b.jpg", nullptr};
    const char *several[] = {"file:///a.jpg", "https://example.org/x.jpg", "file:///b.jpg",
                             nullptr};
    const char *foreign[] = {"https://example.org/x.jpg", nullptr};
    g_autoptr(GVariant) first = callDesktop(app, "Open", g_variant_new("(^asa{sv})", one, nullptr));
    g_autoptr(GVariant) second =
        callDesktop(app, "Open", g_variant_new("(^asa{sv})", several, nullptr));
    g_autoptr(GError) error = nullptr;
    g_autoptr(GVariant) third =
        callDesktop(app, "Open", g_variant_new("(^asa{sv})", foreign, nullptr), &error);
    EXPECT_FALSE(third);
    EXPECT_TRUE(g_error_matches(error, G_DBUS_ERROR, G_DBUS_ERROR_INVALID_ARGS));
    g_autoptr(GVariant) action = callDesktop(
        app, "ActivateAction", g_variant_new("(sava{sv})", "anything", nullptr, nullptr));
    EXPECT_TRUE(action);
    appLaunch({"--app", app.id(), "--extra", task("exit")});
    const std::vector<std::string> diary = app.diaryWith("ended");
    ASSERT_EQ(6U, diary.size());
    EXPECT_EQ("first {\"extras\":{},\"operation\":\"http://tizen.org/appcontrol/operation/share\","
              "\"uri\":\"/tmp/a b.jpg\"}",
              diary[1]);
    EXPECT_EQ("later {\"extras\":{\"http://tizen.org/appcontrol/data/path\":[\"/a.jpg\",\"/b.jpg\"]"
              "},\"operation\":\"http://tizen.org/appcontrol/operation/multi_share\"}",
              diary[2]);
}

TEST(Frame, FilesGoToThePickerWhereThereIsOne)
{
    const RecorderApp app("Picked");
    const RecorderApp picker("Picked-picker");
    const char *several[] = {"file:///a.jpg", "file:///b%20b.jpg", nullptr};
    g_autoptr(GError) error = nullptr;
    g_autoptr(GVariant) started =
        callDesktop(app, "Open", g_variant_new("(^asa{sv})", several, nullptr), &error);
    ASSERT_TRUE(started) << error->message;
    // It was started for this alone, and so ends without having begun.
    EXPECT_TRUE(app.waitUntilGone());
    EXPECT_THAT(app.diaryWith("ended"), ElementsAre("ended 0"));

    appLaunch({"--app", app.id(), "--extra", task("note")});
    const char *one[] = {"file:///c.jpg", nullptr};
    g_autoptr(GVariant) running =
        callDesktop(app, "Open", g_variant_new("(^asa{sv})", one, nullptr));
    EXPECT_TRUE(running);
    EXPECT_EQ(0, app.startByHand({"/d.jpg"}).status);
    appLaunch({"--app", app.id(), "--extra", task("exit")});
    appLaunch({"--app", picker.id(), "--extra", task("exit")});
    app.diaryWith("terminate");
    for (const std::string &line : app.diary())
        EXPECT_EQ(std::string::npos, line.find(".jpg")) << line;
    const std::vector<std::string> diary = picker.diaryWith("ended");
    ASSERT_LE(4U, diary.size());
    EXPECT_THAT(diary[1], HasSubstr("[\"/a.jpg\",\"/b b.jpg\"]"));
    EXPECT_THAT(diary[2], HasSubstr("\"uri\":\"/c.jpg\""));
    EXPECT_THAT(diary[3], HasSubstr("\"uri\":\"/d.jpg\""));
}

TEST(Frame, APickerThatDoesNotStartIsTold)
{
    const RecorderApp app("Broken");
    const std::string folder = std::string(std::getenv("XDG_DATA_HOME")) + "/dbus-1/services/";
    std::ofstream(folder + app.id() + "-picker.service")
        << "[D-BUS Service]\nName=" << app.id() << "-picker\nExec=/nowhere/picker\n";
    const char *one[] = {"file:///c.jpg", nullptr};
    appLaunch({"--app", app.id(), "--extra", task("note")});
    g_autoptr(GVariant) reload = callBus("ReloadConfig");
    g_autoptr(GError) error = nullptr;
    g_autoptr(GVariant) reply =
        callDesktop(app, "Open", g_variant_new("(^asa{sv})", one, nullptr), &error);
    EXPECT_FALSE(reply);
    EXPECT_THAT(error->message, HasSubstr("cannot be started"));
    appLaunch({"--app", app.id(), "--extra", task("exit")});
    EXPECT_TRUE(app.waitUntilGone());
}

TEST(Aul, TellsRunningApplicationsFromOthers)
{
    const RecorderApp app("Running");
    EXPECT_EQ(0, aul_app_is_running(app.id().c_str()));
    appLaunch({"--app", app.id(), "--extra", task("note")});
    EXPECT_EQ(1, aul_app_is_running(app.id().c_str()));
    appLaunch({"--app", app.id(), "--extra", task("exit")});
    EXPECT_TRUE(app.waitUntilGone());
    EXPECT_EQ(0, aul_app_is_running(app.id().c_str()));
    EXPECT_EQ(0, aul_app_is_running(nullptr));
    EXPECT_EQ(0, aul_app_is_running("no application id"));
}
