#include "accounts/Accounts.h"

#include "http/Errors.h"
#include "text/Secrets.h"

#include <nlohmann/json.hpp>

namespace pelliko::server
{
namespace
{

[[noreturn]] void refuse()
{
    throw Refusal(Error::unauthorized, {}, {{"WWW-Authenticate", "Bearer"}});
}

std::string tokenOf(const Request &request)
{
    constexpr std::string_view scheme = "Bearer ";
    const std::string *value = request.header("Authorization");
    if (value == nullptr || value->size() <= scheme.size() ||
        !equalsIgnoringCase(std::string_view(*value).substr(0, scheme.size()), scheme))
        refuse();
    std::string token = value->substr(scheme.size());
    if (!looksLikeToken(token))
        refuse();
    return token;
}

} // namespace

std::string tokenHashOf(const Request &request)
{
    return sha256(tokenOf(request));
}

Account needAccount(Metadata &metadata, const std::string &tokenHash)
{
    std::optional<Account> account = metadata.findAccount(tokenHash);
    if (!account)
        refuse();
    return std::move(*account);
}

Task<Account> authenticate(Exchange &exchange, Context &context)
{
    const std::string hash = tokenHashOf(exchange.request());
    co_return co_await context.pool.run([&] { return needAccount(context.metadata, hash); });
}

Task<void> showAccount(Exchange &exchange, Context &context)
{
    const Account account = co_await authenticate(exchange, context);
    const Seconds since = context.now() - context.limits.dailyWindow;
    const std::uint64_t used =
        co_await context.pool.run([&] { return context.metadata.usedBytes(account.id, since); });
    const nlohmann::json body{{"number", account.number},
                              {"used_bytes", used},
                              {"daily_limit_bytes", context.limits.dailyBytes}};
    co_await exchange.respond(jsonResponse(Status::ok, body.dump()));
}

std::optional<std::string> makeAccount(Metadata &metadata, const std::string &number,
                                       const std::string &name, Seconds now)
{
    std::string token = randomToken();
    if (!metadata.addAccount(number, name, sha256(token), now))
        return std::nullopt;
    return token;
}

} // namespace pelliko::server
