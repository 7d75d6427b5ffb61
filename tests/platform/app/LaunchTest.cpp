#include "World.h"

#include <app_control.h>

#include <memory>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

using namespace pelliko::test;
using testing::Contains;
using testing::ElementsAre;
using testing::HasSubstr;

namespace
{

// An application that is told to end when the test ends.
class Launch : public testing::Test
{
protected:
    Launch() : app("L" + std::string(testing::UnitTest::GetInstance()->current_test_info()->name()))
    {
    }
    ~Launch() override
    {
        if (!gone)
            tell("exit");
    }

    Ended tell(const std::string &task) const
    {
        return appLaunch({"--app", app.id(), "--extra", "do=" + task});
    }
    Ended ask(const std::string &task) const
    {
        return appLaunch({"--app", app.id(), "--extra", "do=" + task, "--wait-reply"});
    }

    const RecorderApp app;
    bool gone = false;
};

struct Answer {
    int calls = 0;
    int result = 99;
    std::string task;
    std::string text;
    int arrayLength = 0;
};

void onAnswer(app_control_h request, app_control_h reply, app_control_result_e result, void *data)
{
    auto *answer = static_cast<Answer *>(data);
    char *text = nullptr;
    char **array = nullptr;
    ++answer->calls;
    answer->result = result;
    if (app_control_get_extra_data(request, "do", &text) == APP_CONTROL_ERROR_NONE)
        answer->task = text;
    free(text);
    text = nullptr;
    if (app_control_get_extra_data(reply, "resume_by_app", &text) == APP_CONTROL_ERROR_NONE)
        answer->text = text;
    free(text);
    if (app_control_get_extra_data_array(reply, "server", &array, &answer->arrayLength) == 0) {
        for (int i = 0; i < answer->arrayLength; ++i)
            free(array[i]);
        free(array);
    }
}

int send(const std::string &id, const char *task, Answer *answer)
{
    app_control_h request = nullptr;
    app_control_create(&request);
    app_control_set_app_id(request, id.c_str());
    app_control_add_extra_data(request, "do", task);
    const int code = app_control_send_launch_request(request, onAnswer, answer);
    app_control_destroy(request);
    return code;
}

} // namespace

TEST_F(Launch, TheAnswerArrivesLaterAlthoughTheRequestIsDestroyed)
{
    Answer answer;
    ASSERT_EQ(APP_CONTROL_ERROR_NONE, send(app.id(), "answer", &answer));
    EXPECT_EQ(0, answer.calls);
    EXPECT_TRUE(turnUntil([&] { return answer.calls > 0; }));
    EXPECT_EQ(APP_CONTROL_RESULT_SUCCEEDED, answer.result);
    EXPECT_EQ("answer", answer.task);
    EXPECT_EQ("1", answer.text);
    EXPECT_EQ(2, answer.arrayLength);
}

TEST_F(Launch, AnApplicationThatIsNotInstalledIsNotFound)
{
    Answer answer;
    EXPECT_EQ(APP_CONTROL_ERROR_APP_NOT_FOUND, send("com.velmora.nobody", "answer", &answer));
    EXPECT_EQ(APP_CONTROL_ERROR_APP_NOT_FOUND, send("not an id", "answer", &answer));
    // The failed call's own answer is on its way; a complete launch behind it must be the first
    // heard.
    Answer next;
    send(app.id(), "answer", &next);
    EXPECT_TRUE(turnUntil([&] { return next.calls > 0; }));
    EXPECT_EQ(0, answer.calls);
}

TEST_F(Launch, ARequestThatNamesNoApplicationIsNotFound)
{
    app_control_h request = nullptr;
    app_control_create(&request);
    EXPECT_EQ(APP_CONTROL_ERROR_APP_NOT_FOUND,
              app_control_send_launch_request(request, nullptr, nullptr));
    EXPECT_EQ(APP_CONTROL_ERROR_INVALID_PARAMETER,
              app_control_send_launch_request(nullptr, nullptr, nullptr));
    app_control_destroy(request);
}

TEST_F(Launch, AProgramThatCannotRunFailsAtTheSend)
{
    Answer answer;
    gone = true;
    const std::string folder = std::string(std::getenv("XDG_DATA_HOME")) + "/dbus-1/services/";
    const std::string file = folder + app.id() + ".service";
    const std::string text = "[D-BUS Service]\nName=" + app.id() + "\nExec=/bin/false\n";
    ASSERT_TRUE(g_file_set_contents(file.c_str(), text.c_str(), -1, nullptr));
    g_autoptr(GDBusConnection) bus = g_bus_get_sync(G_BUS_TYPE_SESSION, nullptr, nullptr);
    g_autoptr(GVariant) reloaded = g_dbus_connection_call_sync(
        bus, "org.freedesktop.DBus", "/org/freedesktop/DBus", "org.freedesktop.DBus",
        "ReloadConfig", nullptr, nullptr, G_DBUS_CALL_FLAGS_NONE, -1, nullptr, nullptr);
    EXPECT_EQ(APP_CONTROL_ERROR_LAUNCH_FAILED, send(app.id(), "answer", &answer));
}

TEST_F(Launch, WithoutACallbackThereIsNoAnswerToGiveButAnsweringSucceeds)
{
    EXPECT_EQ(0, tell("answer").status);
    EXPECT_THAT(app.diary(), Contains("answered 0"));
}

TEST_F(Launch, OnlyTheFirstAnswerCounts)
{
    const Ended ended = ask("answer-twice");
    EXPECT_EQ(0, ended.status);
    EXPECT_EQ(
        "{\"result\":0,\"extras\":{\"resume_by_app\":\"1\",\"server\":[\"zorp\",\"second\"]}}\n",
        ended.out);
    EXPECT_THAT(app.diaryWith("answers"), Contains("answers 0 -22"));
}

