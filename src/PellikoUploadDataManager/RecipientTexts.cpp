#include "PellikoUploadDataManager/RecipientTexts.h"

#include "AppLog/AppLog.h"
#include "PellikoApp/AppData.h"
#include "PellikoApp/TextFormat.h"
#include "PellikoUploadDataManager/UploadNotiData.h"

#include <string>

namespace pelliko
{

namespace
{

constexpr const char *separator = "?";
constexpr const char *smsMark = "+SMS";

char recipientList[recipientListSize];
char recipientIndexList[recipientIndexSize];

} // namespace

const char *getRecipientListText()
{
    return recipientList;
}

const char *getRecipientIndexListText()
{
    return recipientIndexList;
}

void setRecipientTexts(const char *recipient_list, const char *recipient_index_list)
{
    // Either may be the buffer itself.
    if (recipient_list != recipientList)
        copyText(recipientList, sizeof(recipientList), recipient_list);
    if (recipient_index_list != recipientIndexList)
        copyText(recipientIndexList, sizeof(recipientIndexList), recipient_index_list);
}

void _populateExtraData(PellikoAppData *ad)
{
    setRecipientTexts(nullptr, nullptr);
    RETURN_IF_NULL(ad, "ad is NULL");
    const Eina_List *recipients = ad->upload_item ? ad->upload_item->recipient_list : nullptr;
    std::string names, indexes;
    for (const Eina_List *node = recipients; node; node = eina_list_next(node)) {
        const auto *recipient = static_cast<const UploadRecipient *>(eina_list_data_get(node));
        names += recipient->name ? recipient->name : "";
        names += recipient->is_sms == 1 ? smsMark : "";
        names += separator;
        indexes += std::to_string(recipient->number_id) + separator;
    }
    setRecipientTexts(names.c_str(), indexes.c_str());
}

} // namespace pelliko
