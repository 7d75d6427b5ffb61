#pragma once

#include <cstdint>
#include <string>
#include <string_view>

namespace pelliko::server
{

struct PageCatalogue;

/// The language that a page is written in. It is the reader's, not the machine's: no locale is
/// needed, and answers in several languages can be made at the same time.
class PageLanguage
{
public:
    /// English.
    PageLanguage() = default;

    /// The best of ours for an Accept-Language header; English when it names none of them.
    [[nodiscard]] static PageLanguage preferred(std::string_view acceptLanguage);

    /// For the attribute `lang`, for example "pt-BR".
    [[nodiscard]] const char *tag() const;
    /// For the attribute `dir`: "ltr" or "rtl".
    [[nodiscard]] const char *direction() const;
    [[nodiscard]] bool isEnglish() const { return m_catalogue == nullptr; }

    /// A text by its English form, which also stands in for one that is missing.
    [[nodiscard]] std::string text(const char *english) const;
    /// A text with "%s" replaced.
    [[nodiscard]] std::string filled(const char *english, std::string_view value) const;
    /// The form for a number, its place ("%d" or "%1$d") replaced.
    [[nodiscard]] std::string counted(const char *one, const char *many,
                                      std::uint64_t number) const;

    /// "1 byte", "1.5 kB" with the language's decimal sign and units.
    [[nodiscard]] std::string size(std::uint64_t bytes) const;
    /// Day and time in UTC, as the language writes them.
    [[nodiscard]] std::string date(std::int64_t secondsSinceEpoch) const;

private:
    explicit PageLanguage(const PageCatalogue *catalogue) : m_catalogue(catalogue) {}

    const PageCatalogue *m_catalogue = nullptr;
};

/// Replaces the first `place` in a text; a text without it stays.
[[nodiscard]] std::string withValue(std::string text, std::string_view place,
                                    std::string_view value);

} // namespace pelliko::server
