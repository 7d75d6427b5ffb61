#include "ModemTransport.h"

#include <Modems.h>
#include <SmsText.h>

namespace pelliko::messaging
{

ModemTransport::ModemTransport(std::unique_ptr<SmsTransport> withoutModem)
    : withoutModem_(std::move(withoutModem))
{
}

std::string ModemTransport::send(const Sms &sms)
{
    // The bus ends the connection of a caller whose text is not UTF-8.
    const auto error = modem::sendThroughModem(sms.sim - 1, modem::wholeCharacters(sms.to),
                                               modem::wholeCharacters(sms.text));
    return error ? *error : withoutModem_->send(sms);
}

Fate ModemTransport::fateOf(const Sms &sms)
{
    const Fate fate = withoutModem_->fateOf(sms);
    return fate == Fate::NotTaken && modem::mayHaveModem() ? Fate::Unknown : fate;
}

} // namespace pelliko::messaging
