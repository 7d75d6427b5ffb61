#include "KeyRelay.h"

#include "HardwareKeys.h"

#include <Ecore.h>
#include <Ecore_Input_Evas.h>

#include <algorithm>
#include <deque>
#include <string>
#include <utility>
#include <vector>

namespace pelliko::ui
{

namespace
{

// What tells one key event from all others.
struct Identity {
    int type;
    unsigned int time, keycode;
    bool operator==(const Identity &) const = default;
};

Identity identityOf(int type, const Ecore_Event_Key &key)
{
    return {type, key.timestamp, key.keycode};
}

// A key event that outlives the toolkit's own, which goes when a filter refuses it.
class KeptKey
{
public:
    KeptKey(int type, const Ecore_Event_Key &key)
        : type_(type), key_(key), name_(textOf(key.keyname)), symbol_(textOf(key.key)),
          string_(textOf(key.string)), compose_(textOf(key.compose)), hasString_(key.string),
          hasCompose_(key.compose)
    {
        key_.data = nullptr;
        key_.dev = nullptr;
    }

    Identity identity() const { return identityOf(type_, key_); }

    void deliver() const
    {
        Ecore_Event_Key key = key_;
        key.keyname = name_.c_str();
        key.key = symbol_.c_str();
        key.string = hasString_ ? string_.c_str() : nullptr;
        key.compose = hasCompose_ ? compose_.c_str() : nullptr;
        if (type_ == ECORE_EVENT_KEY_UP)
            ecore_event_evas_key_up(nullptr, type_, &key);
        else if (!pressHardwareKey(key))
            ecore_event_evas_key_down(nullptr, type_, &key);
    }

private:
    static std::string textOf(const char *text) { return text ? text : ""; }

    int type_;
    Ecore_Event_Key key_;
    std::string name_, symbol_, string_, compose_;
    bool hasString_, hasCompose_;
};

// Registries that do understand the bridge give a key back a little later.
constexpr size_t remembered = 32;

std::vector<KeptKey> underway;  ///< seen by the filter, not yet by a handler
std::deque<Identity> delivered; ///< by the relay, the latest ones

void deliverLostKeys(void *)
{
    for (const KeptKey &key : std::exchange(underway, {})) {
        delivered.push_back(key.identity());
        if (delivered.size() > remembered)
            delivered.pop_front();
        key.deliver();
    }
}

// Jobs are events too: this one comes after the keys that stand before it in the queue.
Eina_Bool noteKey(void *, void *, int type, void *info)
{
    if (type != ECORE_EVENT_KEY_DOWN && type != ECORE_EVENT_KEY_UP)
        return EINA_TRUE;
    const auto &key = *static_cast<const Ecore_Event_Key *>(info);
    const Identity identity = identityOf(type, key);
    if (std::find(delivered.begin(), delivered.end(), identity) != delivered.end())
        return EINA_FALSE;
    if (underway.empty())
        ecore_job_add(deliverLostKeys, nullptr);
    const bool known = std::any_of(underway.begin(), underway.end(),
                                   [&](const KeptKey &k) { return k.identity() == identity; });
    if (!known)
        underway.emplace_back(type, key);
    return EINA_TRUE;
}

Eina_Bool handleKey(void *, int type, void *info)
{
    keyArrived(type, *static_cast<const Ecore_Event_Key *>(info));
    return ECORE_CALLBACK_PASS_ON;
}

} // namespace

void relayKeysPastReader()
{
    ecore_event_filter_add(nullptr, noteKey, nullptr, nullptr);
    ecore_event_handler_prepend(ECORE_EVENT_KEY_DOWN, handleKey, nullptr);
    ecore_event_handler_prepend(ECORE_EVENT_KEY_UP, handleKey, nullptr);
}

void keyArrived(int type, const Ecore_Event_Key &key)
{
    std::erase_if(underway, [identity = identityOf(type, key)](const KeptKey &k) {
        return k.identity() == identity;
    });
}

} // namespace pelliko::ui
