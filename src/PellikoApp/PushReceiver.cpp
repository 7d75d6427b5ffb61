#include "PellikoApp/PushReceiver.h"

#include "AppLog/AppLog.h"
#include "PellikoApp/PushInfo.h"
#include "PellikoApp/TextFormat.h"
#include "PellikoApp/Workers.h"
#include "PellikoNotificationManager/NotificationBackup.h"
#include "PellikoNotificationManager/ReceivedShareNotifications.h"
#include "PellikoNotificationManager/SenderNames.h"
#include "PellikoUploadManager/ExitPolicy.h"

#include <Ecore.h>
#include <app_preference.h>
#include <aul.h>
#include <contacts.h>
#include <cstring>
#include <deque>
#include <glib.h>
#include <memory>
#include <string>
#include <type_traits>
#include <utility>

namespace pelliko
{

namespace
{

constexpr const char *tokensKey = "contents_token_list";
constexpr const char *historyId = "com.velmora.pelliko-history";
constexpr const char *separator = "|";
constexpr double longestFinish = 10.0; ///< seconds
constexpr size_t roomPerToken = 25;    ///< bytes of a stored token with its separator
constexpr char successMessage[] = "success";
constexpr char failedMessage[] = "failed";

void _replaceText(char **field, const char *text)
{
    g_free(*field);
    *field = g_strdup(text);
}

// A single token is followed by a separator, the last of several is not.
std::string _joinTokens(char *const *tokens, int length)
{
    std::string joined(roomPerToken * static_cast<size_t>(length), '\0');
    for (int i = 0; i < length; ++i) {
        g_strlcat(joined.data(), tokens[i] ? tokens[i] : "", joined.size());
        if (i + 1 < length || length == 1)
            g_strlcat(joined.data(), separator, joined.size());
    }
    dropBrokenCharacter(joined.data());
    return joined.c_str();
}

// Null when the record has no such token; the library refuses that.
const char *_tokenAt(const PellikoAppData *ad, int32_t index)
{
    return ad->contents_token_list && index < ad->token_length ? ad->contents_token_list[index]
                                                               : nullptr;
}

// The pipe belongs to the main loop: it is made while that one waits. The one before is not in use
// any more.
int32_t _makePipe(PellikoAppData *ad)
{
    ecore_thread_main_loop_begin();
    if (ad->pipe)
        ecore_pipe_del(ad->pipe);
    ad->pipe = ecore_pipe_add(_receiverRegisterGroupNoti, ad);
    const int32_t operation_type = ad->operation_type;
    ecore_thread_main_loop_end();
    return operation_type;
}

bool _requestFirst(PellikoAppData *ad)
{
    if (!ad->pipe)
        return false;
    g_list_free_full(ad->push_info_list, g_free);
    ad->push_info_list = nullptr;
    ad->data_index = 0;
    const int ret = pelliko_push_info_request(_tokenAt(ad, 0), _receiverServiceGetGroupInfoCb, ad);
    if (ret != PELLIKO_ERROR_NONE)
        LOG_ERROR("error!! ret = %d", ret);
    else
        LOG_DEBUG("pelliko_push_info_request success");
    return ret == PELLIKO_ERROR_NONE;
}

void _keepLast(PellikoAppData *ad, const PushInfo &share)
{
    _replaceText(&ad->sender_name, share.nameOrNumber());
    _replaceText(&ad->sender_msisdn, share.number.c_str());
    ad->thumbnails_count = static_cast<int32_t>(share.count);
    ++ad->data_index;
}

void _keepRecord(PellikoAppData *ad, const PushInfo &share)
{
    const std::string record = pushRecord(share, textOrNull(_tokenAt(ad, ad->data_index)));
    ad->push_info_list = g_list_append(ad->push_info_list, g_strdup(record.c_str()));
    LOG_DEBUG("data_index = %d", ad->data_index);
    ++ad->data_index;
}

bool _requestNext(PellikoAppData *ad)
{
    const char *token = _tokenAt(ad, ad->data_index);
    LOG_DEBUG("%s, ad->data_index[%d]", textOrNull(token), ad->data_index);
    const int res = pelliko_push_info_request(token, _receiverServiceGetGroupInfoCb, ad);
    if (res != PELLIKO_ERROR_NONE)
        LOG_ERROR("error res = %d", res);
    return res == PELLIKO_ERROR_NONE;
}

bool _wakeMainLoop(PellikoAppData *ad)
{
    if (!ad->pipe || !ecore_pipe_write(ad->pipe, successMessage, sizeof(successMessage))) {
        LOG_ERROR("write pipe failed!!");
        return false;
    }
    LOG_DEBUG("write pipe success");
    const int ct_err = contacts_disconnect_on_thread();
    if (ct_err != CONTACTS_ERROR_NONE)
        LOG_ERROR("contacts_disconnect_on_thread failed : ct_err = [%d]", ct_err);
    return true;
}

// What the push before left must not be taken for this one's.
void _forgetSender(PellikoAppData *ad)
{
    for (char **text : {&ad->sender_name, &ad->sender_msisdn, &ad->sender_image_path})
        _replaceText(text, nullptr);
    ad->sender_name_fallback = nullptr;
}

struct DestroyRequest {
    void operator()(app_control_h request) const { app_control_destroy(request); }
};
using Request = std::unique_ptr<std::remove_pointer_t<app_control_h>, DestroyRequest>;

// Whose turn it is; the main loop's alone.
struct Turns {
    bool under_way = false;
    bool abandoned = false; ///< nothing is announced any more
    bool finishing = false; ///< finishPushes() runs the loop
    std::deque<Request> waiting;
};

Turns &_turns()
{
    static Turns turns;
    return turns;
}

// Failing here and below ends the push without an announcement.
bool _takeTokens(PellikoAppData *ad, app_control_h request)
{
    if (_getPushInfo(ad, request) != 0) {
        LOG_ERROR("error!! get shared token list info failed!!");
        return false;
    }
    LOG_DEBUG("get shared token list info success");
    return true;
}

// The push in turn is the operation from now on: the one before must not run a second time for it.
void _wait(PellikoAppData *ad, app_control_h request)
{
    app_control_h clone = nullptr;
    if (app_control_clone(&clone, request) != APP_CONTROL_ERROR_NONE)
        return;
    LOG_DEBUG("a push is under way, this one waits");
    _turns().waiting.emplace_back(clone);
    ad->operation_type = OPERATION_PUSH;
}

// True when a push that waited is under way now.
bool _takeTurn(PellikoAppData *ad)
{
    std::deque<Request> &waiting = _turns().waiting;
    while (!_turns().under_way && !waiting.empty()) {
        const Request request = std::move(waiting.front());
        waiting.pop_front();
        if (_takeTokens(ad, request.get()))
            _receiverLaunchPushNotiThread(ad);
    }
    return _turns().under_way;
}

// Leaves the loop of finishPushes().
void _leaveLoop()
{
    if (_turns().finishing && !_turns().under_way)
        ecore_main_loop_quit();
}

// A push that broke off leaves the application running, as the service may still bring the rest.
void _stopped(void *data)
{
    _turns().under_way = false;
    _takeTurn(static_cast<PellikoAppData *>(data));
    _leaveLoop();
}

// From any thread.
void _stop(PellikoAppData *ad)
{
    ecore_main_loop_thread_safe_call_async(_stopped, ad);
}

bool _isMessage(const void *buffer, unsigned int size, const char *message)
{
    return buffer && size == strlen(message) + 1 && memcmp(buffer, message, size) == 0;
}

Eina_Bool _lateCb(void *data)
{
    *static_cast<bool *>(data) = true;
    ecore_main_loop_quit();
    return ECORE_CALLBACK_RENEW;
}

void _announce(PellikoAppData *ad)
{
    if (!_turns().abandoned && addPushNotification(ad) == -1)
        LOG_ERROR("notification panel error!");
}

} // namespace

int _getPushInfo(PellikoAppData *ad, app_control_h request)
{
    RETURN_VALUE_IF_NULL(ad, -1, "ad is NULL");
    char **tokens = nullptr;
    int length = 0;
    const int ret = app_control_get_extra_data_array(request, tokensKey, &tokens, &length);
    if (ret != APP_CONTROL_ERROR_NONE)
        return ret;
    LOG_DEBUG("token_length = %d", length);
    replaceContentsTokens(ad, tokens, length);
    const std::string joined = _joinTokens(tokens, length);
    LOG_DEBUG("reset noti backup count = %d", length);
    if (preference_set_int(shareNotiBackupedKey, length) != PREFERENCE_ERROR_NONE)
        LOG_ERROR("Error in setting PREFERENCE KEY SHARE_NOTI_BACKUPED");
    const int err = preference_set_string(shareNotiTokensKey, joined.c_str());
    if (err != PREFERENCE_ERROR_NONE)
        LOG_ERROR("preference set thumbnail path fail %d", err);
    return err;
}

void _receiverLaunchPushNotiThread(PellikoAppData *ad)
{
    _forgetSender(ad);
    _turns().under_way = startDetachedWorker([ad] { _receiverPushNotiThread(ad); });
}

void *_receiverPushNotiThread(void *data)
{
    auto *ad = static_cast<PellikoAppData *>(data);
    const int32_t operation_type = _makePipe(ad);
    if (!_requestFirst(ad))
        _stop(ad);
    LOG_DEBUG("operation_type=[%d]", operation_type);
    return nullptr;
}

void _receiverServiceGetGroupInfoCb(int, const char *, pelliko_push_info_h info, void *data)
{
    auto *ad = static_cast<PellikoAppData *>(data);
    RETURN_IF_NULL(ad, "user_data is NULL");
    const WorkerScope counted; // the application may be leaving once the loop was woken
    const int ct_err = contacts_connect_on_thread();
    if (ct_err != CONTACTS_ERROR_NONE)
        LOG_ERROR("contacts_connect_on_thread failed : ct_err = [%d]", ct_err);
    {
        const PushInfo share(info);
        addSenderName(share.nameOrNumber());
        if (ad->token_length == ad->data_index + 1)
            _keepLast(ad, share);
        else
            _keepRecord(ad, share);
    }
    LOG_DEBUG("token_length = %d, data_index = %d", ad->token_length, ad->data_index);
    if (!(ad->data_index < ad->token_length ? _requestNext(ad) : _wakeMainLoop(ad)))
        _stop(ad);
}

void _receiverRegisterGroupNoti(void *data, void *buffer, unsigned int size)
{
    auto *ad = static_cast<PellikoAppData *>(data);
    RETURN_IF_NULL(ad, "data is NULL");
    _turns().under_way = false;
    if (_isMessage(buffer, size, successMessage))
        _announce(ad);
    else if (_isMessage(buffer, size, failedMessage))
        LOG_ERROR("notification panel error!");
    // A push that waited would end with the application.
    if (!_takeTurn(ad))
        safeExit();
    _leaveLoop();
}

void _forwardPushAppControl(app_control_h request)
{
    if (!aul_app_is_running(historyId)) {
        LOG_DEBUG("History app is NOT running");
        return;
    }
    app_control_h clone = nullptr;
    int ret = app_control_clone(&clone, request);
    if (ret != APP_CONTROL_ERROR_NONE)
        LOG_ERROR("app_control_clone error %d", ret);
    ret = app_control_set_app_id(clone, historyId);
    if (ret != APP_CONTROL_ERROR_NONE)
        LOG_ERROR("app_control_set_app_id error %d", ret);
    ret = app_control_send_launch_request(clone, nullptr, nullptr);
    if (ret != APP_CONTROL_ERROR_NONE)
        LOG_ERROR("app_control_send_launch_request is failed ret = %d", ret);
    if (clone)
        app_control_destroy(clone);
}

void receivePush(PellikoAppData *ad, app_control_h request)
{
    if (_turns().under_way) {
        _wait(ad, request);
    } else if (_takeTokens(ad, request)) {
        ad->operation_type = OPERATION_PUSH;
        _receiverLaunchPushNotiThread(ad);
    }
}

bool announceKeptShares(PellikoAppData *ad)
{
    if (!_turns().under_way) {
        if (restoreNotiInfo(ad) != 0)
            return false;
        LOG_DEBUG("noti restored");
        _turns().abandoned = false; // switched off and on again before the application was gone
    }
    ad->operation_type = OPERATION_PUSH;
    if (!_turns().under_way)
        _receiverLaunchPushNotiThread(ad);
    return true;
}

void abandonPushes()
{
    _turns().abandoned = true;
    _turns().waiting.clear();
}

void finishPushes()
{
    _turns().finishing = true;
    bool late = false;
    Ecore_Timer *timer = ecore_timer_add(longestFinish, _lateCb, &late);
    while (_turns().under_way && !late)
        ecore_main_loop_begin();
    ecore_timer_del(timer);
}

} // namespace pelliko
