#include "PellikoApp/PellikoApp.h"

#include "AppLog/AppLog.h"
#include "PellikoApp/AppData.h"
#include "PellikoApp/CText.h"
#include "PellikoApp/Decimal.h"
#include "PellikoApp/Language.h"
#include "PellikoApp/Operation.h"
#include "PellikoApp/ShareRequest.h"
#include "PellikoApp/SmsSender.h"
#include "PellikoApp/Window.h"
#include "PellikoDatabaseManager/UploadInfoDatabase.h"
#include "PellikoNotificationManager/NotificationPrimitives.h"
#include "PellikoUploadManager/ExitPolicy.h"
#include "PellikoUploadManager/UsagePreferences.h"

#include <Elementary.h>
#include <app.h>
#include <app_common.h>
#include <app_preference.h>
#include <contacts.h>
#include <cstdio>
#include <cstring>

namespace pelliko
{

namespace
{

constexpr const char *reshareKey = "pk_reshare";
constexpr const char *resumeReplyKey = "resume_by_app";
constexpr double scale = 1.8;
constexpr size_t themePathSize = 128;

// What the dispatcher reads of every request.
struct Launch {
    app_control_h request;
    app_assist::WApp *app;
    CText operation;
    CText mime;
    bool reshare;
};

enum class Next {
    run,  // the operation is to be done
    leave // the request could not be understood
};

CText _attribute(app_control_h request, int (*get)(app_control_h, char **))
{
    char *text = nullptr;
    get(request, &text);
    return CText(text);
}

CText _extra(app_control_h request, const char *key)
{
    char *text = nullptr;
    app_control_get_extra_data(request, key, &text);
    return CText(text);
}

void _resetPreferences()
{
    if (preference_set_int(shareSmsDoneKey, 0) != PREFERENCE_ERROR_NONE)
        LOG_ERROR("Error in preference key initialization.");
    if (preference_set_string(updatePopupDataKey, "") != PREFERENCE_ERROR_NONE)
        LOG_ERROR("Error in preference key initialization.");
}

void _addTheme(PellikoAppData *ad)
{
    ad->theme = elm_theme_new();
    elm_theme_ref_set(ad->theme, nullptr);
    const CText resources(app_get_resource_path());
    char path[themePathSize];
    snprintf(path, sizeof(path), "%s%s", textOrNull(resources.get()), "/edje/pelliko.edj");
    elm_theme_extension_add(ad->theme, path);
}

void _keepClone(PellikoAppData *ad, app_control_h request)
{
    app_control_h clone = nullptr;
    app_control_clone(&clone, request);
    if (ad->app_control)
        app_control_destroy(ad->app_control);
    ad->app_control = clone;
}

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
    const CText path(_createTextUri(launch.request, ad));
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

Next _onSendText(const Launch &launch, PellikoAppData *ad)
{
    LOG_DEBUG("Need to Send SMS to receiver !!");
    ad->operation_type = OPERATION_SEND_SMS;
    _getSmsData(launch.request, ad);
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

struct OperationRow {
    const char *operation;
    Next (*handle)(const Launch &launch, PellikoAppData *ad);
};

constexpr OperationRow operations[] = {
    {APP_CONTROL_OPERATION_SHARE, _onShare},
    {APP_CONTROL_OPERATION_SHARE_TEXT, _onShareText},
    {APP_CONTROL_OPERATION_MULTI_SHARE, _onMultiShare},
    {APP_CONTROL_OPERATION_SEND_TEXT, _onSendText},
    {APP_CONTROL_OPERATION_DEFAULT, _onDefault},
};

// An operation that no row names leaves operation_type as it was: the last operation runs again.
Next _dispatch(const Launch &launch, PellikoAppData *ad)
{
    for (const OperationRow &row : operations) {
        if (launch.operation && strcmp(launch.operation.get(), row.operation) == 0)
            return row.handle(launch, ad);
    }
    return Next::run;
}

// Writes the id of an earlier upload into the record; true when the request names one.
bool _readReshare(PellikoAppData *ad, const char *reshare)
{
    if (!reshare)
        return false;
    ad->req_id_to_reshare = decimalValue(reshare);
    LOG_DEBUG("ad->req_id_to_reshare = %d", ad->req_id_to_reshare);
    return true;
}

} // namespace

bool PellikoApp::onCreate()
{
    deleteAllNotificationsOfType(NOTIFICATION_TYPE_ONGOING);
    _resetPreferences();
    elm_app_base_scale_set(scale);
    PellikoAppData *ad = getAppData();
    app_event_handler_h language_handler = nullptr;
    ui_app_add_event_handler(&language_handler, APP_EVENT_LANGUAGE_CHANGED, _langChanged, ad);
    _langChanged(nullptr, ad);
    _addTheme(ad);
    ad->upload_item = nullptr;
    const int error = contacts_connect();
    if (error != CONTACTS_ERROR_NONE)
        LOG_ERROR("contacts_connect failed : error = %d", error);
    ad->sim_index = 0;
    createTableUploadInfoDb();
    return true;
}

void PellikoApp::onTerminate()
{
    releaseChangeableGui(getAppData());
}

void PellikoApp::onPause() {}

void PellikoApp::onResume() {}

void PellikoApp::onAppControl(app_control_h request, bool)
{
    PellikoAppData *ad = getAppData();
    RETURN_IF_NULL(request, "Service is NULL");
    _keepClone(ad, request);
    const CText reshare = _extra(request, reshareKey);
    const Launch launch = {request, this, _attribute(request, app_control_get_operation),
                           _attribute(request, app_control_get_mime),
                           _readReshare(ad, reshare.get())};
    LOG_DEBUG("operation = %s, mime = %s, reshare = %s", textOrNull(launch.operation.get()),
              textOrNull(launch.mime.get()), textOrNull(reshare.get()));
    if (_dispatch(launch, ad) == Next::run)
        doOperation(ad);
    else if (!ad->popup)
        _hideWindow(ad); // the clear window lies above everything and would swallow every touch
}

} // namespace pelliko
