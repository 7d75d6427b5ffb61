#include "s3/Signature.h"

#include "text/Secrets.h"

#include <openssl/evp.h>
#include <openssl/hmac.h>

#include <algorithm>
#include <array>
#include <stdexcept>

namespace pelliko::server::s3
{
namespace
{

constexpr const char *algorithm = "AWS4-HMAC-SHA256";

std::string hex(std::string_view bytes)
{
    constexpr const char *digits = "0123456789abcdef";
    std::string text;
    text.reserve(2 * bytes.size());
    for (const char c : bytes) {
        const auto byte = static_cast<unsigned char>(c);
        text += digits[byte >> 4];
        text += digits[byte & 15];
    }
    return text;
}

std::string hmac(std::string_view key, std::string_view text)
{
    std::array<unsigned char, EVP_MAX_MD_SIZE> digest{};
    unsigned int length = 0;
    if (HMAC(EVP_sha256(), key.data(), static_cast<int>(key.size()),
             reinterpret_cast<const unsigned char *>(text.data()), text.size(), digest.data(),
             &length) == nullptr)
        throw std::runtime_error("cannot sign a request to the store");
    return {digest.begin(), digest.begin() + length};
}

std::string encoded(std::string_view text, bool keepSlashes)
{
    constexpr const char *digits = "0123456789ABCDEF";
    std::string result;
    for (const char c : text) {
        const auto byte = static_cast<unsigned char>(c);
        const bool plain = (c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z') ||
                           (c >= '0' && c <= '9') || c == '-' || c == '.' || c == '_' || c == '~';
        if (plain || (keepSlashes && c == '/'))
            result += c;
        else
            (result += '%').append({digits[byte >> 4], digits[byte & 15]});
    }
    return result;
}

std::string scopeOf(const Signer &signer)
{
    return signingTime(signer.now).substr(0, 8) + "/" + signer.region + "/s3/aws4_request";
}

std::string namesOf(const Pairs &headers)
{
    std::string names;
    for (const auto &[name, value] : headers)
        names.append(names.empty() ? "" : ";").append(name);
    return names;
}

/// `headers` are sorted.
std::string signatureOf(const Signable &request, const std::string &query,
                        std::string_view payloadHash, const Signer &signer)
{
    std::string canonical = request.method + "\n" + request.path + "\n" + query + "\n";
    for (const auto &[name, value] : request.headers)
        canonical.append(name).append(":").append(value).append("\n");
    canonical += "\n" + namesOf(request.headers) + "\n";
    canonical += payloadHash;
    const std::string time = signingTime(signer.now);
    const std::string text =
        std::string(algorithm) + "\n" + time + "\n" + scopeOf(signer) + "\n" + hexSha256(canonical);
    std::string key = hmac("AWS4" + signer.credentials.secretKey, time.substr(0, 8));
    for (const std::string_view part : {std::string_view(signer.region), std::string_view("s3"),
                                        std::string_view("aws4_request")})
        key = hmac(key, part);
    return hex(hmac(key, text));
}

} // namespace

std::string hexSha256(std::string_view bytes)
{
    return hex(sha256(bytes));
}

std::string encodedPath(std::string_view path)
{
    return encoded(path, true);
}

std::string encodedQuery(Pairs query)
{
    for (auto &[name, value] : query) {
        name = encoded(name, false);
        value = encoded(value, false);
    }
    std::sort(query.begin(), query.end());
    std::string text;
    for (const auto &[name, value] : query)
        text.append(text.empty() ? "" : "&").append(name).append("=").append(value);
    return text;
}

std::string signingTime(std::time_t now)
{
    std::tm parts{};
    gmtime_r(&now, &parts);
    std::array<char, 32> text{};
    const std::size_t length = std::strftime(text.data(), text.size(), "%Y%m%dT%H%M%SZ", &parts);
    return {text.data(), length};
}

void sign(Signable &request, const std::string &payloadHash, const Signer &signer)
{
    request.headers.emplace_back("x-amz-content-sha256", payloadHash);
    request.headers.emplace_back("x-amz-date", signingTime(signer.now));
    if (!signer.credentials.sessionToken.empty())
        request.headers.emplace_back("x-amz-security-token", signer.credentials.sessionToken);
    std::sort(request.headers.begin(), request.headers.end());
    const std::string signature =
        signatureOf(request, encodedQuery(request.query), payloadHash, signer);
    request.headers.emplace_back(
        "authorization", std::string(algorithm) + " Credential=" + signer.credentials.accessKey +
                             "/" + scopeOf(signer) + ",SignedHeaders=" + namesOf(request.headers) +
                             ",Signature=" + signature);
}

std::string presignedQuery(Signable request, long seconds, const Signer &signer)
{
    std::sort(request.headers.begin(), request.headers.end());
    request.query.emplace_back("X-Amz-Algorithm", algorithm);
    request.query.emplace_back("X-Amz-Credential",
                               signer.credentials.accessKey + "/" + scopeOf(signer));
    request.query.emplace_back("X-Amz-Date", signingTime(signer.now));
    request.query.emplace_back("X-Amz-Expires", std::to_string(seconds));
    request.query.emplace_back("X-Amz-SignedHeaders", namesOf(request.headers));
    if (!signer.credentials.sessionToken.empty())
        request.query.emplace_back("X-Amz-Security-Token", signer.credentials.sessionToken);
    const std::string query = encodedQuery(request.query);
    return query + "&X-Amz-Signature=" + signatureOf(request, query, unsignedPayload, signer);
}

} // namespace pelliko::server::s3
