// The dispatcher inside the test's own process, where the record and the window can be looked at.
#include "PellikoApp/AppData.h"
#include "PellikoApp/ContactVcard.h"
#include "PellikoApp/Operation.h"
#include "PellikoApp/PellikoApp.h"
#include "PellikoDatabaseManager/UploadInfoDatabase.h"
#include "PellikoUploadManager/ExitPolicy.h"
#include "support/FileLog.h"
#include "support/LaunchRequest.h"
#include "support/SignedIn.h"

#include <Elementary.h>
#include <fstream>
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <pelliko_operations.h>

namespace pelliko
{
namespace
{

using test::LaunchRequest;
using ::testing::Contains;
using ::testing::ElementsAre;
using ::testing::IsEmpty;
using ::testing::Not;
using ::testing::StartsWith;

struct OpenApp : PellikoApp {
    using PellikoApp::onAppControl;
    using PellikoApp::onCreate;
    using PellikoApp::onTerminate;
};

class Dispatch : public ::testing::Test
{
protected:
    static void SetUpTestSuite()
    {
        elm_init(0, nullptr);
        app = new OpenApp;
        ASSERT_TRUE(app->onCreate());
        std::ofstream("/tmp/a.jpg") << "picture";
    }
    static void TearDownTestSuite()
    {
        app->onTerminate();
        delete app;
        elm_shutdown();
    }
    ~Dispatch() override { _hideWindow(ad); }

    void share(const char *uri)
    {
        LaunchRequest request;
        app_control_set_operation(request, APP_CONTROL_OPERATION_SHARE);
        app_control_set_uri(request, uri);
        app->onAppControl(request, false);
    }

    void ask(const char *operation)
    {
        LaunchRequest request;
        app_control_set_operation(request, operation);
        app->onAppControl(request, false);
    }

    bool windowIsShown() const { return ad->win && evas_object_visible_get(ad->win); }

