#include "PellikoApp/Dispatch.h"

#include "AppLog/AppLog.h"
#include "PellikoApp/ContactVcard.h"
#include "PellikoApp/PushReceiver.h"
#include "PellikoApp/ServiceSwitch.h"
#include "PellikoApp/ShareRequest.h"
#include "PellikoApp/SmsSender.h"
#include "PellikoApp/TextArray.h"
#include "PellikoApp/Window.h"
#include "PellikoUploadingDataManager/PressedNotification.h"
#include "PellikoVelmoraLog/PellikoVelmoraLog.h"

#include <cstring>
#include <glib.h>
#include <memory>
#include <pelliko_operations.h>

namespace pelliko
{

namespace
{

constexpr const char *contactMime = "application/vnd.tizen.contact";
constexpr int quietContactCount = 99; // more take long enough to tell the user
constexpr const char *resumeReplyKey = "resume_by_app";

void _replyResume(app_control_h request, const char *value)
{
    app_control_h reply = nullptr;
    if (!request || app_control_create(&reply) != APP_CONTROL_ERROR_NONE)
        return;
    LOG_DEBUG("resume_by_app:%s", value);
    app_control_add_extra_data(reply, resumeReplyKey, value);
    const int error =
        app_control_reply_to_launch_request(reply, request, APP_CONTROL_RESULT_SUCCEEDED);
    if (error == APP_CONTROL_ERROR_NONE)
        LOG_DEBUG("app_control_reply_to_launch_request success");
    else
        LOG_ERROR("app_control_reply_to_launch_request failed : error = %d", error);
    app_control_destroy(reply);
}

Next _parseSingle(const char *uri, const Launch &launch, PellikoAppData *ad)
{
    if (_parseSingleDataPath(uri, ad, launch.request) == -1) {
        LOG_DEBUG("_parseSingleDataPath failed!");
        return Next::leave;
    }
    _parseDataTo(ad, launch.request);
    ad->action_type = ACTION_UPLOAD;
    return Next::run;
}

// The files of the earlier upload are used again: none is read from the request.
Next _reshare(const Launch &launch, PellikoAppData *ad)
{
    LOG_DEBUG("### Reshare ###");
    _parseDataTo(ad, launch.request);
    ad->action_type = ACTION_RESHARE_UPLOAD;
    return Next::run;
}

Next _onShare(const Launch &launch, PellikoAppData *ad)
{
    LOG_DEBUG("SHARE with uri !!");
    ad->operation_type = OPERATION_SHARE;
    ensureMainWindow(launch.app, ad);
    if (launch.reshare)
        return _reshare(launch, ad);
    char *uri = nullptr;
    const int error = app_control_get_uri(launch.request, &uri);
    const CText owned(uri);
    if (error != APP_CONTROL_ERROR_NONE) {
        LOG_DEBUG("app_control_get_uri failed!");
        return Next::leave;
    }
    return _parseSingle(uri, launch, ad);
}

Next _onShareText(const Launch &launch, PellikoAppData *ad)
{
    LOG_DEBUG("SHARE_TEXT, create uri with text !!");
    ad->operation_type = OPERATION_SHARE;
    ensureMainWindow(launch.app, ad);
    const std::unique_ptr<char, decltype(&g_free)> path(_createTextUri(launch.request, ad), g_free);
    if (!path) {
        LOG_DEBUG("_createTextUri failed!");
        return Next::leave;
    }
    return _parseSingle(path.get(), launch, ad);
}

Next _onMultiShare(const Launch &launch, PellikoAppData *ad)
{
    ad->operation_type = OPERATION_MULTI_SHARE;
    LOG_DEBUG("Multi file share case !!");
    ensureMainWindow(launch.app, ad);
    if (launch.reshare)
        return _reshare(launch, ad);
    if (_parseMultipleDataPath(launch.request, ad) == -1) {
        LOG_DEBUG("_parseMultipleDataPath failed!");
        return Next::leave;
    }
    _parseDataTo(ad, launch.request);
    ad->action_type = ACTION_UPLOAD;
    return Next::run;
}

Next _onSend(const Launch &launch, PellikoAppData *ad)
{
    LOG_DEBUG("Push message received !!");
    PellikoVelmoraLog::getInstance()->insertVelmoraLogReceiveNotification();
    receivePush(ad, launch.request);
    _forwardPushAppControl(launch.request);
    return Next::run;
}

Next _onSendText(const Launch &launch, PellikoAppData *ad)
{
    LOG_DEBUG("Need to Send SMS to receiver !!");
    ad->operation_type = OPERATION_SEND_SMS;
    _getSmsData(launch.request, ad);
    return Next::run;
}

Next _onNotiPressed(const Launch &launch, PellikoAppData *ad)
{
    ensureMainWindow(launch.app, ad);
    ad->operation_type = OPERATION_UPLOADING_NOTI_PRESSED;
    LOG_DEBUG("Upload noti pressed !!");
    is_noti_pressed = 1;
    getUploadData(launch.request);
    return Next::run;
}

Next _onDefault(const Launch &launch, PellikoAppData *ad)
{
    ad->operation_type = OPERATION_DEFAULT;
    LOG_DEBUG("Default operation, check upload/download resume");
    _parseUploadResume(ad, launch.request);
    if (!ad->upload_item) {
        ad->is_resume_by_reboot = 1;
        _replyResume(launch.request, "1");
    }
    return Next::run;
}

// Contacts become a file first, away from the loop; the file then goes on as a share of its own.
Next _onContacts(const Launch &launch, PellikoAppData *ad)
{
    LOG_DEBUG("MIME case - create uri with vcf !!");
    ad->operation_type = OPERATION_SHARE;
    ensureMainWindow(launch.app, ad);
    if (TextArray(ad->app_control, APP_CONTROL_DATA_ID).length() > quietContactCount)
        _showProcessingPopup(ad);
    startContactVcard(ad);
    return Next::wait;
}

Next _onDeregistered(const Launch &, PellikoAppData *)
{
    LOG_DEBUG("Deregistered operation");
    forgetAccount();
    return Next::quit;
}

Next _onServiceOn(const Launch &, PellikoAppData *ad)
{
    LOG_DEBUG("Service ON operation");
    return switchServiceOn(ad) ? Next::run : Next::quit;
}

Next _onServiceOff(const Launch &, PellikoAppData *ad)
{
    LOG_DEBUG("Service OFF operation");
    switchServiceOff(ad);
    return Next::quit;
}

struct OperationRow {
    const char *operation;
    Next (*handle)(const Launch &launch, PellikoAppData *ad);
};

constexpr OperationRow operations[] = {
    {APP_CONTROL_OPERATION_SHARE, _onShare},
    {APP_CONTROL_OPERATION_SHARE_TEXT, _onShareText},
    {APP_CONTROL_OPERATION_MULTI_SHARE, _onMultiShare},
    {APP_CONTROL_OPERATION_SEND, _onSend},
    {APP_CONTROL_OPERATION_SEND_TEXT, _onSendText},
    {APP_CONTROL_OPERATION_UPLOADING_NOTI_PRESSED, _onNotiPressed},
    {APP_CONTROL_OPERATION_DEFAULT, _onDefault},
    {APP_CONTROL_OPERATION_DEREGISTERED, _onDeregistered},
    {APP_CONTROL_OPERATION_SERVICE_ON, _onServiceOn},
    {APP_CONTROL_OPERATION_SERVICE_OFF, _onServiceOff},
};

} // namespace

Next dispatch(const Launch &launch, PellikoAppData *ad)
{
    if (launch.mime && strcmp(launch.mime.get(), contactMime) == 0)
        return _onContacts(launch, ad);
    for (const OperationRow &row : operations) {
        if (launch.operation && strcmp(launch.operation.get(), row.operation) == 0)
            return row.handle(launch, ad);
    }
    return Next::run;
}

} // namespace pelliko
