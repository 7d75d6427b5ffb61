#include "PellikoUploadManager/ExitPolicy.h"

#include "AppLog/AppLog.h"
#include "PellikoUploadDataManager/UploadNotiData.h"

#include <Elementary.h>

namespace pelliko
{

ExitOutcome applyExitPolicy(PellikoAppData *ad)
{
    if (ad && ad->popup) {
        LOG_DEBUG("Popup is open.. can't exit");
        return ExitOutcome::popup_open;
    }
    if (g_upload_noti_data_list) {
        LOG_DEBUG("upload_data request id is not 0 app can't exit");
        _hideWindow(ad);
        return ExitOutcome::waiting;
    }
    LOG_DEBUG("No upload_data request id exist so app is exiting");
    elm_exit();
    return ExitOutcome::quit;
}

void safeExit()
{
    applyExitPolicy(getAppData());
}

void _hideWindow(PellikoAppData *ad)
{
    if (!ad)
        return;
    if (ad->win) {
        elm_win_lower(ad->win);
        evas_object_hide(ad->win);
    }
    if (ad->popup) {
        evas_object_del(ad->popup);
        ad->popup = nullptr;
    }
    popup_update_enabled = 0;
}

} // namespace pelliko
