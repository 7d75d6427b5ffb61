// One record of the contacts store while it is read. Main loop only.
#pragma once

#include "AppLog/AppLog.h"

#include <contacts.h>

namespace pelliko
{

/// Owns a record, which is destroyed with its children.
class ContactsRecord
{
public:
    ContactsRecord() = default;
    ContactsRecord(const ContactsRecord &) = delete;
    ContactsRecord &operator=(const ContactsRecord &) = delete;
    ~ContactsRecord()
    {
        if (handle_)
            contacts_record_destroy(handle_, true);
    }

    /// Reads the record of a view by its id, once; false after logging the store's error.
    bool read(const char *view, int id)
    {
        const int ct_ret = contacts_db_get_record(view, id, &handle_);
        if (ct_ret != CONTACTS_ERROR_NONE)
            LOG_ERROR("contacts_db_get_record is failed ct_ret = %d", ct_ret);
        return ct_ret == CONTACTS_ERROR_NONE;
    }

    int number(unsigned int property) const
    {
        int value = 0;
        contacts_record_get_int(handle_, property, &value);
        return value;
    }

    /// Borrowed from the record; may be null.
    const char *text(unsigned int property) const
    {
        char *value = nullptr;
        contacts_record_get_str_p(handle_, property, &value);
        return value;
    }

private:
    contacts_record_h handle_ = nullptr;
};

} // namespace pelliko
