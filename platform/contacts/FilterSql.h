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

/// "SELECT readable properties FROM tables" of the view.
std::string selectFrom(const View &view);

/// The whole query for a list of records; limit 0 means all.
SqlText selectText(const View &view, const Conditions &row, int offset, int limit);

} // namespace pelliko::contacts
