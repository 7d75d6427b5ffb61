// Handles and their contents; nothing here speaks to the bus.
#include "Handle.h"

#include "Guard.h"

#include <cstdlib>
#include <glib.h>

using pelliko::platform::Extra;
using pelliko::platform::guarded;
using pelliko::platform::mallocedCopy;
using pelliko::platform::TextArray;

namespace
{

using Attribute = std::optional<std::string> app_control_s::*;

constexpr const char *kReservedPrefix = "__";

int setAttribute(app_control_h request, Attribute attribute, const char *value)
{
    if (!request)
        return APP_CONTROL_ERROR_INVALID_PARAMETER;
    return guarded([=] {
        if (value)
            request->*attribute = value;
        else
            (request->*attribute).reset();
        return APP_CONTROL_ERROR_NONE;
    });
}

int getAttribute(app_control_h request, Attribute attribute, char **out)
{
    if (!request || !out)
        return APP_CONTROL_ERROR_INVALID_PARAMETER;
    return guarded([=] {
        const auto &value = request->*attribute;
        *out = value ? mallocedCopy(*value) : nullptr;
        return APP_CONTROL_ERROR_NONE;
    });
}

// Keys travel as keys of a bus dictionary, which are UTF-8.
bool isKey(const char *key)
{
    return key && *key && g_utf8_validate(key, -1, nullptr);
}

int checkNewKey(const char *key)
{
    if (!isKey(key))
        return APP_CONTROL_ERROR_INVALID_PARAMETER;
    return g_str_has_prefix(key, kReservedPrefix) ? APP_CONTROL_ERROR_KEY_REJECTED
                                                  : APP_CONTROL_ERROR_NONE;
}

int findExtra(app_control_h request, const char *key, const Extra **extra)
{
    if (!request || !isKey(key))
        return APP_CONTROL_ERROR_INVALID_PARAMETER;
    const auto found = request->extras.find(key);
    if (found == request->extras.end())
        return APP_CONTROL_ERROR_KEY_NOT_FOUND;
    *extra = &found->second;
    return APP_CONTROL_ERROR_NONE;
}

TextArray arrayFrom(const char *value[], int length)
{
    TextArray array;
    array.reserve(static_cast<std::size_t>(length));
    for (int i = 0; i < length; ++i)
        array.push_back(value[i] ? std::optional<std::string>(value[i]) : std::nullopt);
    return array;
}

// calloc, so that the caller releases the array itself with free() as well.
char **mallocedArray(const TextArray &array)
{
    auto **copy = static_cast<char **>(std::calloc(array.size() + 1, sizeof(char *)));
    if (!copy)
        throw std::bad_alloc();
    for (std::size_t i = 0; i < array.size(); ++i)
        copy[i] = array[i] ? mallocedCopy(*array[i]) : nullptr;
    return copy;
}

} // namespace

int app_control_create(app_control_h *app_control)
{
    if (!app_control)
        return APP_CONTROL_ERROR_INVALID_PARAMETER;
    return guarded([=] {
        *app_control = new app_control_s;
        return APP_CONTROL_ERROR_NONE;
    });
}

int app_control_destroy(app_control_h app_control)
{
    if (!app_control)
        return APP_CONTROL_ERROR_INVALID_PARAMETER;
    delete app_control;
    return APP_CONTROL_ERROR_NONE;
}

int app_control_clone(app_control_h *clone, app_control_h app_control)
{
    if (!clone || !app_control)
        return APP_CONTROL_ERROR_INVALID_PARAMETER;
    return guarded([=] {
        *clone = new app_control_s(*app_control);
        return APP_CONTROL_ERROR_NONE;
    });
}

int app_control_set_operation(app_control_h app_control, const char *operation)
{
    return setAttribute(app_control, &app_control_s::operation, operation);
}

int app_control_get_operation(app_control_h app_control, char **operation)
{
    return getAttribute(app_control, &app_control_s::operation, operation);
}

int app_control_set_uri(app_control_h app_control, const char *uri)
{
    return setAttribute(app_control, &app_control_s::uri, uri);
}

int app_control_get_uri(app_control_h app_control, char **uri)
{
    return getAttribute(app_control, &app_control_s::uri, uri);
}

int app_control_set_mime(app_control_h app_control, const char *mime)
{
    return setAttribute(app_control, &app_control_s::mime, mime);
}

int app_control_get_mime(app_control_h app_control, char **mime)
{
    return getAttribute(app_control, &app_control_s::mime, mime);
}

int app_control_set_app_id(app_control_h app_control, const char *app_id)
{
    return setAttribute(app_control, &app_control_s::appId, app_id);
}

int app_control_get_app_id(app_control_h app_control, char **app_id)
{
    return getAttribute(app_control, &app_control_s::appId, app_id);
}

int app_control_add_extra_data(app_control_h app_control, const char *key, const char *value)
{
    if (!app_control || !value || !*value)
        return APP_CONTROL_ERROR_INVALID_PARAMETER;
    if (const int error = checkNewKey(key))
        return error;
    return guarded([=] {
        app_control->extras.insert_or_assign(key, Extra(std::string(value)));
        return APP_CONTROL_ERROR_NONE;
    });
}

int app_control_add_extra_data_array(app_control_h app_control, const char *key,
                                     const char *value[], int length)
{
    if (!app_control || !value || length <= 0)
        return APP_CONTROL_ERROR_INVALID_PARAMETER;
    if (const int error = checkNewKey(key))
        return error;
    return guarded([=] {
        app_control->extras.insert_or_assign(key, Extra(arrayFrom(value, length)));
        return APP_CONTROL_ERROR_NONE;
    });
}

int app_control_remove_extra_data(app_control_h app_control, const char *key)
{
    const Extra *extra = nullptr;
    if (const int error = findExtra(app_control, key, &extra))
        return error;
    app_control->extras.erase(key);
    return APP_CONTROL_ERROR_NONE;
}

int app_control_get_extra_data(app_control_h app_control, const char *key, char **value)
{
    const Extra *extra = nullptr;
    if (!value)
        return APP_CONTROL_ERROR_INVALID_PARAMETER;
    if (const int error = findExtra(app_control, key, &extra))
        return error;
    const auto *text = std::get_if<std::string>(extra);
    if (!text)
        return APP_CONTROL_ERROR_INVALID_DATA_TYPE;
    return guarded([=] {
        *value = mallocedCopy(*text);
        return APP_CONTROL_ERROR_NONE;
    });
}

int app_control_get_extra_data_array(app_control_h app_control, const char *key, char ***value,
                                     int *length)
{
    const Extra *extra = nullptr;
    if (!value || !length)
        return APP_CONTROL_ERROR_INVALID_PARAMETER;
    if (const int error = findExtra(app_control, key, &extra))
        return error;
    const auto *array = std::get_if<TextArray>(extra);
    if (!array)
        return APP_CONTROL_ERROR_INVALID_DATA_TYPE;
    return guarded([=] {
        *value = mallocedArray(*array);
        *length = static_cast<int>(array->size());
        return APP_CONTROL_ERROR_NONE;
    });
}

int app_control_is_extra_data_array(app_control_h app_control, const char *key, bool *array)
{
    const Extra *extra = nullptr;
    if (!array)
        return APP_CONTROL_ERROR_INVALID_PARAMETER;
    if (const int error = findExtra(app_control, key, &extra))
        return error;
    *array = std::holds_alternative<TextArray>(*extra);
    return APP_CONTROL_ERROR_NONE;
}
