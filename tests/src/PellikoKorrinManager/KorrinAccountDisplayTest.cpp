// A share of somebody who has no account yet: from the launch request to the sign-in and on.
#include "PellikoApp/PellikoApp.h"
#include "PellikoKorrinManager/KorrinAccount.h"
#include "PellikoUploadDataManager/UploadNotiData.h"
#include "PellikoUploadManager/ExitPolicy.h"
#include "support/FileLog.h"
#include "support/FreshProcess.h"
#include "support/LaunchRequest.h"
#include "support/MainLoop.h"
#include "support/SignInDouble.h"
#include "support/SignedIn.h"

#include <Evas.h>
#include <filesystem>
#include <fstream>
#include <gmock/gmock.h>
#include <sys/stat.h>

namespace pelliko::test
{
namespace
{

using ::testing::Contains;
using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::Not;
using ::testing::StartsWith;

constexpr const char *shared = "Operation Share/Multiple Share";
constexpr const char *exiting = "No upload_data request id exist so app is exiting";

// The first of all: the bus library must not have met the real bus.
TEST(SignInWithoutABus, RequestThatCannotBeSentIsLoggedAndTheApplicationStays)
{
    EXPECT_TRUE(holdsInFreshProcess([] {
        setenv("DBUS_SESSION_BUS_ADDRESS", "unix:path=/nowhere", 1);
        FileLog log;
        PellikoAppData ad;
        EXPECT_EQ(launchKorLoginScreen(&ad), 1);
        EXPECT_THAT(log.messages(),
                    ElementsAre(StartsWith("app_control_send_launch_request is failed ret = -")));
    }));
}

struct OpenApp : PellikoApp {
    using PellikoApp::onAppControl;
    using PellikoApp::onCreate;
    using PellikoApp::onTerminate;
};

class SignIn : public ::testing::Test
{
protected:
    static void SetUpTestSuite()
    {
        setenv("PELLIKO_APP_ID", "com.velmora.pelliko", 1);
        MainLoop::instance();
        app = new OpenApp;
        ASSERT_TRUE(app->onCreate());
        std::ofstream("/tmp/a.jpg") << "picture";
    }
    static void TearDownTestSuite()
    {
        app->onTerminate();
        delete app;
    }
    ~SignIn() override
    {
        _hideWindow(ad);
        // An answer that is still owed must not reach the next test.
        if (korrin.owes()) {
            log.restart();
            korrin.leave();
            EXPECT_TRUE(loop.runUntil([this] { return log.has("Exit App!!!"); }));
        }
        std::filesystem::remove_all(korrin::defaultAccountFile());
    }

    // Hands the application a share and waits until the sign-in application was asked, if it is to
    // be.
    void share(size_t requests = 1, const char *operation = APP_CONTROL_OPERATION_SHARE)
    {
        LaunchRequest request;
        app_control_set_operation(request, operation);
        app_control_set_uri(request, "/tmp/a.jpg");
        request.array(APP_CONTROL_DATA_PATH, {"/tmp/a.jpg"});
        app->onAppControl(request, false);
        ASSERT_TRUE(loop.runUntil([&] { return korrin.requests().size() >= requests; }));
    }

    // Answers, and returns what the application then logs up to its line `last`.
    std::vector<std::string> answer(int result, const std::map<std::string, std::string> &extras,
                                    const std::string &last)
    {
        log.restart();
        korrin.answer(0, result, extras);
        EXPECT_TRUE(loop.runUntil([&] { return log.has(last); })) << log.text();
        return log.messages();
    }

    bool windowIsShown() const { return ad->win && evas_object_visible_get(ad->win); }

    // What the real sign-in leaves behind before it answers.
    static void writeAccount(const std::string &imsi)
    {
        ASSERT_EQ(korrin::writeAccount(korrin::defaultAccountFile(),
                                       {"http://127.0.0.1:9", "+447700900100", "token", imsi}),
                  "");
    }

