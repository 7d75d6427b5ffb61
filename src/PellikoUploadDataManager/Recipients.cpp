#include "PellikoUploadDataManager/Recipients.h"

#include "AppLog/AppLog.h"
#include "PellikoUploadDataManager/ContactsRecord.h"

#include <algorithm>
#include <cerrno>
#include <contacts.h>
#include <contacts_ex.h>
#include <cstdio>
#include <cstring>
#include <glib.h>
#include <memory>
#include <new>

namespace pelliko
{

int g_has_sms_receiver = 0;

namespace
{

constexpr const char *serviceAddressBook = "ZORP_Universal_Contact";
constexpr size_t numberIdTextSize = 50;

// What the loop over the ids does after one of them.
enum class Step { next, stop };

struct GFree {
    void operator()(char *text) const { g_free(text); }
};

struct RecipientRecords {
    ContactsRecord number;
    ContactsRecord contact;
    ContactsRecord person;
    std::unique_ptr<char, GFree> number_text;
};

// The number without formatting characters, as a copy.
char *_readNumber(const ContactsRecord &record)
{
    const char *stored = record.text(_contacts_number.number);
    char *normalized = _makeNormalizedNumber(stored);
    if (!normalized)
        return g_strdup(stored);
    LOG_DEBUG("normalized number = %s", normalized);
    return normalized;
}

void _fillRecipient(UploadRecipient &recipient, int32_t number_id, RecipientRecords &records)
{
    recipient.type = records.number.number(_contacts_number.type);
    recipient.number_id = number_id;
    recipient.name = g_strdup(records.contact.text(_contacts_simple_contact.display_name));
    recipient.number = records.number_text.release();
    recipient.image_path = g_strdup(records.person.text(_contacts_person.image_thumbnail_path));
}

void _markSmsReceiver(UploadRecipient &recipient)
{
    uint8_t joined = 0;
    _getStatusByNumberId(recipient.number_id, &joined);
    if (joined)
        return;
    recipient.is_sms = 1;
    g_has_sms_receiver = 1;
}

Step _appendRecipient(UploadItem &item, int32_t number_id, RecipientRecords &records)
{
    std::unique_ptr<UploadRecipient> recipient(new (std::nothrow) UploadRecipient);
    if (!recipient) {
        LOG_ERROR("Malloc error");
        return Step::stop;
    }
    _fillRecipient(*recipient, number_id, records);
    _markSmsReceiver(*recipient);
    item.recipient_list = eina_list_append(item.recipient_list, recipient.get());
    // Without memory for its entry the list stays as it was.
    if (eina_list_last_data_get(item.recipient_list) == recipient.get())
        static_cast<void>(recipient.release());
    if (item.recipient_list)
        LOG_DEBUG("recipient_list is valid");
    else
        LOG_ERROR("recipient_list is NULL");
    return Step::next;
}

// A number or contact that is missing skips the id; a missing person ends the list.
Step _addRecipient(UploadItem &item, int32_t number_id)
{
    LOG_DEBUG("phone number case");
    RecipientRecords records;
    if (!records.number.read(_contacts_number._uri, number_id))
        return Step::next;
    records.number_text.reset(_readNumber(records.number));
    const int contact_id = records.number.number(_contacts_number.contact_id);
    if (!records.contact.read(_contacts_simple_contact._uri, contact_id))
        return Step::next;
    const int person_id = records.contact.number(_contacts_simple_contact.person_id);
    if (!records.person.read(_contacts_person._uri, person_id))
        return Step::stop;
    LOG_DEBUG("**************************");
    LOG_DEBUG("number_id = %d", number_id);
    LOG_DEBUG("contact_id = %d", contact_id);
    LOG_DEBUG("type = %d", records.number.number(_contacts_number.type));
    return _appendRecipient(item, number_id, records);
}

// What to look for. A filter that lacks a part would find the mark of somebody else.
int _fillStatusFilter(contacts_filter_h filter, const char *number_id_text)
{
    int ct_ret = contacts_filter_add_str(filter, _contacts_person_contact.address_book_name,
                                         CONTACTS_MATCH_FULLSTRING, serviceAddressBook);
    if (ct_ret == CONTACTS_ERROR_NONE)
        ct_ret = contacts_filter_add_operator(filter, CONTACTS_FILTER_OPERATOR_AND);
    if (ct_ret == CONTACTS_ERROR_NONE)
        ct_ret = contacts_filter_add_str(filter, _contacts_person_contact_ex.number_id,
                                         CONTACTS_MATCH_FULLSTRING, number_id_text);
    return ct_ret;
}

int _queryStatus(const char *number_id_text, contacts_list_h *list)
{
    contacts_filter_h filter = nullptr;
    contacts_query_h query = nullptr;
    int ct_ret = contacts_filter_create(_contacts_person_contact._uri, &filter);
    if (ct_ret == CONTACTS_ERROR_NONE)
        ct_ret = _fillStatusFilter(filter, number_id_text);
    if (ct_ret == CONTACTS_ERROR_NONE)
        ct_ret = contacts_query_create(_contacts_person_contact._uri, &query);
    if (ct_ret == CONTACTS_ERROR_NONE)
        ct_ret = contacts_query_set_filter(query, filter);
    if (ct_ret == CONTACTS_ERROR_NONE)
        ct_ret = contacts_db_get_records_with_query(query, 0, 0, list);
    contacts_query_destroy(query);
    contacts_filter_destroy(filter);
    return ct_ret;
}

// The first status text that is present decides.
void _readStatus(contacts_list_h list, uint8_t *joined)
{
    contacts_record_h record = nullptr;
    contacts_list_first(list);
    while (contacts_list_get_current_record_p(list, &record) == CONTACTS_ERROR_NONE && record) {
        char *sync2 = nullptr;
        contacts_record_get_str_p(record, _contacts_person_contact_ex.sync2, &sync2);
        if (sync2) {
            LOG_DEBUG("sync2:[%s]", sync2);
            if (strchr(sync2, 'R')) {
                LOG_DEBUG("This is a joined user. Returning TRUE");
                *joined = 1;
            }
            return;
        }
        LOG_DEBUG("sync2 is NULL");
        if (contacts_list_next(list) != CONTACTS_ERROR_NONE)
            return;
    }
}

} // namespace

void _createRecipientToUpload(PellikoAppData *ad)
{
    RETURN_IF_NULL(ad, "ad is NULL");
    if (!ad->upload_item)
        ad->upload_item = createUploadData();
    if (!ad->upload_item)
        return;
    clearUploadRecipients(*ad->upload_item);
    const int32_t count = std::min(ad->number_id_count, maxNumberIds);
    for (int32_t i = 0; i < count; ++i) {
        if (_addRecipient(*ad->upload_item, ad->number_id_list[i]) == Step::stop)
            return;
    }
}

char *_makeNormalizedNumber(const char *src)
{
    RETURN_VALUE_IF_NULL(src, nullptr, "src is NULL");
    if (!strpbrk(src, " /-()"))
        return nullptr;
    auto *number = static_cast<char *>(g_try_malloc0(strlen(src) + 1));
    if (!number) {
        LOG_ERROR("calloc is failed %s", g_strerror(errno));
        return nullptr;
    }
    char *end = number;
    for (const char *from = src; *from; ++from) {
        if (strchr("0123456789*+#", *from))
            *end++ = *from;
    }
    return number;
}

void _getStatusByNumberId(int32_t number_id, uint8_t *joined)
{
    LOG_DEBUG("number_id:[%d]", number_id);
    char number_id_text[numberIdTextSize];
    snprintf(number_id_text, sizeof(number_id_text), "%d", number_id);
    contacts_list_h list = nullptr;
    const int ct_ret = _queryStatus(number_id_text, &list);
    LOG_DEBUG("ct_ret = %d", ct_ret);
    if (ct_ret != CONTACTS_ERROR_NONE) {
        LOG_ERROR("contacts_db_get_records_with_query is failed error_code = %d", ct_ret);
        return;
    }
    _readStatus(list, joined);
    contacts_list_destroy(list, true);
}

} // namespace pelliko
