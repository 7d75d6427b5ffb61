#include "Records.h"

#include <cstdlib>
#include <cstring>

using Value = std::variant<std::monostate, int, std::string>;
using pelliko::contacts::ValueType;

namespace
{

// The value of a readable property of that type, else null.
Value *findValue(contacts_record_h record, unsigned int property_id, ValueType type)
{
    if (!record)
        return nullptr;
    size_t at = 0;
    for (const auto &property : record->view->properties) {
        if (!property.isReadable())
            continue;
        if (property.id == property_id)
            return property.type == type ? &record->values[at] : nullptr;
        ++at;
    }
    return nullptr;
}

} // namespace

extern "C" int contacts_record_destroy(contacts_record_h record, bool)
{
    if (!record)
        return CONTACTS_ERROR_INVALID_PARAMETER;
    delete record;
    return CONTACTS_ERROR_NONE;
}

extern "C" int contacts_record_get_int(contacts_record_h record, unsigned int property_id,
                                       int *value)
{
    const Value *found = findValue(record, property_id, ValueType::Integer);
    if (!found || !value)
        return CONTACTS_ERROR_INVALID_PARAMETER;
    const int *number = std::get_if<int>(found);
    *value = number ? *number : 0;
    return CONTACTS_ERROR_NONE;
}

extern "C" int contacts_record_get_str_p(contacts_record_h record, unsigned int property_id,
                                         char **value)
{
    Value *found = findValue(record, property_id, ValueType::Text);
    if (!found || !value)
        return CONTACTS_ERROR_INVALID_PARAMETER;
    auto *text = std::get_if<std::string>(found);
    *value = text ? text->data() : nullptr;
    return CONTACTS_ERROR_NONE;
}

extern "C" int contacts_record_get_str(contacts_record_h record, unsigned int property_id,
                                       char **value)
{
    char *borrowed = nullptr;
    if (!value)
        return CONTACTS_ERROR_INVALID_PARAMETER;
    const int result = contacts_record_get_str_p(record, property_id, &borrowed);
    if (result != CONTACTS_ERROR_NONE)
        return result;
    char *copy = borrowed ? strdup(borrowed) : nullptr;
    if (borrowed && !copy)
        return CONTACTS_ERROR_OUT_OF_MEMORY;
    *value = copy;
    return CONTACTS_ERROR_NONE;
}

extern "C" int contacts_list_get_count(contacts_list_h contacts_list, int *count)
{
    if (!contacts_list || !count)
        return CONTACTS_ERROR_INVALID_PARAMETER;
    *count = static_cast<int>(contacts_list->records.size());
    return CONTACTS_ERROR_NONE;
}

extern "C" int contacts_list_first(contacts_list_h contacts_list)
{
    if (!contacts_list)
        return CONTACTS_ERROR_INVALID_PARAMETER;
    contacts_list->current = 0;
    return contacts_list->records.empty() ? CONTACTS_ERROR_NO_DATA : CONTACTS_ERROR_NONE;
}

extern "C" int contacts_list_next(contacts_list_h contacts_list)
{
    if (!contacts_list)
        return CONTACTS_ERROR_INVALID_PARAMETER;
    const size_t count = contacts_list->records.size();
    if (contacts_list->current < count)
        ++contacts_list->current;
    return contacts_list->current < count ? CONTACTS_ERROR_NONE : CONTACTS_ERROR_NO_DATA;
}

extern "C" int contacts_list_get_current_record_p(contacts_list_h contacts_list,
                                                  contacts_record_h *record)
{
    if (!contacts_list || !record)
        return CONTACTS_ERROR_INVALID_PARAMETER;
    if (contacts_list->current >= contacts_list->records.size()) {
        *record = nullptr;
        return CONTACTS_ERROR_NO_DATA;
    }
    *record = contacts_list->records[contacts_list->current].get();
    return CONTACTS_ERROR_NONE;
}

extern "C" int contacts_list_destroy(contacts_list_h contacts_list, bool delete_child)
{
    if (!contacts_list)
        return CONTACTS_ERROR_INVALID_PARAMETER;
    if (!delete_child) {
        for (auto &record : contacts_list->records)
            static_cast<void>(record.release());
    }
    delete contacts_list;
    return CONTACTS_ERROR_NONE;
}