    static inline OpenApp *app = nullptr;
    MainLoop &loop = MainLoop::instance();
    PellikoAppData *ad = getAppData();
    SignInDouble korrin;
    FileLog log;
};

TEST_F(SignIn, SharerWithoutAnAccountIsAskedToSignIn)
{
    share();
    const SignInDouble::Request &asked = korrin.requests().front();
    EXPECT_EQ(asked.operation, "http://velmora.com/korrin/appcontrol/operation/auth");
    EXPECT_THAT(asked.servers, ElementsAre("zorp"));
    EXPECT_TRUE(asked.reply_wanted);
    const std::vector<std::string> messages = log.messages();
    ASSERT_GE(messages.size(), 2u);
    EXPECT_EQ(messages.end()[-2], "enhanced feature not registered");
    EXPECT_EQ(messages.back(), "launchKorLoginScreen return 1");
    EXPECT_THAT(messages, Not(Contains(shared)));
    // Its clear window would lie above the sign-in and swallow every touch.
    EXPECT_FALSE(windowIsShown());
}

// It would lie above the sign-in, and its Share button would take the new files.
TEST_F(SignIn, PopupOfAnEarlierShareGoesWhenTheSignInComes)
{
    writeAccount("262010000000001");
    share(0);
    ASSERT_NE(ad->popup, nullptr);
    EXPECT_EQ(korrin::removeAccount(korrin::defaultAccountFile()), "");
    share();
    EXPECT_EQ(ad->popup, nullptr);
    EXPECT_FALSE(windowIsShown());
}

TEST_F(SignIn, AccountThatCannotBeReadCountsAsNone)
{
    std::filesystem::create_directories(korrin::defaultAccountFile());
    share();
    EXPECT_THAT(log.messages(), Contains("kor_check_account_exist failed"));
    EXPECT_EQ(log.messages().back(), "launchKorLoginScreen return 1");
}

TEST_F(SignIn, ShareGoesOnAfterTheSignIn)
{
    share();
    writeAccount("310150000000001");
    const auto messages = answer(0,
                                 {{"imsi", "262010000000001"},
                                  {"accessToken", "a"},
                                  {"duid", "d"},
                                  {"pushToken", "p"},
                                  {"msisdn", "+49"}},
                                 shared);
    EXPECT_EQ(messages.front(), shared);
    EXPECT_NE(ad->popup, nullptr);
    EXPECT_TRUE(windowIsShown());
    EXPECT_EQ(korrin::findAccount(korrin::defaultAccountFile()).account.imsi, "262010000000001");
}

TEST_F(SignIn, SignInWithoutASimIsLoggedOnly)
{
    share();
    writeAccount("310150000000001");
    const auto messages = answer(0, {{"msisdn", "+49"}}, shared);
    EXPECT_THAT(messages.front(), StartsWith("kor_set_imsi failed, -"));
    EXPECT_NE(ad->popup, nullptr);
}

TEST_F(SignIn, CancelledSignInEndsTheShare)
{
    share();
    EXPECT_THAT(answer(-2, {}, exiting),
                ElementsAre("Not supported result : -2", "Exit App!!!", exiting));
    EXPECT_EQ(ad->popup, nullptr);
}

TEST_F(SignIn, SignInThatOnlyStartedEndsTheShareToo)
{
    share();
    EXPECT_THAT(answer(1, {{"imsi", "262010000000001"}}, exiting),
                ElementsAre("Not supported result : 1", "Exit App!!!", exiting));
}

TEST_F(SignIn, FailedSignInSaysWhyAndEndsTheShare)
{
    share();
    EXPECT_THAT(answer(-1, {{"errorCode", "17"}, {"errorMessage", "no network"}}, exiting),
                ElementsAre("error_code :[17]: no network", "Exit App!!!", exiting));
    EXPECT_EQ(ad->popup, nullptr);
}

TEST_F(SignIn, FailedSignInWithoutAReasonEndsTheShare)
{
    share();
    EXPECT_THAT(answer(-1, {}, exiting),
                ElementsAre("error_code :[(null)]: (null)", "Exit App!!!", exiting));
}

TEST_F(SignIn, SignInThatDiesEndsTheShare)
{
    share();
    log.restart();
    korrin.leave();
    EXPECT_TRUE(loop.runUntil([this] { return log.has(exiting); })) << log.text();
    EXPECT_EQ(log.messages().front(), "Not supported result : -2");
}

TEST_F(SignIn, CancelledSignInKeepsTheApplicationWhileAnUploadIsPending)
{
    UploadNotiData *pending = addUploadNotiDataNode();
    pending->request_id = 7;
    share();
    const std::string stays = "upload_data request id is not 0 app can't exit";
    EXPECT_THAT(answer(-2, {}, stays),
                ElementsAre("Not supported result : -2", "Exit App!!!", stays));
    g_current_node = pending;
    removeUploadNotiDataNode(REMOVE_NODE);
}

TEST_F(SignIn, OtherRequestsBeforeTheAnswerDoNotChangeWhatGoesOn)
{
    for (const char *operation : {APP_CONTROL_OPERATION_SHARE, APP_CONTROL_OPERATION_MULTI_SHARE}) {
        SCOPED_TRACE(operation);
        share(korrin.requests().size() + 1, operation);
        const int32_t wanted = ad->operation_type;
        LaunchRequest other;
        app_control_set_operation(other, APP_CONTROL_OPERATION_DEFAULT);
        app->onAppControl(other, false);
        EXPECT_EQ(ad->operation_type, OPERATION_DEFAULT);
        log.restart();
        korrin.answer(korrin.requests().size() - 1, 0, {{"imsi", "262010000000001"}});
        EXPECT_TRUE(loop.runUntil([this] { return log.has(shared); }));
        EXPECT_EQ(ad->operation_type, wanted);
        EXPECT_NE(ad->popup, nullptr);
    }
}

TEST_F(SignIn, SharerWithAnAccountIsNotAsked)
{
    writeAccount("262010000000001");
    share(0);
    EXPECT_THAT(log.messages(), Contains("enhanced feature registered"));
    EXPECT_NE(ad->popup, nullptr);
    EXPECT_TRUE(korrin.requests().empty());
}

TEST_F(SignIn, AccountWhoseSimCannotBeNotedIsAnAccount)
{
    writeAccount(""); // the SIM is then found out, and to be noted
    // What stands where the account's next version would be written.
    const std::string draft = korrin::defaultAccountFile() + ".new";
    std::filesystem::create_directories(draft + "/in the way");
    log.restart();
    EXPECT_EQ(isKorAccountExist(), 1);
    std::filesystem::remove_all(draft);
    EXPECT_THAT(log.messages(),
                ElementsAre(StartsWith("kor_set_imsi failed, -"), "enhanced feature registered"));
}

TEST_F(SignIn, OnlySharesNeedAnAccount)
{
    LaunchRequest other;
    app_control_set_operation(other, APP_CONTROL_OPERATION_DEFAULT);
    app->onAppControl(other, false);
    EXPECT_THAT(log.messages(), Not(Contains(HasSubstr("enhanced feature"))));
    EXPECT_TRUE(korrin.requests().empty());
}

TEST_F(SignIn, ClientThatIsOpenIsOpenedAgain)
{
    initKor();
    EXPECT_THAT(log.messages(), ElementsAre("g_kor_handle is not null, no need to open"));
    writeAccount("262010000000001");
    EXPECT_EQ(isKorAccountExist(), 1);
}

TEST_F(SignIn, NothingIsDoneWithoutARecord)
{
    EXPECT_EQ(launchKorLoginScreen(nullptr), 0);
    _korLoginReplyCb(nullptr, nullptr, APP_CONTROL_RESULT_SUCCEEDED, nullptr);
    EXPECT_THAT(log.messages(),
                ElementsAre("[ERROR][(ad == NULL)] Return value : 0, message : ad is NULL",
                            "[ERROR][(ad == NULL)] Return message : ad is NULL"));
}

} // namespace
} // namespace pelliko::test
