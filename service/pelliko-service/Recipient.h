// One recipient of a share: as the client named it, and as the server is told
#pragma once

#include <cstdint>
#include <set>
#include <string>
#include <vector>

namespace pelliko::service
{

/** Whether somebody has an account at the server. */
enum class Joined { unknown, no, yes };

/** One recipient of a share. The first three are kept as the client gave them. */
struct Recipient {
    std::string ccc; ///< the sender's country calling code, empty when it is not known
    std::string number;
    int32_t numberId = 0;
    std::string e164{}; ///< the number's one form; empty before it was looked for, and with a fault
    std::string fault{}; ///< why there is none (a name of PhoneNumbers.h), empty when there is
    Joined joined = Joined::unknown;
};

/**
 * Finds the one form of every number that was not looked for yet.
 * @param ownNumber the sender's own number, which may give the country
 * @return whether anything was found out
 */
bool findForms(std::vector<Recipient> &recipients, const std::string &ownNumber);

/** Those whom a message can reach, each once however often the list names them, in its order. */
std::vector<Recipient> people(const std::vector<Recipient> &recipients);

/** The E.164 numbers of which it is not known whether they have joined, each once. */
std::vector<std::string> askable(const std::vector<Recipient> &recipients);

/** Notes what the server said of those numbers; of others nothing changes. */
void noteJoined(std::vector<Recipient> &recipients, const std::set<std::string> &asked,
                const std::set<std::string> &joined);

} // namespace pelliko::service
