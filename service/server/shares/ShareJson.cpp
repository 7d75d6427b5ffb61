#include "shares/ShareJson.h"

#include "http/Errors.h"
#include "shares/FileNames.h"

#include <nlohmann/json.hpp>

namespace pelliko::server
{
namespace
{

using nlohmann::json;

const char *stateName(ShareState state)
{
    switch (state) {
    case ShareState::uploading:
        return "uploading";
    case ShareState::finished:
        return "finished";
    case ShareState::withdrawn:
        return "withdrawn";
    case ShareState::expired:
        break;
    }
    return "expired";
}

[[noreturn]] void refuse(const std::string &member)
{
    throw Refusal(Error::badRequest, "The member \"" + member + "\" is missing or malformed.");
}

std::string textOf(const json &object, const char *member, bool required)
{
    const auto found = object.find(member);
    if (found == object.end() || found->is_null()) {
        if (required)
            refuse(member);
        return {};
    }
    if (!found->is_string())
        refuse(member);
    return found->get<std::string>();
}

const json &listOf(const json &object, const char *member)
{
    const auto found = object.find(member);
    if (found == object.end() || !found->is_array())
        refuse(member);
    return *found;
}

NewFile fileOf(const json &entry)
{
    if (!entry.is_object())
        refuse("files");
    const auto size = entry.find("size");
    if (size == entry.end() || !size->is_number_unsigned())
        refuse("size");
    return {cleanFileName(textOf(entry, "name", true)), cleanType(textOf(entry, "type", false)),
            size->get<std::uint64_t>()};
}

Recipient recipientOf(const json &entry)
{
    if (!entry.is_object())
        refuse("recipients");
    return {textOf(entry, "number", true), textOf(entry, "ccc", false)};
}

json recordOf(const ShareRecord &share)
{
    json files = json::array();
    for (std::size_t index = 0; index < share.files.size(); ++index) {
        const FileRecord &file = share.files[index];
        files.push_back({{"index", index},
                         {"name", file.name},
                         {"size", file.size},
                         {"type", file.type},
                         {"offset", file.offset},
                         {"upload", uploadPath(file.upload)},
                         {"complete", file.complete()}});
        if (share.lost(file))
            files.back()["lost"] = true;
    }
    json record{{"share", share.key},
                {"state", stateName(share.state)},
                {"created", share.created},
                {"files", std::move(files)}};
    if (share.state != ShareState::finished)
        return record;
    json recipients = json::array();
    for (const Recipient &recipient : share.recipients)
        recipients.push_back({{"number", recipient.number}, {"ccc", recipient.callingCode}});
    record["expires"] = share.deadline;
    record["recipients"] = std::move(recipients);
    return record;
}

} // namespace

ShareRequest parseShareRequest(std::string_view text)
{
    const json body = json::parse(text, nullptr, false);
    if (!body.is_object())
        throw Refusal(Error::badRequest, "The body is not a JSON object.");
    ShareRequest request;
    if (std::string source = textOf(body, "reshare_of", false); !source.empty()) {
        request.reshareOf = std::move(source);
    } else {
        for (const json &entry : listOf(body, "files"))
            request.files.push_back(fileOf(entry));
    }
    for (const json &entry : listOf(body, "recipients"))
        request.recipients.push_back(recipientOf(entry));
    return request;
}

std::string uploadPath(const std::string &upload)
{
    return "/api/v1/uploads/" + upload;
}

std::string shareJson(const ShareRecord &share)
{
    return recordOf(share).dump();
}

std::string shareListJson(const std::vector<ShareRecord> &shares)
{
    json records = json::array();
    for (const ShareRecord &share : shares)
        records.push_back(recordOf(share));
    return json{{"shares", std::move(records)}}.dump();
}

std::string finishedJson(const FinishResult &result, const std::string &url)
{
    return json{{"url", url}, {"expires", result.share.deadline}, {"sms", result.sms}}.dump();
}

} // namespace pelliko::server
