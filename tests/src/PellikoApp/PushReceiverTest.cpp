// Pushes from the launch request to the panel, with the real upload library.
#include "PellikoNotificationManager/SenderNames.h"
#include "PushReceiverScene.h"
#include "platform/quickpanel/support/RecordingApplication.h"
#include "support/RefusingStore.h"

#include <Ecore.h>
#include <gmock/gmock.h>
#include <thread>
#include <utility>

namespace pelliko::test
{
namespace
{

using panel_testing::RecordingApplication;
using ::testing::ElementsAre;
using ::testing::IsEmpty;
using ::testing::StartsWith;

TEST_F(PushReceiver, OneTokenGoesIntoTheFields)
{
    pushAndWait({"T1"});
    EXPECT_EQ(ad->operation_type, OPERATION_PUSH);
    EXPECT_THAT(records(), IsEmpty());
    EXPECT_EQ(textOf(ad->sender_name), "Ann Example");
    EXPECT_EQ(textOf(ad->sender_msisdn), "+447700900001");
    EXPECT_EQ(ad->thumbnails_count, 3);
    EXPECT_EQ(ad->data_index, 1);
    EXPECT_EQ(kept(), "1 T1|");
    const Posted noti = posted("PUSH_NOTI").value();
    EXPECT_EQ(noti.title, "Ann Example");
    EXPECT_EQ(noti.icon, ad->sender_image_path);
    EXPECT_EQ(noti.extras.at("contents_token"), "T1");
}

TEST_F(PushReceiver, OfThreeTokensTwoBecomeRecords)
{
    pushAndWait({"T1", "T3", "T2"});
    EXPECT_THAT(records(), ElementsAre("3|4000000300|1800000000|+447700900001|Ann Example|T1",
                                       "2|15|1800000000|+447700900003|(null)|T3"));
    EXPECT_EQ(textOf(ad->sender_name), "Bob Example");
    EXPECT_EQ(ad->thumbnails_count, 1);
    EXPECT_EQ(kept(), "3 T1|T3|T2");
    EXPECT_EQ(posted("PUSH_NOTI")->content, "Bob Example, +447700900003, Ann Example");
    EXPECT_THAT(service.asked(), ElementsAre("T1", "T3", "T2"));
}

// What the threads say after they have handed over comes at any time.
TEST_F(PushReceiver, TheTraceOfTwoTokens)
{
    pushAndWait({"T1", "T2"});
    EXPECT_TRUE(waitForWorkers(std::chrono::seconds(20)));
    auto lines = log.messages();
    for (const char *line :
         {"pelliko_push_info_request success", "operation_type=[1]", "write pipe success"}) {
        const auto found = std::find(lines.begin(), lines.end(), line);
        ASSERT_NE(found, lines.end()) << line;
        lines.erase(found);
    }
    lines.resize(std::min<size_t>(lines.size(), 20));
    EXPECT_THAT(
        lines,
        ElementsAre(
            "token_length = 2", "reset noti backup count = 2", "get shared token list info success",
            "thumbnails_count = 3", "current item size = 100", "current item size = 200",
            "current item size = 4000000000", "expired_time = 1800000000",
            "contact name[0] = Ann Example", "First contact name = Ann Example", "data_index = 0",
            "token_length = 2, data_index = 1", "T2, ad->data_index[1]", "thumbnails_count = 1",
            "current item size = 50", "expired_time = 1800000000", "contact name[0] = Bob Example",
            "First contact name = Bob Example", "token_length = 2, data_index = 2",
            ">>>>>>>>>>>>> noti create success <<<<<<<<<<<<<<<<"));
}

TEST_F(PushReceiver, AnUnknownNumberStandsForItsName)
{
    pushAndWait({"T3"});
    EXPECT_EQ(textOf(ad->sender_name), "+447700900003");
    EXPECT_EQ(posted("PUSH_NOTI")->title, "+447700900003");
    EXPECT_EQ(posted("PUSH_NOTI")->icon, "reserved:default_caller_id");
}

TEST_F(PushReceiver, AnUnknownSenderIsTheDefaultOne)
{
    pushAndWait({"Tnobody"});
    EXPECT_EQ(textOf(ad->sender_msisdn), "default");
    EXPECT_EQ(ad->thumbnails_count, 1);
}

TEST_F(PushReceiver, ATokenThatDoesNotExistIsAnEmptyShare)
{
    service.add("Texpired", {"+447700900001", {1}, 0, -62});
    pushAndWait({"Tunheard", "Texpired"});
    EXPECT_THAT(records(), ElementsAre("0|0|0|default|(null)|Tunheard"));
    EXPECT_EQ(ad->thumbnails_count, 0);
    EXPECT_TRUE(log.has("get thumbnails_count error!! error_code = -2"));
    EXPECT_TRUE(log.has("get expired time error!! error_code = -62"));
    EXPECT_TRUE(posted("PUSH_NOTI"));
}

TEST_F(PushReceiver, ThePictureOfTheSenderBeforeIsForgotten)
{
    pushAndWait({"T1"});
    log.restart();
    pushAndWait({"T3"});
    EXPECT_EQ(posted("PUSH_NOTI")->icon, "reserved:default_caller_id");
}

TEST_F(PushReceiver, ALongTokenIsKeptCut)
{
    const std::string token(24, 't');
    pushAndWait({token});
    EXPECT_EQ(kept(), "1 " + token);
    log.restart();
    const std::string endless(1000, 'x');
    pushAndWait({endless});
    EXPECT_EQ(kept(), "1 " + endless.substr(0, 24));
}

TEST_F(PushReceiver, ThirtyTokensAtOnceAreOneAnnouncement)
{
    std::vector<std::string> tokens;
    for (int i = 0; i < 30; ++i) {
        tokens.push_back("Token" + std::to_string(i));
        service.add(tokens.back(), {"+4477009100" + std::to_string(10 + i), {i}});
    }
    pushAndWait(tokens);
    EXPECT_EQ(service.asked(), tokens);
    EXPECT_EQ(records().size(), 29);
    EXPECT_EQ(posted("PUSH_NOTI")->content,
              "+447700910019, +447700910018, +447700910017, +447700910016, +447700910015, "
              "+447700910014, +447700910013, +447700910012, +447700910011, +447700910010");
}

TEST_F(PushReceiver, ARequestWithoutTokensIsRefused)
{
    ad->operation_type = OPERATION_SEND_SMS;
    receivePush(ad, LaunchRequest());
    EXPECT_EQ(ad->operation_type, OPERATION_SEND_SMS);
    EXPECT_THAT(log.messages(), ElementsAre("error!! get shared token list info failed!!"));
    EXPECT_EQ(_getPushInfo(nullptr, LaunchRequest()), -1);
    EXPECT_TRUE(log.has("[ERROR][(ad == NULL)] Return value : -1, message : ad is NULL"));
}

TEST_F(PushReceiver, APushWhoseTokensCannotBeKeptIsRefused)
{
    ad->operation_type = OPERATION_SEND_SMS;
    {
        const RefusingStore store;
        push({"T1"});
    }
    EXPECT_THAT(log.messages(), ElementsAre("token_length = 1", "reset noti backup count = 1",
                                            "Error in setting PREFERENCE KEY SHARE_NOTI_BACKUPED",
                                            StartsWith("preference set thumbnail path fail -"),
                                            "error!! get shared token list info failed!!"));
    EXPECT_EQ(ad->operation_type, OPERATION_SEND_SMS);
    loop.settle();
    EXPECT_THAT(service.asked(), IsEmpty());
}

TEST_F(PushReceiver, AnOpenPopupStays)
{
    ad->popup = reinterpret_cast<Evas_Object *>(ad);
    push({"T1"});
    EXPECT_TRUE(waitFor("Popup is open.. can't exit")) << log.text();
    EXPECT_TRUE(posted("PUSH_NOTI"));
    ad->popup = nullptr;
}

TEST_F(PushReceiver, APendingUploadKeepsTheApplication)
{
    addNode(7, {"/a"}, 10, "Ann?", "31?");
    push({"T1"});
    EXPECT_TRUE(waitFor("upload_data request id is not 0 app can't exit")) << log.text();
    EXPECT_TRUE(posted("PUSH_NOTI"));
}

TEST_F(PushReceiver, WhatComesThroughThePipeAlwaysEndsWithTheExitRule)
{
    char failed[] = "failed";
    _receiverRegisterGroupNoti(ad, failed, sizeof(failed));
    EXPECT_THAT(log.messages(), ElementsAre("notification panel error!", left));
    log.restart();
    char other[] = "successful";
    _receiverRegisterGroupNoti(ad, other, sizeof(other));
    _receiverRegisterGroupNoti(ad, nullptr, 0);
    EXPECT_THAT(log.messages(), ElementsAre(left, left));
    EXPECT_FALSE(posted("PUSH_NOTI"));
    log.restart();
    _receiverRegisterGroupNoti(nullptr, failed, sizeof(failed));
    _receiverServiceGetGroupInfoCb(0, nullptr, nullptr, nullptr);
    EXPECT_THAT(log.messages(),
                ElementsAre("[ERROR][(ad == NULL)] Return message : data is NULL",
                            "[ERROR][(ad == NULL)] Return message : user_data is NULL"));
}

// The library's answer comes after the pipe is gone.
TEST_F(PushReceiver, AnAnswerWithoutAPipeStaysUnannounced)
{
    Ecore_Pipe *pipe = std::exchange(ad->pipe, nullptr);
    auto **tokens = static_cast<char **>(calloc(1, sizeof(char *)));
    tokens[0] = strdup("T1");
    replaceContentsTokens(ad, tokens, 1);
    ad->data_index = 0;
    std::thread([this] { _receiverServiceGetGroupInfoCb(0, "T1", nullptr, ad); }).join();
    ad->pipe = pipe;
    loop.settle();
    EXPECT_EQ(log.messages().back(), "write pipe failed!!");
    EXPECT_EQ(textOf(ad->sender_name), "default");
    EXPECT_FALSE(posted("PUSH_NOTI"));
}

TEST_F(PushReceiver, ARunningHistoryGetsThePushToo)
{
    LaunchRequest request;
    app_control_set_operation(request, APP_CONTROL_OPERATION_SEND);
    request.array("contents_token_list", {"T1", "T2"});
    _forwardPushAppControl(request);
    EXPECT_THAT(log.messages(), ElementsAre("History app is NOT running"));
    log.restart();
    const RecordingApplication history("com.velmora.pelliko-history");
    _forwardPushAppControl(request);
    EXPECT_TRUE(loop.runUntil([&] { return !history.launches().empty(); }));
    EXPECT_EQ(history.launches()[0].operation, APP_CONTROL_OPERATION_SEND);
    EXPECT_FALSE(history.launches()[0].replyWanted);
    EXPECT_THAT(log.messages(), IsEmpty());
    _forwardPushAppControl(nullptr);
    EXPECT_THAT(log.messages(),
                ElementsAre(StartsWith("app_control_clone error -"),
                            StartsWith("app_control_set_app_id error -"),
                            StartsWith("app_control_send_launch_request is failed ret = -")));
}

} // namespace
} // namespace pelliko::test
