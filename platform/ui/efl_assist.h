// Hardware-key callbacks and image masks of the platform's assistance to EFL.
#pragma once

#include <Elementary.h>

#ifdef __cplusplus
extern "C" {
#endif

typedef enum { EA_CALLBACK_BACK = 0, EA_CALLBACK_MORE, EA_CALLBACK_LAST } Ea_Callback_Type;

typedef void (*Ea_Event_Cb)(void *data, Evas_Object *obj, void *event_info);

/* As eext_object_event_callback_add(): one registration per object, key and function; the topmost
   visible object of the window that listens gets the key, the others do not. Main loop only. */
void ea_object_event_callback_add(Evas_Object *obj, Ea_Callback_Type type, Ea_Event_Cb func,
                                  void *data);

/* Returns the data of the removed registration, NULL when there was none. */
void *ea_object_event_callback_del(Evas_Object *obj, Ea_Callback_Type type, Ea_Event_Cb func);

/* Clips an image object (elm_image, elm_icon or an Evas image) by the alpha channel of the mask
   file. The picture is cut to the mask's proportions around its middle first, so that a round mask
   stays round. EINA_FALSE, with the image unchanged, when the mask or the image has no readable
   pixels. */
Eina_Bool ea_image_mask_set(Evas_Object *image, const char *mask_path);

#ifdef __cplusplus
}
#endif
