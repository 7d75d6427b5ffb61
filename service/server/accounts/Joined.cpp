#include "accounts/Joined.h"

#include "accounts/Accounts.h"
#include "accounts/E164.h"
#include "http/Errors.h"

#include <nlohmann/json.hpp>

#include <algorithm>
#include <string>
#include <utility>
#include <vector>

namespace pelliko::server
{
namespace
{

using nlohmann::json;

/// A hundred numbers need a few thousand bytes.
constexpr std::size_t bodyLimit = 64 * 1024;

std::vector<std::string> parseNumbers(const std::string &text, const Limits &limits)
{
    const json body = json::parse(text, nullptr, false);
    const json list = body.is_object() ? body.value("numbers", json()) : json();
    if (!list.is_array())
        throw Refusal(Error::badRequest, "The member \"numbers\" is missing or malformed.");
    if (list.empty() || list.size() > limits.numbersPerQuestion)
        throw Refusal(Error::badRequest, "A question names 1 to " +
                                             std::to_string(limits.numbersPerQuestion) +
                                             " numbers.");
    std::vector<std::string> numbers;
    for (const json &entry : list) {
        if (!entry.is_string() || !isE164(entry.get_ref<const std::string &>()))
            throw Refusal(Error::badRequest,
                          "A number has to be a plus and 7 to 15 digits, like +4915112345678.");
        numbers.push_back(entry.get<std::string>());
    }
    std::sort(numbers.begin(), numbers.end());
    numbers.erase(std::unique(numbers.begin(), numbers.end()), numbers.end());
    return numbers;
}

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
    return jsonResponse(Status::ok, json{{"joined", answer.joined}}.dump());
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
