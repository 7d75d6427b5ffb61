// The words of a line of a list.
#pragma once

#include <string>

namespace pelliko::companion
{

/// What a row shows. Texts are in the user's language already.
struct RowTexts {
    std::string title;
    std::string second;
    /// A row with a third line keeps it, one without never gets one.
    std::string third;

    bool operator==(const RowTexts &) const = default;
};

} // namespace pelliko::companion
