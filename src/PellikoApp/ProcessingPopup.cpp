#include "PellikoApp/ProcessingPopup.h"

#include "PellikoApp/AccessibleName.h"
#include "PellikoApp/AppData.h"
#include "PellikoApp/PopupFrame.h"
#include "PellikoApp/ThemeLayout.h"
#include "PellikoApp/Window.h"

#include <Elementary.h>
#include <efl_assist.h>

namespace pelliko
{

namespace
{

constexpr const char *domain = "pelliko";
constexpr const char *style = "pelliko";

Evas_Object *_addBar(PellikoAppData *ad, Evas_Object *layout)
{
    Evas_Object *bar = elm_progressbar_add(layout);
    elm_object_theme_set(bar, ad->theme);
    elm_object_style_set(bar, "process_medium");
    elm_progressbar_pulse_set(bar, EINA_TRUE);
    elm_progressbar_pulse(bar, EINA_TRUE);
    elm_object_part_content_set(layout, "processing", bar);
    return bar;
}

} // namespace

void openProcessingPopup(PellikoAppData *ad, Evas_Smart_Cb back)
{
    Evas_Object *popup = elm_popup_add(ad->win);
    if (!popup)
        return;
    keepWhileAlive(&ad->processing_popup, popup);
    elm_object_theme_set(popup, ad->theme);
    elm_object_style_set(popup, style);
    fitPopupScale(ad, popup);
    elm_popup_align_set(popup, ELM_NOTIFY_ALIGN_FILL, 1.0);
    evas_object_size_hint_weight_set(popup, EVAS_HINT_EXPAND, EVAS_HINT_EXPAND);
    ea_object_event_callback_add(popup, EA_CALLBACK_BACK, back, ad);
    Evas_Object *layout = addThemeLayout(popup, ad->theme, "processing_view_layout");
    elm_object_domain_translatable_part_text_set(layout, "elm.text", domain,
                                                 "IDS_RSH_TPOP_PROCESSING_ING_ABB2");
    Evas_Object *bar = _addBar(ad, layout);
    setAccessibleName(bar, elm_object_part_text_get(layout, "elm.text"));
    evas_object_data_set(popup, "progressbar", bar);
    elm_object_content_set(popup, layout);
    evas_object_show(popup);
    showMainWindow(ad);
}

} // namespace pelliko
