// The user's account at a share server and the file that keeps it.
#pragma once

#include <functional>
#include <string>

namespace pelliko::korrin
{

/// The user's account at a share server.
struct Account {
    std::string server; ///< base address without a slash at its end
    std::string number; ///< the user's own phone number
    std::string token;  ///< secret
    std::string imsi{}; ///< of the SIM that it belongs to
};

/// What is found where an account is kept.
struct AccountFinding {
    enum class Kind {
        account,
        none,  ///< there is no file
        broken ///< there is one that cannot be used
    };
    Kind kind = Kind::none;
    Account account;    ///< with Kind::account
    std::string reason; ///< why there is no account, as one sentence that does not tell the token
};

/// "$XDG_CONFIG_HOME/pelliko/account.json" (~/.config when the variable is not set).
std::string defaultAccountFile();

/// Reads the account. Any thread.
AccountFinding findAccount(const std::string &file);

/// Writes the account for the user alone (mode 0600), at once or not at all, and onto the disk.
/// Waits for another writer. Any thread.
/// @return empty, or what went wrong as one sentence
std::string writeAccount(const std::string &file, const Account &account);

/// Changes the account that is there: `change` gets it under the lock that keeps other writers
/// away, and says whether it changed anything. Any thread.
/// @return what was found before, or Kind::broken with a reason when it could not be written
AccountFinding changeAccount(const std::string &file,
                             const std::function<bool(Account &account)> &change);

/// Forgets the account; the disk has forgotten it on return. There being none is no failure.
/// @return empty, or what went wrong as one sentence
std::string removeAccount(const std::string &file);

/// Why the parts cannot be an account, as one sentence; empty when they can. An empty IMSI is one
/// that is not known.
std::string accountFault(const Account &account);

/// Whether a text is an IMSI: 6 to 15 digits, the country's three and the network's two at least.
bool isImsi(const std::string &text);

/// An address as accounts keep it: without spaces around and slashes at its end.
std::string plainServer(const std::string &address);

} // namespace pelliko::korrin
