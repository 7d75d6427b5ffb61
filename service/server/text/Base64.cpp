#include "text/Base64.h"

#include <cstdint>

namespace pelliko::server
{
namespace
{

constexpr std::string_view usualAlphabet =
    "ABCDEFGHIJKLMNOPQRSTUVWXYZabcdefghijklmnopqrstuvwxyz0123456789+/";
constexpr std::string_view addressAlphabet =
    "ABCDEFGHIJKLMNOPQRSTUVWXYZabcdefghijklmnopqrstuvwxyz0123456789-_";

std::string encode(std::string_view bytes, std::string_view alphabet)
{
    std::string out;
    std::uint32_t held = 0;
    int bits = 0;
    for (char c : bytes) {
        held = (held << 8) | static_cast<unsigned char>(c);
        bits += 8;
        while (bits >= 6) {
            bits -= 6;
            out.push_back(alphabet[(held >> bits) & 63U]);
        }
    }
    if (bits > 0)
        out.push_back(alphabet[(held << (6 - bits)) & 63U]);
    return out;
}

} // namespace

std::string base64Url(std::string_view bytes)
{
    return encode(bytes, addressAlphabet);
}

std::string base64(std::string_view bytes)
{
    std::string out = encode(bytes, usualAlphabet);
    while (out.size() % 4 != 0)
        out.push_back('=');
    return out;
}

std::optional<std::string> base64Decode(std::string_view text)
{
    if (text.size() % 4 != 0)
        return std::nullopt;
    for (int padding = 0; padding < 2 && !text.empty() && text.back() == '='; ++padding)
        text.remove_suffix(1);
    std::string out;
    std::uint32_t held = 0;
    int bits = 0;
    for (char c : text) {
        const std::size_t value = usualAlphabet.find(c);
        if (value == std::string_view::npos)
            return std::nullopt;
        held = (held << 6) | static_cast<std::uint32_t>(value);
        bits += 6;
        if (bits >= 8) {
            bits -= 8;
            out.push_back(static_cast<char>((held >> bits) & 255U));
        }
    }
    return out;
}

} // namespace pelliko::server
