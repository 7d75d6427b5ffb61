#include "PellikoUploadingDataManager/RecipientPictures.h"

#include "AppLog/AppLog.h"
#include "PellikoApp/AppData.h"
#include "PellikoApp/CText.h"
#include "PellikoApp/Decimal.h"
#include "PellikoUploadDataManager/ContactsRecord.h"
#include "PellikoUploadingDataManager/MarkedList.h"

#include <algorithm>
#include <contacts.h>

namespace pelliko
{

namespace
{

std::string _textOrEmpty(const char *text)
{
    return text ? text : "";
}

// The person's picture goes before the contact's own; empty as soon as a record is missing.
std::string _picture(int number_id)
{
    ContactsRecord number, contact, person;
    if (!number.read(_contacts_number._uri, number_id))
        return {};
    const int contact_index = number.number(_contacts_number.contact_id);
    LOG_DEBUG("contact_index = %d", contact_index);
    if (!contact.read(_contacts_simple_contact._uri, contact_index))
        return {};
    const std::string own =
        _textOrEmpty(contact.text(_contacts_simple_contact.image_thumbnail_path));
    const int person_index = contact.number(_contacts_simple_contact.person_id);
    LOG_DEBUG("person_index = %d", person_index);
    if (!person.read(_contacts_person._uri, person_index))
        return {};
    const std::string shown = _textOrEmpty(person.text(_contacts_person.image_thumbnail_path));
    return shown.empty() ? own : shown;
}

} // namespace

std::vector<std::string> _populateRecipientThumbnailsFromNumIds(app_control_h request)
{
    char *list = nullptr;
    const int error = app_control_get_extra_data(request, "recipient_index_list", &list);
    const CText owned(list);
    if (error != APP_CONTROL_ERROR_NONE || !list) {
        LOG_ERROR("Extra data read failed...");
        return {};
    }
    std::vector<std::string> ids = splitMarkedList(list);
    ids.resize(std::min(ids.size(), static_cast<size_t>(maxNumberIds)));
    const int total_count = static_cast<int>(ids.size());
    LOG_DEBUG("total_count = %d", total_count);
    std::vector<std::string> pictures;
    for (int i = 0; i < total_count; ++i) {
        const int32_t number_id = decimalValue(ids[i].c_str());
        LOG_DEBUG("num_id_list[%d] = %d", i, number_id);
        pictures.push_back(_picture(number_id));
    }
    return pictures;
}

} // namespace pelliko
