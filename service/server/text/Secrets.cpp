#include "text/Secrets.h"

#include "text/Base64.h"

#include <openssl/sha.h>
#include <sys/random.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <system_error>

namespace pelliko::server
{

std::string randomToken()
{
    std::array<char, 16> bytes{};
    if (getrandom(bytes.data(), bytes.size(), 0) != static_cast<ssize_t>(bytes.size()))
        throw std::system_error(errno, std::generic_category(), "random source");
    return base64Url({bytes.data(), bytes.size()});
}

std::string sha256(std::string_view bytes)
{
    std::array<unsigned char, SHA256_DIGEST_LENGTH> digest{};
    SHA256(reinterpret_cast<const unsigned char *>(bytes.data()), bytes.size(), digest.data());
    return {digest.begin(), digest.end()};
}

bool looksLikeToken(std::string_view text)
{
    return text.size() == 22 && std::all_of(text.begin(), text.end(), [](char c) {
               return (c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z') || (c >= '0' && c <= '9') ||
                      c == '-' || c == '_';
           });
}

} // namespace pelliko::server
