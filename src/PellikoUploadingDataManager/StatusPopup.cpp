#include "PellikoUploadingDataManager/StatusPopup.h"

#include "AppLog/AppLog.h"
#include "PellikoApp/AccessibleName.h"
#include "PellikoApp/AppData.h"
#include "PellikoApp/TextFormat.h"
#include "PellikoApp/ThemeLayout.h"
#include "PellikoNotificationManager/NotificationPrimitives.h"
#include "PellikoNotificationManager/UploadNotifications.h"
#include "PellikoUploadDataManager/UploadNotiData.h"
#include "PellikoUploadingDataManager/PressedNotification.h"
#include "PellikoUploadingDataManager/StatusRecipients.h"
#include "PellikoUploadingDataManager/StatusTexts.h"
#include "PellikoVelmoraLog/PellikoVelmoraLog.h"

#include <Elementary.h>
#include <cstring>
#include <pelliko_client.h>
#include <uxt_button.h>

namespace pelliko
{

namespace
{

constexpr const char *statusPart = "elm.swallow.text";
constexpr const char *sizePart = "elm.swallow.text.bottom.left";
constexpr const char *headingPart = "elm.swallow.label.text";
constexpr const char *barPart = "progressbar_area";
constexpr const char *cancelPart = "cancel_btn_area";
constexpr const char *okPart = "ok_button";
constexpr const char *statusMark = "pelliko,status";

constexpr const char *preparingId = "IDS_RSH_TMBODY_PREPARING_TO_SEND_FILES_ING_ABB";
constexpr const char *sendingId = "IDS_RSH_TMBODY_SENDING_ING_ABB";
constexpr const char *pausedId = "IDS_RSH_MBODY_SENDING_PAUSED";
constexpr const char *sentId = "IDS_NFC_BODY_FILES_SENT_ABB2";
constexpr const char *cancelledId = "IDS_RSH_BODY_SENDING_THE_FILE_HAS_BEEN_CANCELLED";

// The tapped upload, or null when it has ended.
UploadNotiData *_pressedNode()
{
    return getUploadNotiDataNode(static_cast<int32_t>(g_noti_press_data.upload_request_id));
}

void _writeStatusLine(Evas_Object *layout, const char *id)
{
    char line[statusLineSize];
    copyText(line, sizeof(line), translated(id));
    elm_object_part_text_set(layout, statusPart, line);
    setAccessibleName(layout, line);
    if (Evas_Object *bar = elm_object_part_content_get(layout, barPart))
        setAccessibleName(bar, line);
}

void _writeStateLine(Evas_Object *layout)
{
    if (const char *id = statusLineId(g_noti_press_data.upload_status))
        _writeStatusLine(layout, id);
}

void _writeSizeLine(Evas_Object *layout)
{
    char line[sizeLineSize];
    if (writeSizeLine(line))
        elm_object_part_text_set(layout, sizePart, line);
}

bool _says(const Evas_Object *layout, const char *id)
{
    const char *line = elm_object_part_text_get(layout, statusPart);
    const char *begin = translated(id);
    return line && strncmp(line, begin, strlen(begin)) == 0;
}

void _deleteBarAndButton(PellikoAppData *ad)
{
    if (ad->progressbar)
        evas_object_del(ad->progressbar);
    if (ad->cancel_button)
        evas_object_del(ad->cancel_button);
}

void _addBar(PellikoAppData *ad, double progress_percent)
{
    Evas_Object *bar = elm_progressbar_add(ad->popup_layout);
    elm_object_theme_set(bar, ad->theme);
    elm_object_style_set(bar, "pelliko");
    elm_progressbar_horizontal_set(bar, EINA_TRUE);
    elm_progressbar_unit_format_set(bar, "%.0f%%");
    elm_progressbar_value_set(bar, progress_percent / 100.0);
    elm_object_part_content_set(ad->popup_layout, barPart, bar);
    setAccessibleName(bar, elm_object_part_text_get(ad->popup_layout, statusPart));
    evas_object_show(bar);
    evas_object_data_set(ad->popup, "progressbar", bar);
    keepWhileAlive(&ad->progressbar, bar);
}

void _addCancelButton(PellikoAppData *ad)
{
    Evas_Object *button = uxt_button_add(ad->popup_layout);
    elm_object_theme_set(button, ad->theme);
    elm_object_style_set(button, "cancelupload");
    elm_object_text_set(button, translated("IDS_RSH_BUTTON_CANCEL_ABB2"));
    evas_object_smart_callback_add(button, "clicked", cancelUploadCb, ad);
    evas_object_show(button);
    elm_object_part_content_set(ad->popup_layout, cancelPart, button);
    keepWhileAlive(&ad->cancel_button, button);
}

void _addOkButton(PellikoAppData *ad, Evas_Smart_Cb leave)
{
    Evas_Object *layout = addThemeLayout(ad->popup, ad->theme, "ok_button_layout");
    Evas_Object *button = uxt_button_add(layout);
    elm_object_theme_set(button, ad->theme);
    elm_object_style_set(button, "bottom");
    elm_object_text_set(button, translated("IDS_RSH_BUTTON_OK"));
    elm_object_part_content_set(layout, okPart, button);
    evas_object_smart_callback_add(button, "clicked", leave, ad);
    elm_object_part_content_set(ad->popup, "button1", layout);
}

// How far the tapped upload had got by its last report, 0 when it has ended.
double _pressedProgress()
{
    const UploadNotiData *node = _pressedNode();
    return node ? static_cast<double>(node->progress_percent) : 0.0;
}

// The bar and the button that belong to the state.
void _addStateContents(PellikoAppData *ad)
{
    switch (g_noti_press_data.upload_status) {
    case NOTI_STATE_PREPARING:
        _addBar(ad, 0.0);
        break;
    case NOTI_STATE_SENDING:
        _writeSizeLine(ad->popup_layout);
        [[fallthrough]];
    case NOTI_STATE_PAUSED:
    case NOTI_STATE_PAUSED_BY_SERVICE:
        _addBar(ad, _pressedProgress());
        _addCancelButton(ad);
        break;
    default:
        break;
    }
}

// Nothing is left to wait for or to cancel.
void _showEnd(PellikoAppData *ad, const char *id)
{
    _deleteBarAndButton(ad);
    elm_object_part_text_set(ad->popup_layout, sizePart, "");
    _writeStatusLine(ad->popup_layout, id);
}

void _showProgress(PellikoAppData *ad, double progress_percent)
{
    // A report that was under way when the user cancelled brings neither bar nor button back.
    if (progress_percent == 0.0 || g_cancel_in_progress == 1)
        return;
    const bool had_button = ad->cancel_button != nullptr;
    if (!had_button)
        _addCancelButton(ad);
    if (!had_button || !_says(ad->popup_layout, sendingId)) {
        _writeStatusLine(ad->popup_layout, sendingId);
        _writeSizeLine(ad->popup_layout);
        return;
    }
    if (progress_percent < 100.0 && ad->progressbar) {
        LOG_DEBUG("Updating progress on progressbar = %f", progress_percent);
        elm_progressbar_value_set(ad->progressbar, progress_percent / 100.0);
    }
}

void _showFailed(PellikoAppData *ad, int error_code)
{
    g_noti_press_data.upload_status =
        _isServerError(error_code) ? NOTI_STATE_FAILED_SERVER : NOTI_STATE_FAILED_DEVICE;
    _showEnd(ad, statusLineId(g_noti_press_data.upload_status));
}

void _showFinished(PellikoAppData *ad)
{
    // Already the state of what follows: nothing but the end of the share comes after this.
    g_noti_press_data.upload_status = NOTI_STATE_SENT;
    _showEnd(ad, statusLineId(NOTI_STATE_NOTIFYING));
}

void _showCancelled(PellikoAppData *ad)
{
    g_noti_press_data.upload_status = NOTI_STATE_CANCELLED;
    _showEnd(ad, cancelledId);
}

void _setButtonText(Evas_Object *button, const char *id)
{
    if (button)
        elm_object_text_set(button, translated(id));
}

void _setHeading(Evas_Object *layout)
{
    char heading[sizeLineSize];
    formatTranslated(heading, sizeof(heading), translated("IDS_RSH_HEADER_RECIPIENTS_HPD_ABB"), "d",
                     pressedRecipientCount());
    elm_object_part_text_set(layout, headingPart, heading);
}

} // namespace

const char *statusPopupGroup()
{
    if (!statusLineId(g_noti_press_data.upload_status))
        return nullptr;
    return pressedRecipientCount() == 1 ? "popup_share_view_single" : "popup_share_view_multiple";
}

void addStatusContents(PellikoAppData *ad, Evas_Smart_Cb leave)
{
    evas_object_data_set(ad->popup_layout, statusMark, ad);
    _addOkButton(ad, leave);
    LOG_DEBUG("Noti press popup for = %d", g_noti_press_data.upload_status);
    if (!statusPopupGroup())
        return;
    if (pressedRecipientCount() > 1)
        _setHeading(ad->popup_layout);
    _writeStateLine(ad->popup_layout);
    _addStateContents(ad);
    addRecipientsData(ad);
}

bool isStatusPopup(const PellikoAppData *ad)
{
    return ad->popup && ad->popup_layout && evas_object_data_get(ad->popup_layout, statusMark);
}

void updatePopupStatus(int status, double progress_percent, int error_code)
{
    PellikoAppData *ad = getAppData();
    if (!ad || popup_update_enabled != 1 || !isStatusPopup(ad))
        return;
    switch (status) {
    case PELLIKO_UPLOAD_STATUS_STARTED:
        _writeStatusLine(ad->popup_layout, preparingId);
        break;
    case PELLIKO_UPLOAD_STATUS_PROGRESSING:
        _showProgress(ad, progress_percent);
        break;
    case PELLIKO_UPLOAD_STATUS_FINISHED:
        _showFinished(ad);
        break;
    case PELLIKO_UPLOAD_STATUS_FAILED:
        _showFailed(ad, error_code);
        break;
    case PELLIKO_UPLOAD_STATUS_CANCELLED:
        _showCancelled(ad);
        break;
    case PELLIKO_UPLOAD_STATUS_SHARE_FINISHED:
        if (!_says(ad->popup_layout, cancelledId))
            _showEnd(ad, sentId);
        break;
    default:
        LOG_DEBUG("default case...");
        _writeStatusLine(ad->popup_layout, pausedId);
        break;
    }
}

void setStatusTexts(PellikoAppData *ad)
{
    Evas_Object *layout = ad->popup_layout;
    if (pressedRecipientCount() > 1)
        _setHeading(layout);
    Evas_Object *ok = elm_object_part_content_get(ad->popup, "button1");
    _setButtonText(ok ? elm_object_part_content_get(ok, okPart) : nullptr, "IDS_RSH_BUTTON_OK");
    _setButtonText(ad->cancel_button, "IDS_RSH_BUTTON_CANCEL_ABB2");
    _writeStateLine(layout);
    if (g_noti_press_data.upload_status == NOTI_STATE_SENDING)
        _writeSizeLine(layout);
}

void cancelUploadCb(void *data, Evas_Object *button, void *)
{
    evas_object_smart_callback_del(button, "clicked", cancelUploadCb);
    auto *ad = static_cast<PellikoAppData *>(data);
    RETURN_IF_NULL(ad, "data is NULL");
    if (g_cancel_in_progress == 0) {
        g_cancel_in_progress = 1;
        if (UploadNotiData *node = _pressedNode())
            node->upload_status = PELLIKO_UPLOAD_STATUS_CANCELLED;
    }
    _deleteBarAndButton(ad);
    const int error =
        pelliko_cancel_upload(static_cast<int32_t>(g_noti_press_data.upload_request_id));
    if (error != PELLIKO_ERROR_NONE)
        LOG_ERROR("pelliko_cancel_upload failed : error = %d", error);
    PellikoVelmoraLog::getInstance()->insertVelmoraLogShareCancel();
}

} // namespace pelliko
