// How the views and properties lie on the tables.
#pragma once

#include <vector>

namespace pelliko::contacts
{

enum class ValueType { Bool, Integer, Text };

/// How a text property is compared.
enum class Matching {
    Text,       ///< as the match flag says
    NumberText, ///< as the match flag says, with the index over parts of numbers
    Normalized, ///< exactly, after normalizeNumber on both sides
    Cleaned,    ///< exactly, after cleanNumber on both sides
};

struct Property {
    unsigned int id;
    ValueType type;
    const char *column; ///< SQL of the value as it is stored
    const char *folded; ///< SQL of the folded text; null for a property that is no text
    Matching matching;

    /// Records answer it; the others can only be filtered by.
    [[nodiscard]] bool isReadable() const
    {
        return matching == Matching::Text || matching == Matching::NumberText;
    }
};

struct View {
    const char *uri;
    const char *from;      ///< SQL tables and joins
    const char *order;     ///< SQL column that records are ordered by
    const char *id_column; ///< null for a joined view, whose rows have no id of their own
    std::vector<Property> properties;

    /// Null when the view has no such property.
    [[nodiscard]] const Property *find(unsigned int property_id) const;
};

/// The view of that name; null for a null or unknown name. Lives as long as the process.
const View *findView(const char *uri);

} // namespace pelliko::contacts
