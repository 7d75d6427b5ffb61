#pragma once

#include <span>

namespace pelliko::server
{

/// A text of the pages: the English one and its forms in another language, one per kind of number;
/// forms that the language does not have are null.
struct PageText {
    const char *id;
    const char *forms[6];
};

struct PageCatalogue {
    const char *tag; ///< of BCP 47, for example "pt-BR"
    bool rightToLeft;
    unsigned long (*formOf)(unsigned long number); ///< index of the form that a number takes
    std::span<const PageText> texts;
};

/// Every language but English, whose texts stand in the sources; compiled in from `pages/locale`.
[[nodiscard]] std::span<const PageCatalogue> pageCatalogues();

} // namespace pelliko::server
