// Registers the user with a share server.
#pragma once

#include <cstdint>
#include <functional>
#include <memory>
#include <string>

namespace pelliko::korrin
{

/// What the user typed.
struct RegistrationWish {
    std::string server; ///< as plainServer and withScheme leave it
    std::string number; ///< in international form
    std::string code;   ///< invitation code
};

/// What became of it.
struct RegistrationResult {
    /// Empty after a success, else why not: one of the server's names ("code_unknown",
    /// "code_used_up", "code_expired", "code_for_other_number", "number_taken", "number_invalid",
    /// "too_many_attempts", …) or "unreachable", "timeout", "certificate", "unexpected_answer".
    std::string failure;
    std::string token;             ///< after a success
    int64_t retryAfterSeconds = 0; ///< with "too_many_attempts"
};

/// One registration at a time. The network is waited for on a thread of its own; the rest belongs
/// to the thread of GLib's default main context. The server is told which attempt it is, the same
/// for the same phone, number and code: whoever tries again after a lost answer, a cancel or a
/// crash gets the account that the first attempt made.
class Registration
{
public:
    using Done = std::function<void(const RegistrationResult &)>;

    Registration() = default;
    /// Cancels.
    ~Registration();
    Registration(const Registration &) = delete;
    Registration &operator=(const Registration &) = delete;

    /// `done` is called once from the main loop, unless cancel() comes before. Cancels an attempt
    /// that is running.
    void start(const RegistrationWish &wish, Done done);
    /// Nothing will be told; returns at once.
    void cancel();
    bool running() const { return attempt_ != nullptr; }

private:
    struct Attempt;
    static int finish(void *attempt);
    std::shared_ptr<Attempt> attempt_;
};

/// The address with https:// before it when it has no scheme.
std::string withScheme(const std::string &address);

/// Whether a token may travel to this address: https, or this machine itself.
bool isSafeAddress(const std::string &address);

} // namespace pelliko::korrin
