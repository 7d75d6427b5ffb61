// A small dictionary of texts. Separate bundles may be used on separate threads.
#pragma once

#include "tizen.h"

#ifdef __cplusplus
extern "C" {
#endif

typedef struct _bundle_t bundle;

typedef enum {
    BUNDLE_ERROR_NONE = TIZEN_ERROR_NONE,
    BUNDLE_ERROR_OUT_OF_MEMORY = TIZEN_ERROR_OUT_OF_MEMORY,
    BUNDLE_ERROR_INVALID_PARAMETER = TIZEN_ERROR_INVALID_PARAMETER,
    BUNDLE_ERROR_KEY_NOT_AVAILABLE = TIZEN_ERROR_KEY_NOT_AVAILABLE,
    BUNDLE_ERROR_KEY_EXISTS = TIZEN_ERROR_BUNDLE | 0x01
} bundle_error_e;

/// An empty bundle for bundle_free, or NULL (the reason is in get_last_result).
bundle *bundle_create(void);

/// Releases the bundle and every text in it.
int bundle_free(bundle *b);

/// Copies key and text into the bundle. KEY_EXISTS when the key is there already; the old value
/// stays.
int bundle_add_str(bundle *b, const char *key, const char *str);

/// Lends the value: *str points into the bundle and is valid until the bundle is freed.
int bundle_get_str(bundle *b, const char *key, char **str);

/// Number of keys; 0 for NULL (with INVALID_PARAMETER in get_last_result).
int bundle_get_count(bundle *b);

/// A deep copy for bundle_free, or NULL.
bundle *bundle_dup(bundle *b_from);

#ifdef __cplusplus
}
#endif
