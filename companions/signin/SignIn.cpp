#include "SignIn.h"

#include <dlog.h>
#include <kor_sim.h>

#include <algorithm>
#include <cstdlib>
#include <utility>

namespace pelliko::signin
{
namespace
{

constexpr const char *logTag = "KORRIN";

std::string withoutSpaces(std::string text)
{
    std::erase_if(text, [](unsigned char c) { return c <= ' '; });
    return text;
}

std::string faultOf(const Typed &typed, const korrin::RegistrationWish &wish)
{
    if (wish.server.empty())
        return "server_missing";
    if (wish.server.rfind("http://", 0) == 0 && !korrin::isSafeAddress(wish.server))
        return "insecure";
    if (!korrin::isSafeAddress(wish.server))
        return "server_invalid";
    if (typed.number.empty() || wish.number.empty())
        return "number_invalid";
    if (wish.code.empty())
        return "code_missing";
    return {};
}

} // namespace

SignIn::SignIn(std::string accountFile, Done done, Failed failed)
    : accountFile_(std::move(accountFile)), done_(std::move(done)), failed_(std::move(failed))
{
}

Typed SignIn::proposal() const
{
    Typed proposal;
    proposal.server = korrin::findAccount(accountFile_).account.server;
    const char *server = std::getenv("PELLIKO_SERVER_URL");
    if (proposal.server.empty() && server)
        proposal.server = server;
    if (const std::string code = korrin::callingCodeOf(korrin::machineImsi()); !code.empty())
        proposal.number = "+" + code + " ";
    return proposal;
}

void SignIn::start(const Typed &typed)
{
    const std::string code = korrin::callingCodeOf(korrin::machineImsi());
    const korrin::RegistrationWish wish{korrin::plainServer(korrin::withScheme(typed.server)),
                                        korrin::internationalNumber(typed.number, code),
                                        withoutSpaces(typed.code)};
    if (const std::string fault = faultOf(typed, wish); !fault.empty()) {
        failed_({fault, 0});
        return;
    }
    registration_.start(wish, [this, wish](const korrin::RegistrationResult &result) {
        if (result.failure.empty())
            store(wish, result.token);
        else
            failed_({result.failure, result.retryAfterSeconds});
    });
}

void SignIn::store(const korrin::RegistrationWish &wish, const std::string &token)
{
    korrin::Account account{wish.server, wish.number, token, korrin::machineImsi()};
    if (account.imsi.empty())
        account.imsi = korrin::composedImsi(account.number);
    const std::string fault = korrin::writeAccount(accountFile_, account);
    if (fault.empty()) {
        done_(account);
        return;
    }
    dlog_print(DLOG_ERROR, logTag, "%s", fault.c_str());
    failed_({"cannot_store", 0});
}

} // namespace pelliko::signin