    static inline OpenApp *app = nullptr;
    test::SignedIn account;
    PellikoAppData *ad = getAppData();
    test::FileLog log;
};

TEST_F(Dispatch, RequestThatIsMissingIsRefused)
{
    app->onAppControl(nullptr, false);
    EXPECT_THAT(log.messages(), ElementsAre("[ERROR][(request == NULL)] Return message : Service "
                                            "is NULL"));
}

TEST_F(Dispatch, ShareShowsTheWindowAgainAfterItWasHidden)
{
    share("/tmp/a.jpg");
    EXPECT_TRUE(windowIsShown());
    EXPECT_NE(ad->popup, nullptr);
    _hideWindow(ad);
    EXPECT_FALSE(windowIsShown());
    share("/tmp/a.jpg");
    EXPECT_TRUE(windowIsShown());
}

TEST_F(Dispatch, ShareThatIsNotUnderstoodLeavesNoClearWindowInTheWay)
{
    share("a.jpg");
    EXPECT_EQ(ad->popup, nullptr);
    EXPECT_FALSE(windowIsShown());
}

TEST_F(Dispatch, ShareThatIsNotUnderstoodLeavesAnOpenPopupAlone)
{
    share("/tmp/a.jpg");
    const Evas_Object *popup = ad->popup;
    share("a.jpg");
    EXPECT_EQ(ad->popup, popup);
    EXPECT_TRUE(windowIsShown());
}

TEST_F(Dispatch, ShareThatIsNotUnderstoodLeavesTheProcessingPopupAlone)
{
    share("/tmp/a.jpg");
    evas_object_del(ad->popup);
    ad->popup = nullptr;
    _showProcessingPopup(ad);
    ASSERT_NE(ad->processing_popup, nullptr);
    share("a.jpg");
    EXPECT_TRUE(windowIsShown());
    evas_object_del(ad->processing_popup);
}

TEST_F(Dispatch, EveryRequestIsKeptAsAClone)
{
    {
        LaunchRequest request;
        app_control_set_operation(request, "first");
        request.text("key", "value");
        app->onAppControl(request, false);
    }
    char *value = nullptr;
    EXPECT_EQ(app_control_get_extra_data(ad->app_control, "key", &value), APP_CONTROL_ERROR_NONE);
    EXPECT_STREQ(value, "value");
    free(value);
    app->onAppControl(LaunchRequest(), false);
    EXPECT_EQ(app_control_get_extra_data(ad->app_control, "key", &value),
              APP_CONTROL_ERROR_KEY_NOT_FOUND);
}

TEST_F(Dispatch, ShareEndsAResumeAndReshareIsForgottenByTheNextShare)
{
    ad->is_resume_by_reboot = 1;
    LaunchRequest reshare;
    app_control_set_operation(reshare, APP_CONTROL_OPERATION_MULTI_SHARE);
    reshare.text("pk_reshare", "5");
    app->onAppControl(reshare, false);
    EXPECT_EQ(ad->action_type, ACTION_RESHARE_UPLOAD);
    EXPECT_EQ(ad->operation_type, OPERATION_MULTI_SHARE);
    EXPECT_EQ(ad->req_id_to_reshare, 5);
    EXPECT_EQ(ad->is_resume_by_reboot, 0);
    share("/tmp/a.jpg");
    EXPECT_EQ(ad->action_type, ACTION_UPLOAD);
    EXPECT_EQ(ad->operation_type, OPERATION_SHARE);
    EXPECT_EQ(ad->req_id_to_reshare, 5);
}

TEST_F(Dispatch, ShareBeyondALimitTakesThePopupAwayAndLetsTheApplicationGo)
{
    share("/tmp/a.jpg");
    ad->wifi_check = 1;
    std::ofstream("/tmp/empty.jpg");
    log.restart();
    share("/tmp/empty.jpg");
    EXPECT_EQ(ad->popup, nullptr);
    EXPECT_EQ(ad->wifi_check, 0);
    const std::vector<std::string> messages = log.messages();
    ASSERT_GE(messages.size(), 2u);
    EXPECT_EQ(messages.end()[-2], "Operation Share/Multiple Share");
    EXPECT_EQ(messages.back(), "No upload_data request id exist so app is exiting");
}

// Its files are at the server already.
TEST_F(Dispatch, ReshareIsNotHeldAgainstTheLimits)
{
    std::ofstream("/tmp/empty.jpg");
    share("/tmp/empty.jpg");
    LaunchRequest reshare;
    app_control_set_operation(reshare, APP_CONTROL_OPERATION_SHARE);
    reshare.text("pk_reshare", "5");
    app->onAppControl(reshare, false);
    EXPECT_NE(ad->popup, nullptr);
}

TEST_F(Dispatch, OperationsWithoutAMeaningDoNothing)
{
    for (const int32_t operation : {3, 7, 1000, -1}) {
        ad->operation_type = operation;
        doOperation(ad);
    }
    ad->operation_type = OPERATION_DEFAULT;
    EXPECT_THAT(log.messages(), IsEmpty());
}

TEST_F(Dispatch, AcceptedPushLeavesTheWorkToItsWorker)
{
    ad->operation_type = OPERATION_PUSH;
    doOperation(ad);
    ad->operation_type = OPERATION_DEFAULT;
    EXPECT_THAT(log.messages(), ElementsAre("Push notification."));
}

TEST_F(Dispatch, RefusedPushIsPassedOnAndRunsTheLastOperationAgain)
{
    ad->operation_type = OPERATION_DEFAULT;
    ad->is_resume_by_reboot = 0;
    ask(APP_CONTROL_OPERATION_SEND);
    EXPECT_EQ(ad->operation_type, OPERATION_DEFAULT);
    EXPECT_THAT(log.messages(),
                ElementsAre(StartsWith("operation = "), "Push message received !!",
                            StartsWith("type: 0, feature: PK10 [Pelliko_Receive_notification]"),
                            "error!! get shared token list info failed!!",
                            "History app is NOT running", "Default Case...",
                            "No need to action for operation default"));
}

// No push was ever announced in this world.
TEST_F(Dispatch, ServiceThatComesBackWithNothingKeptEndsTheApplication)
{
    ad->operation_type = OPERATION_DEFAULT;
    ask(APP_CONTROL_OPERATION_SERVICE_ON);
    EXPECT_EQ(ad->operation_type, OPERATION_DEFAULT);
    const std::vector<std::string> messages = log.messages();
    ASSERT_GE(messages.size(), 2u);
    EXPECT_EQ(messages[1], "Service ON operation");
    EXPECT_THAT(messages, Not(Contains("noti restored")));
    EXPECT_THAT(messages, Not(Contains("Default Case...")));
}

TEST_F(Dispatch, AccountThatIsGoneTakesTheTableWithItOnce)
{
    ad->operation_type = OPERATION_DEFAULT;
    for (const char *outcome :
         {"Database file deleted successfully...!!!", "Database deletion failed...!!!"}) {
        log.restart();
        ask(APP_CONTROL_OPERATION_DEREGISTERED);
        const std::vector<std::string> messages = log.messages();
        ASSERT_GE(messages.size(), 3u);
        EXPECT_EQ(messages[1], "Deregistered operation");
        EXPECT_EQ(messages[2], outcome);
        EXPECT_THAT(messages, Not(Contains("Default Case...")));
    }
    createTableUploadInfoDb();
}

TEST_F(Dispatch, AnswerToARequestOfNobodyIsNoSuccess)
{
    freeUploadData(ad->upload_item);
    ad->upload_item = nullptr;
    LaunchRequest request; // made here: nobody waits for its answer
    app_control_set_operation(request, APP_CONTROL_OPERATION_DEFAULT);
    app->onAppControl(request, false);
    EXPECT_THAT(
        log.messages(),
        ElementsAre(StartsWith("operation = "), "Default operation, check upload/download resume",
                    StartsWith("data/to array len = 0, ret = "), "resume_by_app:1",
                    StartsWith("app_control_reply_to_launch_request failed : error = -"),
                    "Default Case...", "Resume By Reboot", "There is no resume case after reboot"));
    ad->is_resume_by_reboot = 0;
}

TEST_F(Dispatch, EndReleasesTheTables)
{
    share("/tmp/a.jpg");
    app->onTerminate();
    EXPECT_EQ(ad->color_table, nullptr);
    EXPECT_EQ(ad->font_table, nullptr);
    app->onTerminate();
}

} // namespace
} // namespace pelliko
