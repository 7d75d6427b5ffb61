#include "PellikoUploadDataManager/ConfirmationContents.h"

#include "AppLog/AppLog.h"
#include "PellikoApp/AccessibleName.h"
#include "PellikoApp/AppData.h"
#include "PellikoApp/CText.h"
#include "PellikoApp/TextFormat.h"
#include "PellikoApp/ThemeLayout.h"
#include "PellikoUploadDataManager/ConfirmationTexts.h"
#include "PellikoUploadDataManager/RecipientTexts.h"
#include "PellikoUploadDataManager/RecipientsRow.h"

#include <Elementary.h>
#include <pelliko_client.h>

namespace pelliko
{

namespace
{

constexpr const char *labelPart = "elm.swallow.box";

unsigned int _recipientCount(const PellikoAppData *ad)
{
    return ad->upload_item ? eina_list_count(ad->upload_item->recipient_list) : 0;
}

void _addLabel(Evas_Object *layout)
{
    Evas_Object *label = elm_label_add(layout);
    elm_object_style_set(label, "popup/default");
    elm_label_line_wrap_set(label, ELM_WRAP_WORD);
    elm_object_part_content_set(layout, labelPart, label);
}

// Shares the files of an earlier upload: the service knows how many and how large they are.
void _readEarlierUpload(PellikoAppData *ad)
{
    pelliko_upload_info_h info = nullptr;
    int error = pelliko_upload_info_get_handle(ad->req_id_to_reshare, &info);
    if (error != PELLIKO_ERROR_NONE) {
        LOG_ERROR("pelliko_upload_info_get_handle failed. Error = %d", error);
        return;
    }
    char **files = nullptr;
    int32_t count = 0;
    int64_t size = 0;
    error = pelliko_upload_info_get_file_info(info, &files, &count, &size);
    if (error != PELLIKO_ERROR_NONE) {
        LOG_ERROR("pelliko_upload_info_get_file_info failed. Error = %d", error);
        return;
    }
    ad->upload_item->files_count = count;
    ad->upload_item->files_size = static_cast<int32_t>(static_cast<uint32_t>(size));
}

void _addCheckBox(PellikoAppData *ad, Evas_Object *layout, bool wifi_only)
{
    Evas_Object *check = elm_check_add(layout);
    elm_object_theme_set(check, ad->theme);
    elm_object_style_set(check, "pelliko");
    ad->wifi_check = wifi_only ? 1 : 0;
    elm_check_state_set(check, ad->wifi_check);
    elm_object_part_content_set(layout, "elm.swallow.checkbox", check);
    keepWhileAlive(&ad->wifi_check_box, check);
}

void _setHeading(PellikoAppData *ad, Evas_Object *layout)
{
    char heading[popupTextSize];
    formatTranslated(heading, sizeof(heading), translated("IDS_RSH_HEADER_RECIPIENTS_HPD_ABB"), "d",
                     static_cast<int>(_recipientCount(ad)));
    elm_object_part_text_set(layout, "elm.swallow.label.text", heading);
    setAccessibleName(layout, heading);
}

void _setSummary(Evas_Object *layout, const char *summary)
{
    elm_object_part_text_set(layout, "elm.text.info", summary);
    const CText plain(elm_entry_markup_to_utf8(summary));
    setAccessibleName(layout, plain.get());
}

} // namespace

void addConfirmationContents(PellikoAppData *ad, Evas_Object *layout, bool wifi_only)
{
    _populateExtraData(ad);
    _addLabel(layout);
    if (ad->action_type == ACTION_RESHARE_UPLOAD && ad->upload_item)
        _readEarlierUpload(ad);
    _addCheckBox(ad, layout, wifi_only);
    setConfirmationTexts(ad, layout);
    addRecipientsFromUploadData(ad);
}

void setConfirmationTexts(PellikoAppData *ad, Evas_Object *layout)
{
    char body[popupTextSize], summary[popupTextSize];
    getTextForConfirmationPopup(ad, body, summary);
    Evas_Object *label = elm_object_part_content_get(layout, labelPart);
    elm_object_part_text_set(label, "elm.text", body);
    const char *wifi_only = translated("IDS_RSH_TMBODY_SHARE_VIA_WI_FI_ONLY_ABB");
    elm_object_part_text_set(layout, "elm.text", wifi_only);
    // Not shown: assistive programs find the check box by it.
    elm_object_text_set(ad->wifi_check_box, wifi_only);
    // The layout would pass for the row's text, and with it for a second check box, if it had no
    // name of its own.
    setAccessibleName(layout, "");
    if (_recipientCount(ad) == 1)
        _setSummary(layout, summary);
    else if (_recipientCount(ad) > 1)
        _setHeading(ad, layout);
}

} // namespace pelliko
