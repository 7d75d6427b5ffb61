// Where an application finds its own files, and who it is.
#pragma once

#include "tizen.h"

#ifdef __cplusplus
extern "C" {
#endif

/// "/opt/usr/apps/<id>/res/", always with the trailing slash. A copy for free(); NULL on failure.
char *app_get_resource_path(void);
/// "/opt/usr/apps/<id>/shared/res/", likewise.
char *app_get_shared_resource_path(void);
/// "/opt/usr/apps/<id>/data/", likewise.
char *app_get_data_path(void);
/// "/opt/usr/apps/<id>/shared/data/", likewise.
char *app_get_shared_data_path(void);

/// The program's application id, a copy for free().
int app_get_id(char **id);

#ifdef __cplusplus
}
#endif
