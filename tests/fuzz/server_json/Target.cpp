// What the server reads from clients: the first line names the call, the rest is its body.
#include "FileName.h"

#include "accounts/AccountJson.h"
#include "accounts/E164.h"
#include "http/Errors.h"
#include "pages/ByteRange.h"
#include "push/PushJson.h"
#include "shares/ShareJson.h"
#include "shares/ShareRules.h"
#include "tus/TusHeaders.h"

#include <glib.h>

using namespace pelliko::server;
using pelliko::fuzz::promise;

namespace
{

bool isText(const std::string &json)
{
    return g_utf8_validate_len(json.data(), json.size(), nullptr);
}

ShareRecord recordOf(const ShareRequest &request)
{
    ShareRecord record;
    record.key = request.reshareOf.value_or("share");
    record.state = ShareState::finished;
    for (const NewFile &file : request.files)
        record.files.push_back({file.name, file.type, file.size, 0, "upload", "blob"});
    record.recipients = request.recipients;
    return record;
}

void tryShare(std::string_view body)
{
    const Limits limits;
    const ShareRequest request = parseShareRequest(body);
    promise(!request.reshareOf || request.files.empty(), "a share sent again brings no files");
    for (const NewFile &file : request.files)
        pelliko::fuzz::promiseFileName(file.name);
    const std::string json = shareJson(recordOf(request));
    promise(isText(json), "what is told of a share is text");
    if (!request.reshareOf)
        checkFiles(request.files, limits);
    checkRecipients(request.recipients, limits);
    std::uint64_t bytes = 0;
    for (const NewFile &file : request.files) {
        bytes += file.size;
        promise(file.size <= limits.shareBytes && bytes <= limits.shareBytes,
                "no share is larger than the limit");
    }
    promise(request.files.size() <= limits.filesPerShare, "no share has more files");
    promise(!request.recipients.empty() && request.recipients.size() <= limits.recipientsPerShare,
            "a share has recipients, and not too many");
    for (const Recipient &recipient : request.recipients)
        promise(isPhoneNumber(recipient.number), "recipients are phone numbers");
}

void tryNumbers(std::string_view body)
{
    const Limits limits;
    const std::vector<std::string> numbers = parseNumbers(body, limits);
    promise(!numbers.empty() && numbers.size() <= limits.numbersPerQuestion,
            "a question names 1 to 100 numbers");
    for (std::size_t i = 0; i < numbers.size(); ++i) {
        promise(isE164(numbers[i]), "numbers have the one form");
        promise(i == 0 || numbers[i - 1] < numbers[i], "a question names each number once");
    }
    promise(isText(joinedJson(numbers)), "the answer is text");
}

void tryRegistration(std::string_view body)
{
    const RegistrationBody registration = parseRegistration(body);
    promise(isText(registeredJson(registration.number, registration.code)), "the answer is text");
}

void tryPushes(std::string_view body)
{
    const std::int64_t upTo = parseAcknowledged(body);
    promise(upTo >= 0, "an id is never negative");
    promise(parsePushId(std::to_string(upTo)) == upTo, "an id that is written is read again");
}

void tryRange(std::string_view header)
{
    constexpr std::uint64_t sizes[] = {0, 1, 1000, std::uint64_t{1} << 30};
    for (const std::uint64_t size : sizes) {
        const ByteRange range = parseRange(header, size);
        if (range.kind != ByteRange::Kind::part)
            continue;
        promise(range.length > 0 && range.length <= size, "a part has bytes of the file");
        promise(range.offset <= size - range.length, "a part lies inside the file");
    }
}

void tryNumber(std::string_view text)
{
    const auto number = parseNumber(text);
    if (!number)
        return;
    const auto digits = text.substr(std::min(text.find_first_not_of('0'), text.size() - 1));
    promise(std::to_string(*number) == digits, "a number is what its digits say");
}

void tryBody(std::string_view call, std::string_view body)
{
    if (call == "share")
        tryShare(body);
    else if (call == "joined")
        tryNumbers(body);
    else if (call == "account")
        tryRegistration(body);
    else if (call == "ack")
        tryPushes(body);
    else if (call == "range")
        tryRange(body);
    else if (call == "number")
        tryNumber(body);
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t *data, size_t size)
{
    std::string_view body = pelliko::fuzz::textOf(data, size);
    const std::string_view call = pelliko::fuzz::takeLine(body);
    try {
        tryBody(call, body);
    } catch (const Refusal &refusal) {
        promise(refusal.entry().status >= 400 && refusal.entry().status < 500,
                "what a client sends is the client's fault");
    }
    return 0;
}
