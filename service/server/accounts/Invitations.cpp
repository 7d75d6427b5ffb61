#include "accounts/Invitations.h"

#include "accounts/AccountJson.h"
#include "accounts/E164.h"
#include "http/Errors.h"
#include "text/Secrets.h"

#include <vector>

namespace pelliko::server
{
namespace
{

constexpr std::size_t bodyLimit = 4096;
constexpr std::size_t keyLimit = 64;
using Outcome = RegisterResult;

void checkAttempts(const Request &request, Context &context)
{
    const std::string address = addressOf(request, context.proxies);
    if (const auto wait = context.registrations.attempt(address, context.now()))
        throw Refusal(Error::tooManyAttempts, {}, {{"Retry-After", std::to_string(*wait)}});
}

std::string keyHashOf(const Request &request)
{
    const std::string *key = request.header("Idempotency-Key");
    if (key == nullptr || key->empty() || key->size() > keyLimit)
        throw Refusal(Error::badRequest, "Idempotency-Key has to be 1 to 64 characters.");
    return sha256(*key);
}

Registration registrationOf(const Request &request, const std::string &text)
{
    const RegistrationBody body = parseRegistration(text);
    Registration registration;
    registration.number = body.number;
    registration.keyHash = keyHashOf(request);
    if (!isE164(registration.number))
        throw Refusal(Error::numberInvalid);
    if (!looksLikeToken(body.code))
        throw Refusal(Error::codeUnknown);
    registration.codeHash = sha256(body.code);
    return registration;
}

void checkOutcome(RegisterResult result)
{
    switch (result) {
    case Outcome::registered:
        return;
    case Outcome::codeUnknown:
        throw Refusal(Error::codeUnknown);
    case Outcome::codeExpired:
        throw Refusal(Error::codeExpired);
    case Outcome::codeUsedUp:
        throw Refusal(Error::codeUsedUp);
    case Outcome::codeForOther:
        throw Refusal(Error::codeForOther);
    case Outcome::numberTaken:
        throw Refusal(Error::numberTaken);
    }
}

/// The phone that had the account before is to hear of no push any more.
Task<void> endFormerStreams(Context &context, const std::string &tokenHash)
{
    const auto account =
        co_await context.pool.run([&] { return context.metadata.findAccount(tokenHash); });
    if (!account)
        co_return;
    const std::vector<std::int64_t> accounts{account->id};
    context.peers.announcePushes(accounts);
}

} // namespace

Task<void> registerAccount(Exchange &exchange, Context &context)
{
    // Before anything is looked at: no refusal tells a guesser anything for free.
    checkAttempts(exchange.request(), context);
    const std::string body = co_await readWholeBody(exchange, bodyLimit);
    Registration registration = registrationOf(exchange.request(), body);
    const std::string token = randomToken();
    registration.tokenHash = sha256(token);
    registration.now = context.now();
    const RegisterResult result =
        co_await context.pool.run([&] { return context.metadata.registerAccount(registration); });
    checkOutcome(result);
    co_await endFormerStreams(context, registration.tokenHash);
    co_await exchange.respond(
        jsonResponse(Status::created, registeredJson(registration.number, token)));
}

std::string makeInvitation(Metadata &metadata, const std::string &number, int uses, Seconds now,
                           Seconds expires)
{
    std::string code = randomToken();
    metadata.addInvitation({sha256(code), number, uses, now, expires});
    return code;
}

} // namespace pelliko::server
