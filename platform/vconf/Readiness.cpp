#include "Readiness.h"

#include "KeyFiles.h"
#include "vconf-keys.h"

#include <ModemWatch.h>
#include <Modems.h>

namespace pelliko::vconf
{

namespace
{

// What the modems said last, by whichever process asked. It tells a change of the modems, which
// sets the key, from a value that somebody set by hand, which stays until the next such change.
constexpr const char *kPublished = "memory/telephony/modem_ready";

void publish(const modem::ModemList &list)
{
    const Value ready = modem::anySimReady(list);
    const std::optional<Value> published = readKey(kPublished);
    const bool known = readKey(VCONFKEY_TELEPHONY_READY).has_value();
    const bool changed = published && *published != ready;
    // The key goes first: a process that ends in between leaves a change that is published again.
    if ((changed || !known) && !writeKey(VCONFKEY_TELEPHONY_READY, ready))
        return;
    if (changed || !published)
        static_cast<void>(writeKey(kPublished, ready));
}

} // namespace

bool followsModems(const std::string &key)
{
    return key == VCONFKEY_TELEPHONY_READY;
}

void refreshReadiness()
{
    publish(modem::currentModems());
}

void followReadiness()
{
    // Never destroyed, like the watch of the key files that tells of its sets.
    static auto *watch = new modem::ModemWatch(publish);
    static_cast<void>(watch);
}

} // namespace pelliko::vconf
