// Configuration keys shared by all programs of a user. Keys under "memory/" last until the machine
// stops, keys under "db/" stay.
//
// Functions that return int give 0 for success and -1 for an error. Reading and setting may be done
// on any thread; callbacks are registered on the main loop and come from GLib's default main
// context.
#pragma once

#include "vconf-keys.h"

#ifdef __cplusplus
extern "C" {
#endif

typedef struct _keynode_t keynode_t;
typedef void (*vconf_callback_fn)(keynode_t *node, void *user_data);

/// Writes 0 or 1. -1 (and the output left alone) when the key is absent or of another type.
int vconf_get_bool(const char *in_key, int *boolval);
int vconf_set_bool(const char *in_key, const int boolval);
int vconf_get_int(const char *in_key, int *intval);
int vconf_set_int(const char *in_key, const int intval);
/// A copy for free(); NULL when the key is absent or of another type.
char *vconf_get_str(const char *in_key);
int vconf_set_str(const char *in_key, const char *strval);

/// Calls `cb` after every set of the key by any process, this one included. Several callbacks per
/// key are possible; the same pair of key and callback is registered once (-1 for the second).
int vconf_notify_key_changed(const char *in_key, vconf_callback_fn cb, void *user_data);
/// -1 when that pair is not registered.
int vconf_ignore_key_changed(const char *in_key, vconf_callback_fn cb);

/// The value itself, 0 or 1; -1 for a node of another type.
int vconf_keynode_get_bool(keynode_t *keynode);
/// The value itself; -1 for a node of another type.
int vconf_keynode_get_int(keynode_t *keynode);
/// Lent until the callback returns; NULL for a node of another type.
char *vconf_keynode_get_str(keynode_t *keynode);
/// Lent until the callback returns.
char *vconf_keynode_get_name(keynode_t *keynode);

#ifdef __cplusplus
}
#endif
