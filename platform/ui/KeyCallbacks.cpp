// The two public names of the key registry.
#include "HardwareKeys.h"
#include "efl_assist.h"
#include "efl_extension.h"

using pelliko::ui::HardwareKey;

namespace
{

HardwareKey keyOf(Eext_Callback_Type type)
{
    return type == EEXT_CALLBACK_MORE ? HardwareKey::more : HardwareKey::back;
}

HardwareKey keyOf(Ea_Callback_Type type)
{
    return type == EA_CALLBACK_MORE ? HardwareKey::more : HardwareKey::back;
}

} // namespace

void eext_object_event_callback_add(Evas_Object *obj, Eext_Callback_Type type, Eext_Event_Cb func,
                                    void *data)
{
    pelliko::ui::addKeyCallback(obj, keyOf(type), func, data);
}

void *eext_object_event_callback_del(Evas_Object *obj, Eext_Callback_Type type, Eext_Event_Cb func)
{
    return pelliko::ui::removeKeyCallback(obj, keyOf(type), func);
}

void ea_object_event_callback_add(Evas_Object *obj, Ea_Callback_Type type, Ea_Event_Cb func,
                                  void *data)
{
    pelliko::ui::addKeyCallback(obj, keyOf(type), func, data);
}

void *ea_object_event_callback_del(Evas_Object *obj, Ea_Callback_Type type, Ea_Event_Cb func)
{
    return pelliko::ui::removeKeyCallback(obj, keyOf(type), func);
}
