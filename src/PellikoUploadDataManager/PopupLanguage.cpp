#include "PellikoUploadDataManager/PopupLanguage.h"

#include "PellikoApp/AppData.h"
#include "PellikoApp/TextFormat.h"
#include "PellikoUploadDataManager/ConfirmationContents.h"
#include "PellikoUploadDataManager/RecipientsRow.h"
#include "PellikoUploadingDataManager/StatusPopup.h"

#include <Elementary.h>

namespace pelliko
{

namespace
{

void _setButton(Evas_Object *popup, const char *part, const char *id)
{
    Evas_Object *button = elm_object_part_content_get(popup, part);
    if (button)
        elm_object_text_set(button, translated(id));
}

// The toolkit turns everything round with the language but the layout that it put around the
// buttons.
void _turnButtons(Evas_Object *popup)
{
    Evas_Object *button = elm_object_part_content_get(popup, "button1");
    Evas_Object *area = button ? elm_object_parent_widget_get(button) : nullptr;
    if (area)
        edje_object_mirrored_set(elm_layout_edje_get(area), elm_config_mirrored_get());
}

} // namespace

void updatePopupLanguage(PellikoAppData *ad)
{
    if (!ad || !ad->popup || !ad->popup_layout)
        return;
    _turnButtons(ad->popup);
    if (isStatusPopup(ad)) {
        setStatusTexts(ad);
        return;
    }
    setConfirmationTexts(ad, ad->popup_layout);
    addRecipientsFromUploadData(ad);
    _setButton(ad->popup, "button1", "IDS_RSH_BUTTON_CANCEL_ABB2");
    _setButton(ad->popup, "button2", "IDS_RSH_BUTTON_SHARE_ABB5");
}

} // namespace pelliko
