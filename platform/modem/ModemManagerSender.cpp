#include "ModemManagerSender.h"

#include "ModemManagerSession.h"
#include "ModemManagerSim.h"
#include "SmsText.h"

namespace pelliko::modem
{
namespace
{

std::string whyUnusable(SimState sim)
{
    switch (sim) {
    case SimState::Ready:
        return {};
    case SimState::Missing:
        return "there is no SIM in the modem";
    case SimState::Locked:
        return "the SIM is locked";
    case SimState::Unknown:
        break;
    }
    return "the modem is not ready";
}

MMSms *create(MMModemMessaging *messaging, const std::string &to, const std::string &text,
              GCancellable *cancellable, GError **error)
{
    g_autoptr(MMSmsProperties) properties = mm_sms_properties_new();
    mm_sms_properties_set_number(properties, to.c_str());
    mm_sms_properties_set_text(properties, wholeCharacters(text).c_str());
    return mm_modem_messaging_create_sync(messaging, properties, cancellable, error);
}

// A store full of old messages would refuse the next one. The message's own fate is decided by
// then: whether it could be deleted has no part in that.
void forget(MMModemMessaging *messaging, MMSms *sms, GCancellable *cancellable)
{
    mm_modem_messaging_delete_sync(messaging, mm_sms_get_path(sms), cancellable, nullptr);
}

} // namespace

std::string sendThrough(MMObject *modem, const std::string &to, const std::string &text,
                        GCancellable *cancellable)
{
    if (std::string reason = whyUnusable(simAccess(mm_object_peek_modem(modem))); !reason.empty())
        return reason;
    MMModemMessaging *messaging = mm_object_peek_modem_messaging(modem);
    if (!messaging)
        return "the modem cannot send messages";
    if (to.empty() || !g_utf8_validate_len(to.c_str(), to.size(), nullptr))
        return "the number cannot be a phone number";

    g_autoptr(GError) error = nullptr;
    g_autoptr(MMSms) sms = create(messaging, to, text, cancellable, &error);
    if (!sms)
        return sentence("make the message", error);
    // The bus's own limit is shorter than a slow network takes; the cancellable holds the real one.
    g_dbus_proxy_set_default_timeout(G_DBUS_PROXY(sms), G_MAXINT);
    const bool sent = mm_sms_send_sync(sms, cancellable, &error);
    std::string result = sent ? std::string() : sentence("send the message", error);
    if (!g_cancellable_is_cancelled(cancellable))
        forget(messaging, sms, cancellable);
    return result;
}

} // namespace pelliko::modem
