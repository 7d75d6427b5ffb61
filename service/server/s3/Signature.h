#pragma once

#include <ctime>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

namespace pelliko::server::s3
{

struct Credentials {
    std::string accessKey;
    std::string secretKey;
    /// Of credentials that are lent for a time; empty for lasting ones.
    std::string sessionToken;
};

using Pairs = std::vector<std::pair<std::string, std::string>>;

/// A request as far as its signature covers it.
struct Signable {
    std::string method;
    /// Encoded (see encodedPath), with a slash in front.
    std::string path;
    /// Names and values, not encoded, in any order.
    Pairs query;
    /// Names in small letters; "host" is among them.
    Pairs headers;
};

/// Whose signature, for where, made when.
struct Signer {
    const Credentials &credentials;
    const std::string &region;
    std::time_t now;
};

/// What stands for the hash of a body that is not part of the signature.
inline constexpr std::string_view unsignedPayload = "UNSIGNED-PAYLOAD";

/// SHA-256 in hexadecimal.
[[nodiscard]] std::string hexSha256(std::string_view bytes);

/// Everything but letters, digits and -._~ as %XX; slashes stay.
[[nodiscard]] std::string encodedPath(std::string_view path);

/// The query as it has to be sent and is signed: encoded, sorted by name.
[[nodiscard]] std::string encodedQuery(Pairs query);

/// "20130524T000000Z".
[[nodiscard]] std::string signingTime(std::time_t now);

/// Adds x-amz-date, x-amz-content-sha256, the token of lent credentials and Authorization to the
/// headers of the request.
void sign(Signable &request, const std::string &payloadHash, const Signer &signer);

/// The query of an address that everybody may use for so many seconds, 604800 at most.
[[nodiscard]] std::string presignedQuery(Signable request, long seconds, const Signer &signer);

} // namespace pelliko::server::s3
