// Filters as SQL with bound values.
#pragma once

#include <string>
#include <variant>
#include <vector>

#include "Filter.h"

namespace pelliko::contacts
{

using SqlValue = std::variant<int, std::string>;

struct SqlText {
    std::string text;
    std::vector<SqlValue> values; ///< one for each "?" of the text, in order
};

/// The expression that is true for the rows that the conditions let through; empty without
/// conditions. No part of a match value ever becomes part of the SQL text.
SqlText whereExpression(const Conditions &row);

} // namespace pelliko::contacts
