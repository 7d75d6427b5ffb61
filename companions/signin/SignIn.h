// What happens between the typed form and the stored account.
#pragma once

#include <kor_account.h>
#include <kor_registration.h>

#include <functional>
#include <string>

namespace pelliko::signin
{

/// The fields as the user typed them.
struct Typed {
    std::string server;
    std::string number;
    std::string code;
};

/// Why a sign-in did not work.
struct Failure {
    std::string name;
    long long retryAfterSeconds = 0;
};

/// Checks what was typed, registers, stores the account. The account that is there stays until the
/// new one is on the disk. Main loop only.
class SignIn
{
public:
    using Done = std::function<void(const korrin::Account &)>;
    using Failed = std::function<void(const Failure &)>;

    SignIn(std::string accountFile, Done done, Failed failed);

    /// What to offer in the form: the former account's server or the environment's, the country
    /// code of the SIM.
    Typed proposal() const;

    /// Exactly one of the two is called later; the failure of a check at once.
    void start(const Typed &typed);
    /// Neither is called any more and nothing is stored.
    void cancel() { registration_.cancel(); }
    bool running() const { return registration_.running(); }

private:
    void store(const korrin::RegistrationWish &wish, const std::string &token);

    std::string accountFile_;
    Done done_;
    Failed failed_;
    korrin::Registration registration_;
};

} // namespace pelliko::signin
