#include "ModemTransport.h"

#include <Modems.h>
#include <glib.h>

namespace pelliko::messaging
{

namespace
{

// The bus ends the connection of a caller whose text is not UTF-8; a text may have been cut inside
// a character.
std::string readable(const std::string &text)
{
    gchar *valid = g_utf8_make_valid(text.data(), static_cast<gssize>(text.size()));
    std::string result = valid;
    g_free(valid);
    return result;
}

} // namespace

ModemTransport::ModemTransport(std::unique_ptr<SmsTransport> withoutModem)
    : withoutModem_(std::move(withoutModem))
{
}

std::string ModemTransport::send(const Sms &sms)
{
    const auto error = modem::sendThroughModem(sms.sim - 1, readable(sms.to), readable(sms.text));
    return error ? *error : withoutModem_->send(sms);
}

} // namespace pelliko::messaging
