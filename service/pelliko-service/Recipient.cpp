#include "Recipient.h"

#include <PhoneNumbers.h>

#include <utility>

namespace pelliko::service
{

bool findForms(std::vector<Recipient> &recipients, const std::string &ownNumber)
{
    bool changed = false;
    for (Recipient &recipient : recipients) {
        if (recipient.e164.empty() && recipient.fault.empty()) {
            numbers::NumberForm form = numbers::formOf(recipient.number, recipient.ccc, ownNumber);
            recipient.e164 = std::move(form.e164);
            recipient.fault = std::move(form.fault);
            changed = true;
        }
    }
    return changed;
}

std::vector<Recipient> people(const std::vector<Recipient> &recipients)
{
    std::vector<Recipient> result;
    std::set<std::string> seen;
    for (const Recipient &recipient : recipients) {
        if (!recipient.e164.empty() && seen.insert(recipient.e164).second) {
            result.push_back(recipient);
        }
    }
    return result;
}

std::vector<std::string> askable(const std::vector<Recipient> &recipients)
{
    std::vector<std::string> result;
    for (const Recipient &recipient : people(recipients)) {
        if (recipient.joined == Joined::unknown) {
            result.push_back(recipient.e164);
        }
    }
    return result;
}

void noteJoined(std::vector<Recipient> &recipients, const std::set<std::string> &asked,
                const std::set<std::string> &joined)
{
    for (Recipient &recipient : recipients) {
        if (asked.count(recipient.e164) != 0) {
            recipient.joined = joined.count(recipient.e164) != 0 ? Joined::yes : Joined::no;
        }
    }
}

} // namespace pelliko::service
