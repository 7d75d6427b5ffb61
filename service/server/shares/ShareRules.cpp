#include "shares/ShareRules.h"

#include "http/Errors.h"

#include <algorithm>

namespace pelliko::server
{

void checkFiles(const std::vector<NewFile> &files, const Limits &limits)
{
    if (files.empty())
        throw Refusal(Error::badRequest, "A share needs at least one file.");
    if (files.size() > limits.filesPerShare)
        throw Refusal(Error::tooManyFiles,
                      "A share holds at most " + std::to_string(limits.filesPerShare) + " files.");
    // Compared by what is left: a sum of announced sizes could wrap.
    std::uint64_t left = limits.shareBytes;
    for (const NewFile &file : files) {
        if (file.size > left)
            throw Refusal(Error::shareTooLarge,
                          "A share holds at most " + std::to_string(limits.shareBytes) + " bytes.");
        left -= file.size;
    }
}

void checkRecipients(const std::vector<Recipient> &recipients, const Limits &limits)
{
    if (recipients.empty() || recipients.size() > limits.recipientsPerShare)
        throw Refusal(Error::badRequest, "A share needs 1 to " +
                                             std::to_string(limits.recipientsPerShare) +
                                             " recipients.");
    for (const Recipient &recipient : recipients) {
        if (!isPhoneNumber(recipient.number))
            throw Refusal(Error::badRequest, "A recipient's number is not a phone number.");
        if (!recipient.callingCode.empty() && !isPhoneNumber(recipient.callingCode))
            throw Refusal(Error::badRequest, "A calling code has to be digits.");
    }
}

void checkIdempotencyKey(std::string_view key)
{
    const bool visible =
        std::all_of(key.begin(), key.end(), [](char c) { return c > 0x20 && c < 0x7f; });
    if (key.empty() || key.size() > 64 || !visible)
        throw Refusal(Error::badRequest, "Idempotency-Key has to be 1 to 64 visible characters.");
}

bool isPhoneNumber(std::string_view number)
{
    const auto isDigit = [](char c) { return c >= '0' && c <= '9'; };
    return number.size() <= 40 && std::any_of(number.begin(), number.end(), isDigit) &&
           std::all_of(number.begin(), number.end(), [&](char c) {
               return isDigit(c) ||
                      std::string_view("+-() ./*#,;").find(c) != std::string_view::npos;
           });
}

void checkCreated(const CreateResult &result)
{
    switch (result.outcome) {
    case CreateResult::Outcome::created:
    case CreateResult::Outcome::known:
        return;
    case CreateResult::Outcome::overDailyLimit:
        throw Refusal(Error::dailyLimit, {}, {{"Retry-After", std::to_string(result.retryAfter)}});
    case CreateResult::Outcome::sourceMissing:
        throw Refusal(Error::notFound, "There is no such share to send again.");
    case CreateResult::Outcome::sourceUnfinished:
        throw Refusal(Error::conflict, "Only a finished share can be sent again.");
    case CreateResult::Outcome::sourceGone:
        throw Refusal(Error::gone);
    }
}

void checkLive(ShareState state)
{
    if (state == ShareState::expired)
        throw Refusal(Error::expired);
    if (state == ShareState::withdrawn)
        throw Refusal(Error::withdrawn);
}

} // namespace pelliko::server
