#include "accounts/Joined.h"

#include "accounts/AccountJson.h"
#include "accounts/Accounts.h"
#include "http/Errors.h"

#include <string>
#include <utility>
#include <vector>

namespace pelliko::server
{
namespace
{

/// A hundred numbers need a few thousand bytes.
constexpr std::size_t bodyLimit = 64 * 1024;

JoinedQuestion questionOf(std::vector<std::string> numbers, const Account &account,
                          const Context &context)
{
    JoinedQuestion question;
    question.account = account.id;
    question.numbers = std::move(numbers);
    question.now = context.now();
    question.dailyLimit = context.limits.dailyNumbers;
    question.limitWindow = context.limits.dailyWindow;
    return question;
}

Response responseOf(const JoinedAnswer &answer)
{
    if (!answer.allowed)
        throw Refusal(Error::numbersLimit, {},
                      {{"Retry-After", std::to_string(answer.retryAfter)}});
    return jsonResponse(Status::ok, joinedJson(answer.joined));
}

} // namespace

Task<void> showJoined(Exchange &exchange, Context &context)
{
    const Account account = co_await authenticate(exchange, context);
    const std::string body = co_await readWholeBody(exchange, bodyLimit);
    const JoinedQuestion question =
        questionOf(parseNumbers(body, context.limits), account, context);
    const JoinedAnswer answer =
        co_await context.pool.run([&] { return context.metadata.askJoined(question); });
    co_await exchange.respond(responseOf(answer));
}

} // namespace pelliko::server
