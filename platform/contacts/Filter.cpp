#include "Filter.h"

#include <new>

#include "Database.h"

using namespace pelliko::contacts;

namespace
{

template <typename Handle> int createFor(const char *view_uri, Handle **handle)
{
    const View *view = findView(view_uri);
    if (!view || !handle)
        return CONTACTS_ERROR_INVALID_PARAMETER;
    auto *created = new (std::nothrow) Handle{view, {}};
    if (!created)
        return CONTACTS_ERROR_OUT_OF_MEMORY;
    *handle = created;
    return CONTACTS_ERROR_NONE;
}

template <typename Handle> int destroy(Handle *handle)
{
    if (!handle)
        return CONTACTS_ERROR_INVALID_PARAMETER;
    delete handle;
    return CONTACTS_ERROR_NONE;
}

// The property when a condition may stand next in the filter, else null.
const Property *nextProperty(contacts_filter_h filter, unsigned int property_id, ValueType type)
{
    if (!filter || filter->row.conditions.size() != filter->row.operators.size())
        return nullptr;
    const Property *property = filter->view->find(property_id);
    return property && property->type == type ? property : nullptr;
}

int add(contacts_filter_h filter, Condition condition) noexcept
{
    try {
        filter->row.conditions.push_back(std::move(condition));
        return CONTACTS_ERROR_NONE;
    } catch (...) {
        return errorOfException();
    }
}

} // namespace

extern "C" int contacts_filter_create(const char *view_uri, contacts_filter_h *filter)
{
    return createFor(view_uri, filter);
}

extern "C" int contacts_filter_destroy(contacts_filter_h filter)
{
    return destroy(filter);
}

extern "C" int contacts_filter_add_str(contacts_filter_h filter, unsigned int property_id,
                                       contacts_match_str_flag_e match, const char *match_value)
{
    const Property *property = nextProperty(filter, property_id, ValueType::Text);
    if (!property || match < CONTACTS_MATCH_EXACTLY || match > CONTACTS_MATCH_EXISTS)
        return CONTACTS_ERROR_INVALID_PARAMETER;
    if (!match_value && match != CONTACTS_MATCH_EXISTS)
        return CONTACTS_ERROR_INVALID_PARAMETER;
    return add(filter, {property, TextMatch{match, match_value ? match_value : ""}});
}

extern "C" int contacts_filter_add_int(contacts_filter_h filter, unsigned int property_id,
                                       contacts_match_int_flag_e match, int match_value)
{
    const Property *property = nextProperty(filter, property_id, ValueType::Integer);
    if (!property || match < CONTACTS_MATCH_EQUAL || match > CONTACTS_MATCH_NONE)
        return CONTACTS_ERROR_INVALID_PARAMETER;
    return add(filter, {property, IntegerMatch{match, match_value}});
}

extern "C" int contacts_filter_add_operator(contacts_filter_h filter,
                                            contacts_filter_operator_e operator_type)
{
    if (!filter || filter->row.conditions.size() != filter->row.operators.size() + 1)
        return CONTACTS_ERROR_INVALID_PARAMETER;
    if (operator_type != CONTACTS_FILTER_OPERATOR_AND &&
        operator_type != CONTACTS_FILTER_OPERATOR_OR)
        return CONTACTS_ERROR_INVALID_PARAMETER;
    try {
        filter->row.operators.push_back(operator_type);
        return CONTACTS_ERROR_NONE;
    } catch (...) {
        return errorOfException();
    }
}

extern "C" int contacts_query_create(const char *view_uri, contacts_query_h *query)
{
    return createFor(view_uri, query);
}

extern "C" int contacts_query_destroy(contacts_query_h query)
{
    return destroy(query);
}

extern "C" int contacts_query_set_filter(contacts_query_h query, contacts_filter_h filter)
{
    if (!query || !filter || query->view != filter->view || filter->row.endsInOperator())
        return CONTACTS_ERROR_INVALID_PARAMETER;
    try {
        query->row = filter->row;
        return CONTACTS_ERROR_NONE;
    } catch (...) {
        return errorOfException();
    }
}
