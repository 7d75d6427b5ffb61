#include "app_preference.h"

#include "ChangeCallbacks.h"
#include "PreferenceStore.h"

#include <Guard.h>

#include <cstdlib>

using namespace pelliko::preference;
using pelliko::platform::guarded;

namespace
{

bool isKey(const char *key)
{
    return key && *key;
}

int codeOf(Outcome outcome)
{
    switch (outcome) {
    case Outcome::Done:
        return PREFERENCE_ERROR_NONE;
    case Outcome::Absent:
        return PREFERENCE_ERROR_NO_KEY;
    case Outcome::Failed:
        break;
    }
    return PREFERENCE_ERROR_IO_ERROR;
}

int set(const char *key, const Value &value)
{
    if (!isKey(key))
        return PREFERENCE_ERROR_INVALID_PARAMETER;
    const int result = codeOf(writeValue(key, value));
    if (result == PREFERENCE_ERROR_NONE)
        valueWasSet(key);
    return result;
}

template <typename Type, typename Store> int get(const char *key, Store store)
{
    if (!isKey(key))
        return PREFERENCE_ERROR_INVALID_PARAMETER;
    std::optional<Value> value;
    if (const int error = codeOf(readValue(key, &value)))
        return error;
    const Type *held = std::get_if<Type>(&*value);
    if (!held)
        return PREFERENCE_ERROR_INVALID_PARAMETER;
    store(*held);
    return PREFERENCE_ERROR_NONE;
}

template <typename Type> int getPlain(const char *key, Type *out)
{
    if (!out)
        return PREFERENCE_ERROR_INVALID_PARAMETER;
    return guarded([=] { return get<Type>(key, [=](Type value) { *out = value; }); });
}

} // namespace

int preference_set_int(const char *key, int value)
{
    return guarded([=] { return set(key, Value(value)); });
}

int preference_get_int(const char *key, int *value)
{
    return getPlain<int>(key, value);
}

int preference_set_double(const char *key, double value)
{
    return guarded([=] { return set(key, Value(value)); });
}

int preference_get_double(const char *key, double *value)
{
    return getPlain<double>(key, value);
}

int preference_set_string(const char *key, const char *value)
{
    if (!value)
        return PREFERENCE_ERROR_INVALID_PARAMETER;
    return guarded([=] { return set(key, Value(std::string(value))); });
}

int preference_get_string(const char *key, char **value)
{
    if (!value)
        return PREFERENCE_ERROR_INVALID_PARAMETER;
    return guarded([=] {
        return get<std::string>(
            key, [=](const std::string &text) { *value = pelliko::platform::mallocedCopy(text); });
    });
}

int preference_set_boolean(const char *key, bool value)
{
    return guarded([=] { return set(key, Value(value)); });
}

int preference_get_boolean(const char *key, bool *value)
{
    return getPlain<bool>(key, value);
}

int preference_remove(const char *key)
{
    if (!isKey(key))
        return PREFERENCE_ERROR_INVALID_PARAMETER;
    return guarded([=] { return codeOf(removeValue(key)); });
}

int preference_remove_all(void)
{
    return codeOf(removeAllValues());
}

int preference_is_existing(const char *key, bool *existing)
{
    if (!isKey(key) || !existing)
        return PREFERENCE_ERROR_INVALID_PARAMETER;
    return guarded([=] {
        std::optional<Value> value;
        const Outcome outcome = readValue(key, &value);
        if (outcome == Outcome::Failed)
            return static_cast<int>(PREFERENCE_ERROR_IO_ERROR);
        *existing = outcome == Outcome::Done;
        return static_cast<int>(PREFERENCE_ERROR_NONE);
    });
}

int preference_set_changed_cb(const char *key, preference_changed_cb callback, void *user_data)
{
    if (!isKey(key) || !callback)
        return PREFERENCE_ERROR_INVALID_PARAMETER;
    return guarded([=] {
        setCallback(key, callback, user_data);
        return PREFERENCE_ERROR_NONE;
    });
}

int preference_unset_changed_cb(const char *key)
{
    if (!isKey(key))
        return PREFERENCE_ERROR_INVALID_PARAMETER;
    return guarded(
        [=] { return unsetCallback(key) ? PREFERENCE_ERROR_NONE : PREFERENCE_ERROR_NO_KEY; });
}
