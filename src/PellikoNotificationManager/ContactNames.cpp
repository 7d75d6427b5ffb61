#include "PellikoNotificationManager/ContactNames.h"

#include "AppLog/AppLog.h"
#include "PellikoApp/AppData.h"

#include <contacts.h>
#include <glib.h>

namespace pelliko
{

namespace
{

// A query without its filter would find everybody.
int _query(const char *number, contacts_query_h query, contacts_filter_h filter,
           contacts_list_h *list)
{
    int err = contacts_filter_add_str(filter, _contacts_person_number.number,
                                      CONTACTS_MATCH_CONTAINS, number);
    if (err == CONTACTS_ERROR_NONE)
        err = contacts_query_set_filter(query, filter);
    if (err == CONTACTS_ERROR_NONE)
        err = contacts_db_get_records_with_query(query, 0, 0, list);
    return err;
}

// Everybody whose number contains this one; null when the store cannot be asked.
contacts_list_h _findPersons(const char *number)
{
    contacts_query_h query = nullptr;
    contacts_filter_h filter = nullptr;
    contacts_list_h list = nullptr;
    contacts_query_create(_contacts_person_number._uri, &query);
    contacts_filter_create(_contacts_person_number._uri, &filter);
    const int err = _query(number, query, filter, &list);
    contacts_filter_destroy(filter);
    contacts_query_destroy(query);
    if (err == CONTACTS_ERROR_NONE)
        return list;
    LOG_ERROR("contacts_db_get_records_with_query is failed error_code = %d", err);
    contacts_list_destroy(list, true);
    return nullptr;
}

void _keepPicture(contacts_record_h record)
{
    PellikoAppData *ad = getAppData();
    if (!ad)
        return;
    char *path = nullptr;
    contacts_record_get_str_p(record, _contacts_person_number.image_thumbnail_path, &path);
    g_free(ad->sender_image_path);
    ad->sender_image_path = g_strdup(path);
}

// Null for a person without a name.
char *_readName(contacts_record_h record, int position)
{
    char *name = nullptr;
    contacts_record_get_str_p(record, _contacts_person_number.display_name, &name);
    LOG_DEBUG("contact name[%d] = %s", position, textOrNull(name));
    return name && name[0] != '\0' ? g_strdup(name) : nullptr;
}

char *_firstName(contacts_list_h list)
{
    contacts_record_h record = nullptr;
    for (int i = 0; contacts_list_get_current_record_p(list, &record) == CONTACTS_ERROR_NONE; ++i) {
        char *name = _readName(record, i);
        _keepPicture(record);
        if (name || contacts_list_next(list) != CONTACTS_ERROR_NONE)
            return name;
    }
    return nullptr;
}

} // namespace

char *getContactName(const char *number)
{
    // Every number contains an empty one.
    if (!number || number[0] == '\0')
        return nullptr;
    contacts_list_h list = _findPersons(number);
    if (!list)
        return nullptr;
    char *name = _firstName(list);
    contacts_list_destroy(list, true);
    LOG_DEBUG("First contact name = %s", textOrNull(name));
    return name;
}

} // namespace pelliko
