// The platform's button.
#pragma once

#include <Elementary.h>

#ifdef __cplusplus
extern "C" {
#endif

/* An elm_button that takes the platform's styles "popup", "bottom" and "cancelupload" from the
   theme it is given. NULL when `parent` is. */
Evas_Object *uxt_button_add(Evas_Object *parent);

#ifdef __cplusplus
}
#endif
