#include "ReceivedApi.h"

#include "JsonNumber.h"

#include <algorithm>

namespace pelliko::service
{
namespace
{
using Json = nlohmann::json;

constexpr size_t longestToken = 24;

HttpRequest request(const Account &account, const char *method, const std::string &path)
{
    HttpRequest result;
    result.method = method;
    result.url = account.server + path;
    result.headers = {"Authorization: Bearer " + account.token};
    return result;
}

std::string sharePath(const std::string &token)
{
    return "/api/v1/received/" + token;
}

ReceivedState stateNamed(const std::string &name)
{
    if (name == "expired") {
        return ReceivedState::expired;
    }
    return name == "withdrawn" ? ReceivedState::withdrawn : ReceivedState::available;
}

ReceivedFile readFile(const Json &json)
{
    ReceivedFile file;
    file.name = json.at("name").get<std::string>();
    file.size = wholeNumber(json, "size");
    file.type = json.value("type", "");
    return file;
}
} // namespace

bool isContentToken(const std::string &text)
{
    const auto allowed = [](unsigned char letter) {
        return std::isalnum(letter) != 0 || letter == '-' || letter == '_';
    };
    return !text.empty() && text.size() <= longestToken &&
           std::all_of(text.begin(), text.end(), allowed);
}

namespace ReceivedApi
{

HttpRequest pushStream(const Account &account, int64_t lastId)
{
    HttpRequest result = request(account, "GET", "/api/v1/push");
    result.headers.emplace_back("Accept: text/event-stream");
    if (lastId > 0) {
        result.headers.push_back("Last-Event-ID: " + std::to_string(lastId));
    }
    result.mark = {"content-type", "text/event-stream"};
    result.endless = true;
    return result;
}

HttpRequest acknowledge(const Account &account, int64_t upTo)
{
    HttpRequest result = request(account, "POST", "/api/v1/push/ack");
    result.headers.emplace_back("Content-Type: application/json");
    result.body = Json{{"up_to", upTo}}.dump();
    return result;
}

HttpRequest getShare(const Account &account, const std::string &token)
{
    return request(account, "GET", sharePath(token));
}

HttpRequest forgetShare(const Account &account, const std::string &token)
{
    return request(account, "DELETE", sharePath(token));
}

HttpRequest getFile(const Account &account, const std::string &token, int index, int64_t from)
{
    HttpRequest result =
        request(account, "GET", sharePath(token) + "/files/" + std::to_string(index));
    // A login page may have any length, the file's too.
    result.mark = {"content-disposition", "attachment"};
    if (from > 0) {
        result.headers.push_back("Range: bytes=" + std::to_string(from) + "-");
    }
    return result;
}

std::string readPush(const std::string &data)
{
    const Json json = Json::parse(data, nullptr, false);
    if (!json.is_object() || !json.contains("content_token") ||
        !json["content_token"].is_string()) {
        return {};
    }
    auto token = json["content_token"].get<std::string>();
    return isContentToken(token) ? token : std::string();
}

std::optional<ReceivedDetails> readShare(const HttpAnswer &answer)
{
    if (!answer.failure.empty() || answer.status != 200) {
        return std::nullopt;
    }
    try {
        const Json json = Json::parse(answer.body);
        ReceivedDetails details;
        details.sender = json.at("sender").get<std::string>();
        details.created = wholeNumber(json, "created");
        details.expires = wholeNumber(json, "expires");
        details.state = stateNamed(json.at("state").get<std::string>());
        for (const Json &file : json.at("files")) {
            details.files.push_back(readFile(file));
        }
        return details;
    } catch (const std::exception &) {
        return std::nullopt;
    }
}

} // namespace ReceivedApi

} // namespace pelliko::service
