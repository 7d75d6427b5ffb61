#include "ShareApi.h"

#include "JsonNumber.h"

#include <glib.h>

#include <algorithm>

namespace pelliko::service::ShareApi
{
namespace
{
using Json = nlohmann::json;

HttpRequest request(const Account &account, const char *method, const std::string &path)
{
    HttpRequest result;
    result.method = method;
    result.url = account.server + path;
    result.headers = {"Authorization: Bearer " + account.token, "Accept: application/json"};
    return result;
}

HttpRequest post(const Account &account, const std::string &path, const Json &body)
{
    HttpRequest result = request(account, "POST", path);
    result.headers.push_back("Content-Type: application/json");
    // File names may be any bytes; what is no UTF-8 is shown by replacement characters.
    result.body = body.dump(-1, ' ', false, Json::error_handler_t::replace);
    return result;
}

HttpRequest postShare(const Account &account, const std::string &key, const Json &body)
{
    HttpRequest result = post(account, "/api/v1/shares", body);
    result.headers.push_back("Idempotency-Key: " + key);
    return result;
}

Json recipientsJson(const std::vector<Recipient> &recipients)
{
    Json list = Json::array();
    for (const Recipient &recipient : people(recipients)) {
        list.push_back({{"number", recipient.e164}, {"ccc", recipient.ccc}});
    }
    return list;
}

std::string sharePath(const std::string &share)
{
    g_autofree char *escaped = g_uri_escape_string(share.c_str(), nullptr, false);
    return std::string("/api/v1/shares/") + escaped;
}

/** Whether a text can be a part of an address, or of a message, as it is. */
bool isOneWord(const std::string &text)
{
    return !text.empty() && std::all_of(text.begin(), text.end(), [](char letter) {
        return letter > ' ' && letter < '\x7f';
    });
}

ShareRecord::File readFile(const Json &json)
{
    ShareRecord::File file;
    file.upload = json.at("upload").get<std::string>();
    file.offset = wholeNumber(json, "offset");
    // Only an address of the same server may ever see the token.
    if (!isOneWord(file.upload) || file.upload.front() != '/') {
        throw std::invalid_argument("upload");
    }
    return file;
}
} // namespace

HttpRequest createShare(const Account &account, const std::string &key,
                        const std::vector<AnnouncedFile> &files,
                        const std::vector<Recipient> &recipients)
{
    Json list = Json::array();
    for (const AnnouncedFile &file : files) {
        g_autofree char *name = g_path_get_basename(file.path.c_str());
        list.push_back({{"name", std::string(name)}, {"size", file.size}});
    }
    return postShare(account, key, {{"files", list}, {"recipients", recipientsJson(recipients)}});
}

HttpRequest createReshare(const Account &account, const std::string &key,
                          const std::string &earlierShare, const std::vector<Recipient> &recipients)
{
    return postShare(account, key,
                     {{"reshare_of", earlierShare}, {"recipients", recipientsJson(recipients)}});
}

HttpRequest getShare(const Account &account, const std::string &share)
{
    return request(account, "GET", sharePath(share));
}

HttpRequest finishShare(const Account &account, const std::string &share)
{
    return request(account, "POST", sharePath(share) + "/finish");
}

HttpRequest withdrawShare(const Account &account, const std::string &share)
{
    return request(account, "DELETE", sharePath(share));
}

HttpRequest askJoined(const Account &account, const std::vector<std::string> &numbers)
{
    return post(account, "/api/v1/joined", {{"numbers", numbers}});
}

const Failure &failureOf(const HttpAnswer &answer)
{
    if (!answer.failure.empty()) {
        return failureNamed(answer.failure);
    }
    const Json body = Json::parse(answer.body, nullptr, false);
    if (answer.status >= 400 && body.is_object() && body.contains("error") &&
        body["error"].is_string()) {
        const auto name = body["error"].get<std::string>();
        if (isFailureName(name)) {
            return failureNamed(name);
        }
    }
    return failureOfStatus(answer.status);
}

std::optional<ShareRecord> readShare(const HttpAnswer &answer)
{
    try {
        const Json json = Json::parse(answer.body);
        ShareRecord record;
        record.share = json.at("share").get<std::string>();
        for (const Json &file : json.at("files")) {
            record.files.push_back(readFile(file));
        }
        return record.share.empty() ? std::nullopt : std::optional(record);
    } catch (const std::exception &) {
        return std::nullopt;
    }
}

std::optional<FinishedShare> readFinished(const HttpAnswer &answer)
{
    try {
        const Json json = Json::parse(answer.body);
        FinishedShare share{json.at("url").get<std::string>(), wholeNumber(json, "expires"),
                            json.at("sms").get<std::vector<std::string>>()};
        // It goes into the messages as it is.
        return isOneWord(share.url) ? std::optional(share) : std::nullopt;
    } catch (const std::exception &) {
        return std::nullopt;
    }
}

std::optional<std::vector<std::string>> readJoined(const HttpAnswer &answer)
{
    if (!answer.failure.empty() || answer.status != 200) {
        return std::nullopt;
    }
    try {
        return Json::parse(answer.body).at("joined").get<std::vector<std::string>>();
    } catch (const std::exception &) {
        return std::nullopt;
    }
}

} // namespace pelliko::service::ShareApi
