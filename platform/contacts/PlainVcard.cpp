#include "PlainVcard.h"

#include <algorithm>
#include <string_view>

#include <glib.h>

#include "NumberTypes.h"

namespace pelliko::contacts
{
namespace
{

constexpr size_t longest_line = 75; // letters; longer ones are folded
constexpr std::string_view line_end = "\r\n";

bool isCopied(std::string_view text)
{
    const auto takesMore = [](char c) {
        return static_cast<unsigned char>(c) < ' ' || c == '\x7f' || c == '\\' || c == ';' ||
               c == ',';
    };
    return std::none_of(text.begin(), text.end(), takesMore) &&
           g_utf8_validate_len(text.data(), text.size(), nullptr) != FALSE;
}

// Adds lines for as long as all of them are plain.
class PlainLines
{
public:
    void add(std::string_view before, std::string_view value, std::string_view behind = {})
    {
        // Bytes are at least as many as letters.
        if (before.size() + value.size() + behind.size() > longest_line || !isCopied(value))
            m_is_plain = false;
        if (m_is_plain)
            m_text.append(before).append(value).append(behind).append(line_end);
    }

    [[nodiscard]] std::optional<std::string> take()
    {
        return m_is_plain ? std::optional(std::move(m_text)) : std::nullopt;
    }

private:
    bool m_is_plain = true;
    std::string m_text;
};

std::string headOf(const CardNumber &number)
{
    std::string head = "TEL";
    const auto addType = [&](const char *word) {
        head.append(head.size() == 3 ? ";TYPE=" : ",").append(word);
    };
    for (const TypeWord &known : type_words) {
        if (known.is_written && (number.type & known.bit) != 0)
            addType(known.word);
    }
    if (number.is_default)
        addType("PREF");
    return head + ":";
}

} // namespace

std::optional<std::string> plainVcardText(const ContactCard &card)
{
    const bool has_label = std::any_of(card.numbers.begin(), card.numbers.end(),
                                       [](const auto &number) { return !number.label.empty(); });
    if (has_label || !card.picture.empty())
        return std::nullopt;
    const std::string &name = shownName(card);
    PlainLines lines;
    lines.add("BEGIN:", "VCARD");
    lines.add("VERSION:", "3.0");
    lines.add("FN:", name);
    lines.add("N:;", name, ";;;");
    for (const CardNumber &number : card.numbers)
        lines.add(headOf(number), number.number);
    if (!card.uid.empty())
        lines.add("UID:", card.uid);
    lines.add("END:", "VCARD");
    return lines.take();
}

} // namespace pelliko::contacts
