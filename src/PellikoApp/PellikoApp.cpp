#include "PellikoApp/PellikoApp.h"

#include "AppLog/AppLog.h"
#include "PellikoApp/AppData.h"
#include "PellikoApp/CText.h"
#include "PellikoApp/Decimal.h"
#include "PellikoApp/Dispatch.h"
#include "PellikoApp/Language.h"
#include "PellikoApp/Operation.h"
#include "PellikoApp/PushReceiver.h"
#include "PellikoApp/Telephony.h"
#include "PellikoApp/Window.h"
#include "PellikoDatabaseManager/UploadInfoDatabase.h"
#include "PellikoKorrinManager/KorrinAccount.h"
#include "PellikoNotificationManager/NotificationPrimitives.h"
#include "PellikoUploadManager/ExitPolicy.h"
#include "PellikoUploadManager/UsagePreferences.h"

#include <Elementary.h>
#include <app.h>
#include <app_common.h>
#include <app_preference.h>
#include <contacts.h>
#include <cstdio>

namespace pelliko
{

namespace
{

constexpr const char *reshareKey = "pk_reshare";
constexpr double scale = 1.8;
constexpr size_t themePathSize = 128;

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
    // Without one the toolkit would take its own default theme and make that refer to itself.
    RETURN_IF_NULL(ad->theme, "the theme could not be created");
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

// Writes the id of an earlier upload into the record; true when the request names one.
bool _readReshare(PellikoAppData *ad, const char *reshare)
{
    if (!reshare)
        return false;
    ad->req_id_to_reshare = decimalValue(reshare);
    LOG_DEBUG("ad->req_id_to_reshare = %d", ad->req_id_to_reshare);
    return true;
}

// A share needs the account. While the user signs in, nothing of ours may lie above that screen.
void _runWithAccount(PellikoAppData *ad)
{
    const bool share =
        ad->operation_type == OPERATION_SHARE || ad->operation_type == OPERATION_MULTI_SHARE;
    if (!share || isKorAccountExist()) {
        doOperation(ad);
        return;
    }
    const int launched = launchKorLoginScreen(ad);
    LOG_DEBUG("launchKorLoginScreen return %d", launched);
    _hideWindow(ad);
}

} // namespace

bool PellikoApp::onCreate()
{
    deleteAllNotificationsOfType(NOTIFICATION_TYPE_ONGOING);
    _resetPreferences();
    elm_app_base_scale_set(scale);
    PellikoAppData *ad = getAppData();
    initKor();
    app_event_handler_h language_handler = nullptr;
    ui_app_add_event_handler(&language_handler, APP_EVENT_LANGUAGE_CHANGED, _langChanged, ad);
    _langChanged(nullptr, ad);
    _addTheme(ad);
    ad->upload_item = nullptr;
    const int error = contacts_connect();
    if (error != CONTACTS_ERROR_NONE)
        LOG_ERROR("contacts_connect failed : error = %d", error);
    startTelephony(ad);
    createTableUploadInfoDb();
    return true;
}

void PellikoApp::onTerminate()
{
    finishPushes();
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
    const Next next = dispatch(launch, ad);
    if (next == Next::run)
        _runWithAccount(ad);
    else if (next == Next::leave && !ad->popup && !ad->processing_popup)
        _hideWindow(ad); // the clear window lies above everything and would swallow every touch
}

} // namespace pelliko
