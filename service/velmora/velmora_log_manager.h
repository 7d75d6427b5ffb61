// Usage-log client: keeps small records of text keys in a private file of the user (README.md).
// Every function may be called on any thread.
#pragma once

#include "bundle.h"

#ifdef __cplusplus
extern "C" {
#endif

typedef struct velmora_log_manager_s *velmora_log_manager_h;

/// Tells how a record fared: `error` is 0 once it is in the file, NOT_PERMITTED while the user has
/// switched collecting off, otherwise a negated errno value (no space, no permission, …). `uri` is
/// lent for the call. Called on the main loop, never from inside the insert.
typedef void (*velmora_log_manager_insert_cb)(int request_id, const char *uri, int error,
                                              void *user_data);

/// Makes a handle for velmora_log_manager_destroy. On failure (INVALID_PARAMETER for NULL, else why
/// the log's folder cannot be made) *handle is left as it was.
int velmora_log_manager_create(velmora_log_manager_h *handle);

/// Ends a handle. Completions that are still on their way are dropped. INVALID_PARAMETER for NULL
/// and for a handle that has been destroyed.
int velmora_log_manager_destroy(velmora_log_manager_h handle);

/// Appends one record: the text keys "app_id", "feature", "extra" and "value" as far as they are in
/// `data`, which stays the caller's. *request_id numbers the records of the process from 1.
/// @param uri where the record belongs, "scheme://authority/path"; the path is kept with it
/// @param callback may be NULL
/// @return 0 when a completion will follow; INVALID_PARAMETER for a handle that is NULL or
/// destroyed,
///         for another NULL, a URI without a path, and a bundle that is empty or has other keys
int velmora_log_manager_insert(velmora_log_manager_h handle, const char *uri, bundle *data,
                               velmora_log_manager_insert_cb callback, void *user_data,
                               int *request_id);

#ifdef __cplusplus
}
#endif
