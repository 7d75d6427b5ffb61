#include "VcardText.h"

#include <memory>

#include <glib.h>

namespace pelliko::contacts
{
namespace
{

constexpr std::string_view byte_order_mark = "\xef\xbb\xbf";

bool isWord(std::string_view line, std::string_view word)
{
    while (!line.empty() && (line.back() == ' ' || line.back() == '\t'))
        line.remove_suffix(1);
    return line.size() == word.size() &&
           g_ascii_strncasecmp(line.data(), word.data(), word.size()) == 0;
}

bool isQuotedPrintable(std::string_view line)
{
    std::string head(line.substr(0, line.find(':')));
    for (char &letter : head)
        letter = g_ascii_toupper(letter);
    return head.find(';') != std::string::npos &&
           head.find("QUOTED-PRINTABLE") != std::string::npos;
}

// Collects the lines of one card after the other.
class Splitter
{
public:
    void take(std::string_view line)
    {
        ++m_line;
        if (isWord(line, "BEGIN:VCARD"))
            begin();
        if (m_depth == 0)
            return;
        append(line);
        if (isWord(line, "END:VCARD") && --m_depth == 0)
            finish();
        m_after_agent = isWord(line, "AGENT:");
    }

    std::vector<RawCard> end()
    {
        if (m_depth > 0)
            abandon();
        return std::move(m_cards);
    }

private:
    // A quoted-printable value goes on in the next line after a "=" at its end. The vCard library
    // does not join such lines.
    void append(std::string_view line)
    {
        constexpr size_t soft_end = 3; // "=", CR, LF
        const bool joins = m_value_goes_on && !isWord(line, "END:VCARD");
        if (m_value_goes_on)
            m_card.text.resize(m_card.text.size() - soft_end);
        if (m_value_goes_on && !joins)
            m_card.text.append("\r\n");
        if (!joins)
            m_is_quoted = isQuotedPrintable(line);
        m_card.text.append(line).append("\r\n");
        m_value_goes_on = m_is_quoted && line.ends_with('=');
    }

    // A card may hold the card of its person's agent; any other BEGIN inside a card means that the
    // END of the card before it is missing.
    void begin()
    {
        if (m_depth > 0 && m_after_agent) {
            ++m_depth;
            return;
        }
        if (m_depth > 0)
            abandon();
        m_depth = 1;
        m_value_goes_on = false;
        m_card = {m_line, {}, {}};
    }

    void finish()
    {
        m_card.text = asUtf8(std::move(m_card.text));
        if (m_card.text.find('\0') != std::string::npos)
            m_card = {m_card.line, {}, "there are zero bytes in it"};
        m_cards.push_back(std::move(m_card));
    }

    void abandon()
    {
        m_cards.push_back({m_card.line, {}, "its END:VCARD is missing"});
        m_depth = 0;
    }

    size_t m_line = 0;
    int m_depth = 0;
    bool m_after_agent = false;
    bool m_is_quoted = false;
    bool m_value_goes_on = false;
    RawCard m_card{};
    std::vector<RawCard> m_cards;
};

// Cuts the next line off the text; a line ends with LF, CRLF or CR.
std::string_view nextLine(std::string_view &text)
{
    const size_t end = text.find_first_of("\r\n");
    const std::string_view line = text.substr(0, end);
    if (end == std::string_view::npos) {
        text = {};
        return line;
    }
    const bool pair = text.substr(end, 2) == "\r\n";
    text.remove_prefix(end + (pair ? 2 : 1));
    return line;
}

} // namespace

std::string asUtf8(std::string text)
{
    if (g_utf8_validate_len(text.data(), text.size(), nullptr))
        return text;
    using Converted = std::unique_ptr<char, decltype(&g_free)>;
    const auto size = static_cast<gssize>(text.size());
    gsize written = 0;
    const Converted converted(g_convert_with_fallback(text.data(), size, "UTF-8", "WINDOWS-1252",
                                                      "?", nullptr, &written, nullptr),
                              g_free);
    if (converted)
        return {converted.get(), written};
    return Converted(g_utf8_make_valid(text.data(), size), g_free).get();
}

std::vector<RawCard> splitCards(std::string_view text)
{
    if (text.substr(0, byte_order_mark.size()) == byte_order_mark)
        text.remove_prefix(byte_order_mark.size());
    Splitter splitter;
    while (!text.empty())
        splitter.take(nextLine(text));
    return splitter.end();
}

} // namespace pelliko::contacts
