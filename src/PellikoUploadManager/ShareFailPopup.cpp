#include "PellikoUploadManager/ShareFailPopup.h"

#include "AppLog/AppLog.h"
#include "PellikoApp/AppData.h"
#include "PellikoApp/PopupFrame.h"
#include "PellikoApp/Window.h"
#include "PellikoUploadManager/ExitPolicy.h"

#include <Elementary.h>
#include <efl_assist.h>
#include <uxt_button.h>

namespace pelliko
{

namespace
{

constexpr const char *domain = "pelliko";
constexpr const char *style = "pelliko";
constexpr const char *objectName = "share-fail";

void _close(Evas_Object *popup)
{
    evas_object_del(popup);
    safeExit();
}

void _okCb(void *data, Evas_Object *, void *)
{
    RETURN_IF_NULL(data, "data is NULL");
    _close(static_cast<Evas_Object *>(data));
}

void _popBackCb(void *data, Evas_Object *, void *)
{
    RETURN_IF_NULL(data, "data is NULL");
    _close(static_cast<Evas_Object *>(data));
}

void _addButton(Evas_Object *popup)
{
    Evas_Object *button = uxt_button_add(popup);
    elm_object_domain_translatable_part_text_set(button, nullptr, domain, "IDS_RSH_BUTTON_OK");
    elm_object_part_content_set(popup, "button1", button);
    // The popup gives its buttons a style of its own.
    elm_object_style_set(button, "popup");
    evas_object_smart_callback_add(button, "clicked", _okCb, popup);
}

} // namespace

void createShareFailPopup(PellikoAppData *ad)
{
    if (!ad)
        return;
    Evas_Object *popup = ad->win ? elm_popup_add(ad->win) : nullptr;
    if (!popup)
        return;
    elm_object_theme_set(popup, ad->theme);
    evas_object_name_set(popup, objectName);
    elm_object_style_set(popup, style);
    fitPopupScale(ad, popup);
    elm_popup_align_set(popup, ELM_NOTIFY_ALIGN_FILL, 1.0);
    elm_object_domain_translatable_part_text_set(popup, "title,text", domain,
                                                 "IDS_RSH_HEADER_SHARING_FAILED_ABB");
    elm_object_domain_translatable_part_text_set(
        popup, nullptr, domain, "IDS_RSH_POP_PELLIKO_IS_TEMPORARILY_NOT_AVAILABLE_TRY_AGAIN_LATER");
    evas_object_size_hint_weight_set(popup, EVAS_HINT_EXPAND, EVAS_HINT_EXPAND);
    _addButton(popup);
    ea_object_event_callback_add(popup, EA_CALLBACK_BACK, _popBackCb, popup);
    evas_object_show(popup);
    showMainWindow(ad);
}

} // namespace pelliko
