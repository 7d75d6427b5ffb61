#include "PellikoKorrinManager/KorrinAccount.h"

#include "AppLog/AppLog.h"
#include "PellikoApp/CText.h"
#include "PellikoApp/Operation.h"
#include "PellikoUploadManager/ExitPolicy.h"

#include <iterator>
#include <kor_client.h>

namespace pelliko
{

namespace
{

constexpr const char *signInApplication = "com.velmora.korrin";
constexpr const char *signInOperation = "http://velmora.com/korrin/appcontrol/operation/auth";
constexpr const char *serverKey = "server";

kor_handle_h g_kor_handle = nullptr;

// What the user was doing when the sign-in came between: other requests may arrive meanwhile.
int32_t g_operation_to_go_on = OPERATION_DEFAULT;

CText _replyText(app_control_h reply, const char *key)
{
    char *text = nullptr;
    app_control_get_extra_data(reply, key, &text);
    return CText(text);
}

void _leave()
{
    LOG_DEBUG("Exit App!!!");
    safeExit();
}

void _leaveAfterFailure(app_control_h reply)
{
    const CText code = _replyText(reply, "errorCode");
    const CText message = _replyText(reply, "errorMessage");
    LOG_DEBUG("error_code :[%s]: %s", textOrNull(code.get()), textOrNull(message.get()));
    _leave();
}

// The answer also carries the account's tokens, for which only the account client has a use.
void _goOn(app_control_h reply, PellikoAppData *ad)
{
    const CText imsi = _replyText(reply, "imsi");
    _setKorImsi(imsi.get());
    ad->operation_type = g_operation_to_go_on;
    doOperation(ad);
}

} // namespace

void initKor()
{
    if (g_kor_handle)
        LOG_DEBUG("g_kor_handle is not null, no need to open");
    const int ret = kor_open_handle(&g_kor_handle);
    if (ret != 0)
        LOG_ERROR("kor_open_handle failed, %d", ret);
}

int isKorAccountExist()
{
    char *text = nullptr;
    int state = 0;
    const int ret = kor_check_account_exist(g_kor_handle, &text, &state);
    const CText imsi(text);
    if (ret != 0) {
        LOG_ERROR("kor_check_account_exist failed");
        return 0;
    }
    if (!imsi) {
        LOG_DEBUG("enhanced feature not registered");
        return 0;
    }
    _setKorImsi(imsi.get());
    LOG_DEBUG("enhanced feature registered");
    return 1;
}

int launchKorLoginScreen(PellikoAppData *ad)
{
    RETURN_VALUE_IF_NULL(ad, 0, "ad is NULL");
    app_control_h request = nullptr;
    if (app_control_create(&request) != APP_CONTROL_ERROR_NONE) {
        LOG_ERROR("app_control_create() is failed !!");
        return 0;
    }
    g_operation_to_go_on = ad->operation_type;
    app_control_set_app_id(request, signInApplication);
    app_control_set_operation(request, signInOperation);
    const char *servers[] = {"zorp"};
    app_control_add_extra_data_array(request, serverKey, servers, std::size(servers));
    const int ret = app_control_send_launch_request(request, _korLoginReplyCb, ad);
    if (ret != APP_CONTROL_ERROR_NONE)
        LOG_ERROR("app_control_send_launch_request is failed ret = %d", ret);
    app_control_destroy(request);
    return 1;
}

void _korLoginReplyCb(app_control_h /*request*/, app_control_h reply, app_control_result_e result,
                      void *data)
{
    auto *ad = static_cast<PellikoAppData *>(data);
    RETURN_IF_NULL(ad, "ad is NULL");
    switch (result) {
    case APP_CONTROL_RESULT_SUCCEEDED:
        _goOn(reply, ad);
        break;
    case APP_CONTROL_RESULT_FAILED:
        _leaveAfterFailure(reply);
        break;
    default:
        LOG_DEBUG("Not supported result : %d", result);
        _leave();
    }
}

void _setKorImsi(const char *imsi)
{
    const int ret = kor_set_imsi(g_kor_handle, imsi);
    if (ret != 0)
        LOG_ERROR("kor_set_imsi failed, %d", ret);
}

} // namespace pelliko
