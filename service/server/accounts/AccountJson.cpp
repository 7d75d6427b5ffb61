#include "accounts/AccountJson.h"

#include "accounts/E164.h"
#include "http/Errors.h"

#include <nlohmann/json.hpp>

#include <algorithm>

namespace pelliko::server
{
namespace
{

using nlohmann::json;

std::string textOf(const json &body, const char *member)
{
    const auto found = body.find(member);
    if (found == body.end() || !found->is_string())
        throw Refusal(Error::badRequest,
                      std::string("The member \"") + member + "\" is missing or malformed.");
    return found->get<std::string>();
}

/// Refused where it stands, never copied: a copy goes as deep as the body is nested.
void checkCount(const json &body, const Limits &limits)
{
    const auto list = body.find("numbers");
    if (list == body.end() || !list->is_array())
        throw Refusal(Error::badRequest, "The member \"numbers\" is missing or malformed.");
    if (list->empty() || list->size() > limits.numbersPerQuestion)
        throw Refusal(Error::badRequest, "A question names 1 to " +
                                             std::to_string(limits.numbersPerQuestion) +
                                             " numbers.");
}

} // namespace

RegistrationBody parseRegistration(std::string_view text)
{
    const json body = json::parse(text, nullptr, false);
    if (!body.is_object())
        throw Refusal(Error::badRequest, "The body is not a JSON object.");
    return {textOf(body, "number"), textOf(body, "code")};
}

std::vector<std::string> parseNumbers(std::string_view text, const Limits &limits)
{
    const json body = json::parse(text, nullptr, false);
    checkCount(body, limits);
    std::vector<std::string> numbers;
    for (const json &entry : body["numbers"]) {
        if (!entry.is_string() || !isE164(entry.get_ref<const std::string &>()))
            throw Refusal(Error::badRequest,
                          "A number has to be a plus and 7 to 15 digits, like +4915112345678.");
        numbers.push_back(entry.get<std::string>());
    }
    std::sort(numbers.begin(), numbers.end());
    numbers.erase(std::unique(numbers.begin(), numbers.end()), numbers.end());
    return numbers;
}

std::string registeredJson(const std::string &number, const std::string &token)
{
    return json{{"number", number}, {"token", token}}.dump();
}

std::string joinedJson(const std::vector<std::string> &numbers)
{
    return json{{"joined", numbers}}.dump();
}

} // namespace pelliko::server