TEST_F(Launch, AFailedAnswerIsTold)
{
    const Ended ended = ask("answer-failed");
    EXPECT_EQ(3, ended.status);
    EXPECT_THAT(ended.out, HasSubstr("\"result\":-1"));
}

TEST_F(Launch, ACloneAnswersAfterTheRequestIsGone)
{
    const Ended ended = ask("answer-clone");
    EXPECT_EQ(0, ended.status);
    EXPECT_THAT(ended.out, HasSubstr("\"resume_by_app\":\"1\""));
}

TEST_F(Launch, ARequestThatNobodyKeepsIsCancelled)
{
    const Ended ended = ask("note");
    EXPECT_EQ(4, ended.status);
    EXPECT_EQ("{\"result\":-2,\"extras\":{}}\n", ended.out);
}

TEST_F(Launch, AKeptRequestIsCancelledWithItsLastHandle)
{
    Answer answer;
    send(app.id(), "keep", &answer);
    EXPECT_EQ(0, tell("note").status);
    EXPECT_EQ(0, answer.calls);
    EXPECT_EQ(0, tell("drop").status);
    EXPECT_TRUE(turnUntil([&] { return answer.calls > 0; }));
    EXPECT_EQ(APP_CONTROL_RESULT_CANCELED, answer.result);
}

TEST_F(Launch, ACalleeThatDiesCancels)
{
    gone = true;
    const Ended ended = ask("crash");
    EXPECT_EQ(4, ended.status);
    EXPECT_THAT(ended.out, HasSubstr("\"result\":-2"));
}

TEST_F(Launch, ACalleeThatEndsCancelsWhatItKept)
{
    gone = true;
    Answer answer;
    send(app.id(), "keep", &answer);
    EXPECT_EQ(0, tell("exit").status);
    EXPECT_TRUE(turnUntil([&] { return answer.calls > 0; }));
    EXPECT_EQ(APP_CONTROL_RESULT_CANCELED, answer.result);
}

TEST_F(Launch, AnApplicationMayAskItself)
{
    EXPECT_EQ(0, tell("ask-self").status);
    EXPECT_THAT(
        app.diaryWith("reply"),
        Contains("reply 0 answer {\"resume_by_app\":\"1\",\"server\":[\"zorp\",\"second\"]}"));
    EXPECT_THAT(app.diary(), Contains("sent 0"));
}

TEST_F(Launch, AnApplicationMayTellItself)
{
    EXPECT_EQ(0, tell("tell-self").status);
    EXPECT_EQ(0, tell("ask-stranger").status);
    const std::vector<std::string> diary = app.diaryWith("sent -17825759");
    EXPECT_THAT(diary, Contains("sent 0"));
    EXPECT_THAT(diary, Contains(HasSubstr("\"do\":\"note\"")));
}

TEST_F(Launch, TheMainLoopOfTheToolkitBringsACancelledAnswer)
{
    const RecorderApp other("Other");
    EXPECT_EQ(0, appLaunch({"--app", app.id(), "--extra", "do=ask-crash", "--extra",
                            "whom=" + other.id()})
                     .status);
    EXPECT_THAT(app.diaryWith("reply"), Contains("reply -2 crash {}"));
}

TEST(AppLaunch, PrefixesOperationsAndKeysAndKeepsTheOrderOfArrays)
{
    const RecorderApp app("Prefix");
    const Ended ended =
        appLaunch({"--app", app.id(), "--operation", "appcontrol/operation/multi_share", "--mime",
                   "image/jpeg", "--extra-array", "appcontrol/data/path=/b=b.jpg", "--extra-array",
                   "list=1", "--extra-array", "appcontrol/data/path=/a.jpg", "--extra",
                   "appcontrol/data/text=hello", "--extra", "do=exit"});
    EXPECT_EQ(0, ended.status) << ended.err;
    EXPECT_THAT(app.diaryWith("first"),
                Contains("first {\"app_id\":\"com.velmora.testPrefix\",\"extras\":{\"do\":\"exit\","
                         "\"http://tizen.org/appcontrol/data/path\":[\"/b=b.jpg\",\"/a.jpg\"],"
                         "\"http://tizen.org/appcontrol/data/text\":\"hello\",\"list\":[\"1\"]},"
                         "\"mime\":\"image/jpeg\",\"operation\":\"http://tizen.org/appcontrol/"
                         "operation/multi_share\"}"));
}

TEST(AppLaunch, SaysWhatIsWrongInOneSentence)
{
    struct Case {
        std::vector<std::string> arguments;
        int status;
        std::string sentence;
    };
    const std::vector<Case> cases{
        {{}, 2, "app-launch: --app is required\n"},
        {{"--app", "com.velmora.x", "--extra", "novalue"},
         2,
         "app-launch: --extra: is not of the form KEY=VALUE\n"},
        {{"--app", "com.velmora.x", "--extra", "key="},
         1,
         "app-launch: the extra data \"key\" is refused: Invalid argument.\n"},
        {{"--app", "com.velmora.x", "--extra", "__key=1"},
         1,
         "app-launch: the extra data \"__key\" is refused: Key was rejected by service.\n"},
        {{"--app", "com.velmora.x"},
         1,
         "app-launch: com.velmora.x was not started: Application not found.\n"},
    };
    for (const Case &wrong : cases) {
        const Ended ended = appLaunch(wrong.arguments);
        EXPECT_EQ(wrong.status, ended.status);
        EXPECT_THAT(ended.err, testing::EndsWith(wrong.sentence));
    }
    EXPECT_EQ(0, appLaunch({"--help"}).status);
}
