#include "shares/FileNames.h"

#include <algorithm>
#include <cstdint>
#include <set>

namespace pelliko::server
{
namespace
{

constexpr std::size_t nameLimit = 255;
/// A longer "extension" is part of the name and may be cut.
constexpr std::size_t extensionLimit = 20;

struct Range {
    char32_t first;
    char32_t last;
};

/// Control characters, line separators, and the marks by which "gpj.exe" reads as "exe.jpg".
constexpr Range unwanted[] = {{0x00, 0x1f},     {0x7f, 0x9f},     {0x61c, 0x61c},  {0x200e, 0x200f},
                              {0x2028, 0x202e}, {0x2066, 0x2069}, {0xfeff, 0xfeff}};

std::size_t sequenceLength(char lead)
{
    const auto byte = static_cast<unsigned char>(lead);
    return byte < 0x80 ? 1 : byte < 0xe0 ? 2 : byte < 0xf0 ? 3 : 4;
}

char32_t decode(std::string_view sequence)
{
    constexpr unsigned leadMask[] = {0, 0x7f, 0x1f, 0x0f, 0x07};
    char32_t point = static_cast<unsigned char>(sequence[0]) & leadMask[sequence.size()];
    for (char c : sequence.substr(1))
        point = (point << 6) | (static_cast<unsigned char>(c) & 0x3fU);
    return point;
}

std::string withoutUnwanted(std::string_view text)
{
    std::string out;
    for (std::size_t i = 0; i < text.size();) {
        const std::string_view sequence = text.substr(i, sequenceLength(text[i]));
        const char32_t point = decode(sequence);
        if (std::none_of(std::begin(unwanted), std::end(unwanted),
                         [&](const Range &r) { return point >= r.first && point <= r.last; }))
            out += sequence;
        i += sequence.size();
    }
    return out;
}

std::string_view extensionOf(std::string_view name)
{
    const auto dot = name.rfind('.');
    if (dot == std::string_view::npos || dot == 0 || name.size() - dot > extensionLimit)
        return {};
    return name.substr(dot);
}

std::string cutKeepingExtension(const std::string &name, std::size_t limit)
{
    if (name.size() <= limit)
        return name;
    const std::string_view extension = extensionOf(name);
    std::size_t length = limit - extension.size();
    // Never in the middle of a character.
    while (length > 0 && (static_cast<unsigned char>(name[length]) & 0xc0U) == 0x80)
        --length;
    return name.substr(0, length) + std::string(extension);
}

std::string trimmed(const std::string &text)
{
    const auto first = text.find_first_not_of(' ');
    if (first == std::string::npos)
        return {};
    return text.substr(first, text.find_last_not_of(' ') - first + 1);
}

std::string lowerCase(std::string text)
{
    std::transform(text.begin(), text.end(), text.begin(), [](char c) {
        return c >= 'A' && c <= 'Z' ? static_cast<char>(c - 'A' + 'a') : c;
    });
    return text;
}

std::string numbered(const std::string &name, std::size_t number)
{
    const std::string_view extension = extensionOf(name);
    const std::string suffix = " (" + std::to_string(number) + ")" + std::string(extension);
    const std::string stem = name.substr(0, name.size() - extension.size());
    return cutKeepingExtension(stem, nameLimit - suffix.size()) + suffix;
}

bool isTypeCharacter(char c)
{
    return (c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z') || (c >= '0' && c <= '9') ||
           std::string_view("!#$&^_.+-").find(c) != std::string_view::npos;
}

} // namespace

std::string cleanFileName(std::string_view name)
{
    std::string clean = withoutUnwanted(name);
    // Names come from phones and from PCs, so either slash ends a folder.
    if (const auto slash = clean.find_last_of("/\\"); slash != std::string::npos)
        clean.erase(0, slash + 1);
    // The cut may end at a blank.
    clean = trimmed(cutKeepingExtension(trimmed(clean), nameLimit));
    // Looked at last: what is left may be a way up only now.
    return clean.empty() || clean == "." || clean == ".." ? "file" : clean;
}

std::string cleanType(std::string_view type)
{
    constexpr std::string_view unknown = "application/octet-stream";
    const auto slash = type.find('/');
    if (type.size() > 127 || slash == std::string_view::npos || slash == 0 ||
        slash + 1 == type.size())
        return std::string(unknown);
    const auto isPart = [](std::string_view part) {
        return std::all_of(part.begin(), part.end(), isTypeCharacter);
    };
    const bool valid = isPart(type.substr(0, slash)) && isPart(type.substr(slash + 1));
    return std::string(valid ? type : unknown);
}

std::vector<std::string> uniqueNames(const std::vector<std::string> &names)
{
    // A numbered name must not take the place of one that is in the list itself.
    std::multiset<std::string> wanted;
    for (const std::string &name : names)
        wanted.insert(lowerCase(name));
    std::set<std::string> taken;
    std::vector<std::string> unique;
    for (const std::string &name : names) {
        std::string candidate = name;
        for (std::size_t number = 2; !taken.insert(lowerCase(candidate)).second; ++number) {
            do {
                candidate = numbered(name, number);
            } while (wanted.count(lowerCase(candidate)) != 0 && ++number != 0);
        }
        unique.push_back(candidate);
    }
    return unique;
}

} // namespace pelliko::server
