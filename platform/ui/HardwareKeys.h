// The registry behind the back- and menu-key callbacks of both extension headers.
#pragma once

#include <Ecore_Input.h>
#include <Elementary.h>

namespace pelliko::ui
{

enum class HardwareKey { back, more };

using KeyCallback = void (*)(void *data, Evas_Object *obj, void *event_info);

/// Adds a registration, or gives an equal one (object, key, function) new data. Ends with `object`.
void addKeyCallback(Evas_Object *object, HardwareKey key, KeyCallback function, void *data);

/// Data of the removed registration, null when there was none.
void *removeKeyCallback(Evas_Object *object, HardwareKey key, KeyCallback function);

/// Calls the topmost listener of the event's window; false when nobody listens for this key.
bool pressHardwareKey(const Ecore_Event_Key &event);

} // namespace pelliko::ui
