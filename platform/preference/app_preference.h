// The application's own values: kept across runs, each with a type, with a callback per key.
//
// Every function may be called on any thread. Callbacks run on the main loop, after the set
// returned.
#pragma once

#include "tizen.h"

#ifdef __cplusplus
extern "C" {
#endif

typedef enum {
    PREFERENCE_ERROR_NONE = TIZEN_ERROR_NONE,
    PREFERENCE_ERROR_INVALID_PARAMETER = TIZEN_ERROR_INVALID_PARAMETER,
    PREFERENCE_ERROR_OUT_OF_MEMORY = TIZEN_ERROR_OUT_OF_MEMORY,
    PREFERENCE_ERROR_NO_KEY = TIZEN_ERROR_APPLICATION | 0x30,
    PREFERENCE_ERROR_IO_ERROR = TIZEN_ERROR_IO_ERROR
} preference_error_e;

typedef void (*preference_changed_cb)(const char *key, void *user_data);

/// Setters return after the value is on stable storage and change the key's type when it had
/// another one. Getters: NO_KEY for an absent key, INVALID_PARAMETER for a key of another type; the
/// output is then left alone. Doubles round-trip exactly.
int preference_set_int(const char *key, int value);
int preference_get_int(const char *key, int *value);
int preference_set_double(const char *key, double value);
int preference_get_double(const char *key, double *value);
/// NULL is INVALID_PARAMETER; "" is a value like any other.
int preference_set_string(const char *key, const char *value);
/// A copy for free().
int preference_get_string(const char *key, char **value);
int preference_set_boolean(const char *key, bool value);
int preference_get_boolean(const char *key, bool *value);

/// NO_KEY when there is no such key. No callback is called.
int preference_remove(const char *key);
/// Removes every key of the application; callbacks stay registered and none is called.
int preference_remove_all(void);
int preference_is_existing(const char *key, bool *existing);

/// One callback per key; registering again replaces callback and user data. The callback is called
/// once for every successful set made by this process after the registration, also when the value
/// did not change. Calls that are pending when the loop ends are dropped.
int preference_set_changed_cb(const char *key, preference_changed_cb callback, void *user_data);
/// NO_KEY when none is registered.
int preference_unset_changed_cb(const char *key);

#ifdef __cplusplus
}
#endif
