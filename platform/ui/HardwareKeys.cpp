#include "HardwareKeys.h"

#include "KeyRelay.h"

#include <Ecore_Evas.h>

#include <algorithm>
#include <array>
#include <optional>
#include <string_view>
#include <vector>

namespace pelliko::ui
{

namespace
{

struct Registration {
    Evas_Object *object;
    HardwareKey key;
    KeyCallback function;
    void *data;

    bool isFor(const Evas_Object *o, HardwareKey k, KeyCallback f) const
    {
        return object == o && key == k && function == f;
    }
};

std::vector<Registration> registrations;
bool listening = false;

std::optional<HardwareKey> keyNamed(const char *name)
{
    const std::string_view key = name ? name : "";
    if (key == "XF86Back" || key == "Escape")
        return HardwareKey::back;
    if (key == "XF86MenuKB" || key == "XF86Menu" || key == "Menu")
        return HardwareKey::more;
    return std::nullopt;
}

// From the canvas' own object down to `object`.
std::vector<Evas_Object *> ancestry(Evas_Object *object)
{
    std::vector<Evas_Object *> chain;
    for (Evas_Object *o = object; o; o = evas_object_smart_parent_get(o))
        chain.insert(chain.begin(), o);
    return chain;
}

bool isStackedAbove(Evas_Object *upper, Evas_Object *lower)
{
    for (Evas_Object *o = evas_object_above_get(lower); o; o = evas_object_above_get(o)) {
        if (o == upper)
            return true;
    }
    return false;
}

// Compares the two objects' first ancestors that differ; a descendant lies over what contains it.
bool isOver(Evas_Object *upper, Evas_Object *lower)
{
    const auto up = ancestry(upper), low = ancestry(lower);
    const size_t common = std::min(up.size(), low.size());
    for (size_t i = 0; i < common; ++i) {
        if (up[i] != low[i])
            return isStackedAbove(up[i], low[i]);
    }
    return up.size() > low.size();
}

bool isShownIn(Evas_Object *object, Ecore_Window window)
{
    const Ecore_Evas *canvas = ecore_evas_ecore_evas_get(evas_object_evas_get(object));
    return canvas && ecore_evas_window_get(canvas) == window && evas_object_visible_get(object);
}

std::optional<Registration> topmostListener(HardwareKey key, Ecore_Window window)
{
    std::optional<Registration> top;
    for (const Registration &candidate : registrations) {
        if (candidate.key != key || !isShownIn(candidate.object, window))
            continue;
        // The later of two functions of one object wins.
        if (!top || top->object == candidate.object || isOver(candidate.object, top->object))
            top = candidate;
    }
    return top;
}

// Keys are read before the canvas gets them, so that a focused widget cannot swallow the back key.
Eina_Bool keyDown(void *, int type, void *event_info)
{
    const auto &key = *static_cast<const Ecore_Event_Key *>(event_info);
    keyArrived(type, key);
    return pressHardwareKey(key) ? ECORE_CALLBACK_DONE : ECORE_CALLBACK_PASS_ON;
}

void objectDeleted(void *, Evas *, Evas_Object *object, void *)
{
    std::erase_if(registrations, [object](const Registration &r) { return r.object == object; });
}

bool isListening(const Evas_Object *object)
{
    return std::any_of(registrations.begin(), registrations.end(),
                       [object](const Registration &r) { return r.object == object; });
}

} // namespace

bool pressHardwareKey(const Ecore_Event_Key &event)
{
    const auto key = keyNamed(event.keyname);
    const auto listener = key ? topmostListener(*key, event.event_window) : std::nullopt;
    if (!listener)
        return false;
    listener->function(listener->data, listener->object, nullptr);
    return true;
}

void addKeyCallback(Evas_Object *object, HardwareKey key, KeyCallback function, void *data)
{
    if (!object || !function)
        return;
    removeKeyCallback(object, key, function);
    if (!listening)
        listening = ecore_event_handler_prepend(ECORE_EVENT_KEY_DOWN, keyDown, nullptr) != nullptr;
    if (!isListening(object))
        evas_object_event_callback_add(object, EVAS_CALLBACK_DEL, objectDeleted, nullptr);
    registrations.push_back({object, key, function, data});
}

void *removeKeyCallback(Evas_Object *object, HardwareKey key, KeyCallback function)
{
    const auto found =
        std::find_if(registrations.begin(), registrations.end(),
                     [&](const Registration &r) { return r.isFor(object, key, function); });
    if (found == registrations.end())
        return nullptr;
    void *data = found->data;
    registrations.erase(found);
    if (!isListening(object))
        evas_object_event_callback_del(object, EVAS_CALLBACK_DEL, objectDeleted);
    return data;
}

} // namespace pelliko::ui
