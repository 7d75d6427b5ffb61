#include "CurlPost.h"

#include <curl/curl.h>

#include <algorithm>
#include <cstdlib>
#include <memory>

namespace pelliko::korrin
{
namespace
{

constexpr long connectSeconds = 20;
constexpr long totalSeconds = 60;
constexpr size_t longestAnswer = 64UL * 1024;

struct Lists {
    curl_slist *headers = nullptr;
    ~Lists() { curl_slist_free_all(headers); }
};

std::string failureName(CURLcode result)
{
    switch (result) {
    case CURLE_OK:
        return {};
    case CURLE_OPERATION_TIMEDOUT:
        return "timeout";
    case CURLE_PEER_FAILED_VERIFICATION:
    case CURLE_SSL_ISSUER_ERROR:
    case CURLE_SSL_CACERT_BADFILE:
    case CURLE_SSL_CERTPROBLEM:
    case CURLE_SSL_INVALIDCERTSTATUS:
        return "certificate";
    case CURLE_SSL_CONNECT_ERROR: // no TLS on the other side
    case CURLE_WEIRD_SERVER_REPLY:
    case CURLE_URL_MALFORMAT:
    case CURLE_UNSUPPORTED_PROTOCOL:
        return "unexpected_answer";
    default:
        return "unreachable";
    }
}

size_t onWrite(char *data, size_t size, size_t count, void *body)
{
    auto *text = static_cast<std::string *>(body);
    text->append(data, std::min(size * count, longestAnswer - text->size()));
    return size * count;
}

int onProgress(void *cancelled, curl_off_t, curl_off_t, curl_off_t, curl_off_t)
{
    return static_cast<const std::atomic<bool> *>(cancelled)->load() ? 1 : 0;
}

void limit(CURL *easy)
{
    curl_easy_setopt(easy, CURLOPT_PROTOCOLS_STR, "http,https");
    // The code must not go wherever somebody points.
    curl_easy_setopt(easy, CURLOPT_FOLLOWLOCATION, 0L);
    curl_easy_setopt(easy, CURLOPT_NOSIGNAL, 1L);
    curl_easy_setopt(easy, CURLOPT_CONNECTTIMEOUT, connectSeconds);
    curl_easy_setopt(easy, CURLOPT_TIMEOUT, totalSeconds);
    curl_easy_setopt(easy, CURLOPT_USERAGENT, "korrin");
    if (const char *certificates = std::getenv("SSL_CERT_FILE"); certificates && *certificates)
        curl_easy_setopt(easy, CURLOPT_CAINFO, certificates);
}

} // namespace

PostAnswer postJson(const std::string &url, const std::vector<std::string> &headers,
                    const std::string &body, const std::atomic<bool> &cancelled)
{
    const std::unique_ptr<CURL, decltype(&curl_easy_cleanup)> easy(curl_easy_init(),
                                                                   curl_easy_cleanup);
    if (!easy)
        return {"unreachable", 0, {}, 0};
    Lists lists;
    for (const std::string &header : headers)
        lists.headers = curl_slist_append(lists.headers, header.c_str());
    PostAnswer answer;
    limit(easy.get());
    curl_easy_setopt(easy.get(), CURLOPT_URL, url.c_str());
    curl_easy_setopt(easy.get(), CURLOPT_HTTPHEADER, lists.headers);
    curl_easy_setopt(easy.get(), CURLOPT_POSTFIELDSIZE, static_cast<long>(body.size()));
    curl_easy_setopt(easy.get(), CURLOPT_POSTFIELDS, body.c_str());
    curl_easy_setopt(easy.get(), CURLOPT_WRITEFUNCTION, onWrite);
    curl_easy_setopt(easy.get(), CURLOPT_WRITEDATA, &answer.body);
    curl_easy_setopt(easy.get(), CURLOPT_XFERINFOFUNCTION, onProgress);
    curl_easy_setopt(easy.get(), CURLOPT_XFERINFODATA, &cancelled);
    curl_easy_setopt(easy.get(), CURLOPT_NOPROGRESS, 0L);
    answer.failure = failureName(curl_easy_perform(easy.get()));
    curl_easy_getinfo(easy.get(), CURLINFO_RESPONSE_CODE, &answer.status);
    curl_off_t wait = 0;
    curl_easy_getinfo(easy.get(), CURLINFO_RETRY_AFTER, &wait);
    answer.retryAfterSeconds = wait;
    return answer;
}

} // namespace pelliko::korrin
