// Hardware-key callbacks of the platform's extension to EFL.
#pragma once

#include <Elementary.h>

#ifdef __cplusplus
extern "C" {
#endif

typedef enum { EEXT_CALLBACK_BACK = 0, EEXT_CALLBACK_MORE, EEXT_CALLBACK_LAST } Eext_Callback_Type;

typedef void (*Eext_Event_Cb)(void *data, Evas_Object *obj, void *event_info);

/* Calls `func` when the key of `type` (back: XF86Back or Escape, more: Menu) is pressed while `obj`
   is the topmost visible object of its window that listens for it. The same function registered
   again for the same object and key replaces the earlier registration. Registrations end with the
   object. Main loop only. */
void eext_object_event_callback_add(Evas_Object *obj, Eext_Callback_Type type, Eext_Event_Cb func,
                                    void *data);

/* Returns the data of the removed registration, NULL when there was none. */
void *eext_object_event_callback_del(Evas_Object *obj, Eext_Callback_Type type, Eext_Event_Cb func);

#ifdef __cplusplus
}
#endif
