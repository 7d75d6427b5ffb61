#include "PellikoUploadDataManager/ConfirmationPopup.h"

#include "AppLog/AppLog.h"
#include "PellikoApp/AppData.h"
#include "PellikoApp/PopupFrame.h"
#include "PellikoApp/TextFormat.h"
#include "PellikoApp/ThemeLayout.h"
#include "PellikoApp/Window.h"
#include "PellikoNotificationManager/NotificationPrimitives.h"
#include "PellikoUploadDataManager/ConfirmationContents.h"
#include "PellikoUploadDataManager/Recipients.h"
#include "PellikoUploadDataManager/UploadAction.h"
#include "PellikoUploadDataManager/UploadNotiData.h"
#include "PellikoUploadManager/ExitPolicy.h"
#include "PellikoUploadingDataManager/PressedNotification.h"
#include "PellikoUploadingDataManager/StatusPopup.h"

#include <Elementary.h>
#include <efl_assist.h>
#include <pelliko_client.h>
#include <uxt_button.h>

namespace pelliko
{

namespace
{

constexpr const char *domain = "pelliko";
constexpr const char *popupStyle = "pelliko";

int32_t g_total_recipients = 0;
int g_status_check = 0;     ///< presses of the check box while a tapped upload is in hand
int g_wifi_check_state = 0; ///< what the check box starts with when the popup is built again

void _deletePopup(PellikoAppData *ad)
{
    if (ad->popup)
        evas_object_del(ad->popup);
    ad->popup = nullptr;
    if (ad->popup_layout)
        evas_object_del(ad->popup_layout);
    ad->popup_layout = nullptr;
}

// After a failed start the share-failure popup takes the window over; otherwise the application
// leaves the screen, and a request that the service refused must not keep it alive.
void _leaveAfterAction(PellikoAppData *ad, int result)
{
    if (result == PELLIKO_ERROR_SERVICE_INITIALIZING) {
        _deletePopup(ad);
        return;
    }
    _hideWindow(ad);
    _deletePopup(ad);
    if (result != PELLIKO_ERROR_NONE)
        dropRefusedUpload();
}

void _uploadConfirmShareBtnClickedCb(void *data, Evas_Object *, void *)
{
    auto *ad = static_cast<PellikoAppData *>(data);
    RETURN_IF_NULL(ad, "upload item is NULL");
    // A second press that was made before the popup closed arrives after it: the share was made.
    if (ad->popup)
        _leaveAfterAction(ad, _performAction(ad));
}

void _uploadConfirmCancelBtnClickedCb(void *data, Evas_Object *, void *)
{
    auto *ad = static_cast<PellikoAppData *>(data);
    RETURN_IF_NULL(ad, "data is NULL");
    ad->wifi_check = 0;
    g_wifi_check_state = 0;
    _deletePopup(ad);
    safeExit();
}

void _toggleWifiOnly(PellikoAppData *ad)
{
    ad->wifi_check = ad->wifi_check ? 0 : 1;
    elm_check_state_set(ad->wifi_check_box, ad->wifi_check);
}

void _checkAreaSelectedCb(void *data, Evas_Object *, const char *, const char *)
{
    auto *ad = static_cast<PellikoAppData *>(data);
    RETURN_IF_NULL(ad, "data is NULL");
    if (ad->operation_type != OPERATION_UPLOADING_NOTI_PRESSED) {
        _toggleWifiOnly(ad);
        return;
    }
    // An upload that has begun keeps the way it was told to take.
    g_status_check = g_status_check ? 0 : 1;
    LOG_DEBUG("request_id = %d", static_cast<int32_t>(g_noti_press_data.upload_request_id));
    elm_check_state_set(ad->wifi_check_box, ad->wifi_check);
}

// The box itself is reached by the keyboard and by assistive programs only.
void _checkBoxChangedCb(void *data, Evas_Object *, void *)
{
    _toggleWifiOnly(static_cast<PellikoAppData *>(data));
}

// An upload that goes on needs the process; one that has ended does not.
void _leaveStatusPopup(PellikoAppData *ad)
{
    switch (g_noti_press_data.upload_status) {
    case NOTI_STATE_PREPARING:
    case NOTI_STATE_PAUSED:
    case NOTI_STATE_PAUSED_BY_SERVICE:
    case NOTI_STATE_SENDING:
    case NOTI_STATE_NOTIFYING:
        _hideWindow(ad);
        break;
    default:
        safeExit();
        break;
    }
}

void _uploadConfirmViewBackBtnCb(void *data, Evas_Object *, void *)
{
    auto *ad = static_cast<PellikoAppData *>(data);
    RETURN_IF_NULL(ad, "data is NULL");
    _deletePopup(ad);
    if (ad->operation_type == OPERATION_UPLOADING_NOTI_PRESSED) {
        _leaveStatusPopup(ad);
        return;
    }
    const UploadNotiData *node =
        ad->upload_item ? getUploadNotiDataNode(ad->upload_item->request_id) : nullptr;
    if (!node || node->upload_status != PELLIKO_UPLOAD_STATUS_SHARE_FINISHED)
        is_noti_pressed = 0;
    safeExit();
}

// Closing the window means the same as the back key, while there is something to go back from.
void _windowCloseRequestedCb(void *data, Evas_Object *win, void *event_info)
{
    if (static_cast<PellikoAppData *>(data)->popup)
        _uploadConfirmViewBackBtnCb(data, win, event_info);
}

void _rotationChangedPopupCb(void *data, Evas_Object *, void *)
{
    auto *ad = static_cast<PellikoAppData *>(data);
    RETURN_IF_NULL(ad, "data is NULL");
    LOG_DEBUG("ad->wifi_check = %d", ad->wifi_check);
    g_wifi_check_state = ad->wifi_check != 0;
    // A status popup finds its place by itself, and must not fall back to what was tapped.
    if (ad->popup && !isStatusPopup(ad))
        _createPopupView(ad);
}

// Every share adds the window's callbacks again; what is left of an earlier one goes first.
void _listenToWindow(PellikoAppData *ad)
{
    if (!ad->win)
        return;
    evas_object_smart_callback_del(ad->win, "wm,rotation,changed", _rotationChangedPopupCb);
    evas_object_smart_callback_add(ad->win, "wm,rotation,changed", _rotationChangedPopupCb, ad);
    evas_object_smart_callback_del(ad->win, "delete,request", _windowCloseRequestedCb);
    evas_object_smart_callback_add(ad->win, "delete,request", _windowCloseRequestedCb, ad);
    ea_object_event_callback_del(ad->win, EA_CALLBACK_BACK, _uploadConfirmViewBackBtnCb);
    ea_object_event_callback_add(ad->win, EA_CALLBACK_BACK, _uploadConfirmViewBackBtnCb, ad);
}

Evas_Object *_addPopup(PellikoAppData *ad)
{
    Evas_Object *popup = elm_popup_add(ad->win);
    if (!popup)
        return nullptr;
    elm_object_theme_set(popup, ad->theme);
    elm_object_style_set(popup, popupStyle);
    fitPopupScale(ad, popup);
    ea_object_event_callback_add(popup, EA_CALLBACK_BACK, _uploadConfirmViewBackBtnCb, ad);
    elm_popup_align_set(popup, ELM_NOTIFY_ALIGN_FILL, 1.0);
    evas_object_size_hint_weight_set(popup, EVAS_HINT_EXPAND, EVAS_HINT_EXPAND);
    elm_object_domain_translatable_part_text_set(
        popup, "title,text", domain,
        ad->operation_type == OPERATION_UPLOADING_NOTI_PRESSED
            ? "IDS_RSH_HEADER_SHARE_FILES_ABB"
            : "IDS_RSH_HEADER_SHARE_FILES_VIA_PELLIKO_ABB");
    return popup;
}

const char *_layoutGroup(const PellikoAppData *ad)
{
    if (ad->operation_type == OPERATION_UPLOADING_NOTI_PRESSED)
        return statusPopupGroup();
    const bool single = g_total_recipients == 1;
    if (ad->action_type == ACTION_RESHARE_UPLOAD)
        return single ? "confirmation_popup_reshare_view_single"
                      : "confirmation_popup_reshare_view_multiple";
    return single ? "confirmation_popup_share_view_single"
                  : "confirmation_popup_share_view_multiple";
}

void _addLayout(PellikoAppData *ad)
{
    const char *group = _layoutGroup(ad);
    if (!group) {
        keepWhileAlive(&ad->popup_layout, elm_layout_add(ad->popup));
        return;
    }
    LOG_DEBUG("Setting %s", group);
    keepWhileAlive(&ad->popup_layout, addThemeLayout(ad->popup, ad->theme, group));
}

void _addButton(PellikoAppData *ad, const char *part, const char *style, const char *id,
                Evas_Smart_Cb clicked)
{
    Evas_Object *button = uxt_button_add(ad->popup);
    elm_object_text_set(button, translated(id));
    elm_object_part_content_set(ad->popup, part, button);
    // The popup gives its buttons a style of its own.
    elm_object_style_set(button, style);
    evas_object_smart_callback_add(button, "clicked", clicked, ad);
}

void _addContentsToPopup(PellikoAppData *ad, Evas_Object *layout)
{
    if (ad->operation_type == OPERATION_UPLOADING_NOTI_PRESSED) {
        addStatusContents(ad, _uploadConfirmViewBackBtnCb);
        return;
    }
    addConfirmationContents(ad, layout, g_wifi_check_state != 0);
    elm_layout_signal_callback_add(layout, "check,clicked", "*", _checkAreaSelectedCb, ad);
    evas_object_smart_callback_add(ad->wifi_check_box, "changed", _checkBoxChangedCb, ad);
    _addButton(ad, "button1", "popup", "IDS_RSH_BUTTON_CANCEL_ABB2",
               _uploadConfirmCancelBtnClickedCb);
    _addButton(ad, "button2", "popup/primary", "IDS_RSH_BUTTON_SHARE_ABB5",
               _uploadConfirmShareBtnClickedCb);
}

void _showPopup(PellikoAppData *ad)
{
    evas_object_show(ad->popup);
    showMainWindow(ad);
    elm_object_focus_set(ad->popup, EINA_TRUE);
}

bool _needsNoConfirmation(const PellikoAppData *ad)
{
    return ad->operation_type != OPERATION_UPLOADING_NOTI_PRESSED &&
           ad->action_type != ACTION_RESHARE_UPLOAD && ad->upload_item &&
           ad->upload_item->files_size <= 0;
}

} // namespace

void _createPopupView(PellikoAppData *ad)
{
    if (!ad) {
        LOG_ERROR("ERROR : ad is NULL");
        ad = getAppData();
    }
    if (!ad) {
        safeExit();
        return;
    }
    if (ad->upload_item)
        g_total_recipients = static_cast<int32_t>(eina_list_count(ad->upload_item->recipient_list));
    LOG_DEBUG("ad->operation_type =%d,g_total_recipients =%d", ad->operation_type,
              g_total_recipients);
    _deletePopup(ad);
    keepWhileAlive(&ad->popup, ad->win ? _addPopup(ad) : nullptr);
    if (!ad->popup) {
        LOG_ERROR("the popup could not be created");
        safeExit();
        return;
    }
    _addLayout(ad);
    _addContentsToPopup(ad, ad->popup_layout);
    putPopupContent(ad, ad->popup, ad->popup_layout);
    if (!_needsNoConfirmation(ad)) {
        _showPopup(ad);
        return;
    }
    LOG_DEBUG("6MB limit not exceeded. Bypassing Confirmation popup view");
    _leaveAfterAction(ad, _performAction(ad));
}

Evas_Object *reopenPopupView(PellikoAppData *ad)
{
    RETURN_VALUE_IF_NULL(ad, nullptr, "data is NULL");
    if (is_noti_pressed == 1)
        g_cancel_in_progress = 0;
    g_wifi_check_state = 0;
    _createPopupView(ad);
    _listenToWindow(ad);
    return ad->popup_layout;
}

void bypassContactView(PellikoAppData *ad)
{
    if (!ad) {
        LOG_ERROR("data is NULL");
        return;
    }
    _createRecipientToUpload(ad);
    g_wifi_check_state = 0;
    _createPopupView(ad);
    _listenToWindow(ad);
}

} // namespace pelliko
