#include "FilterSql.h"

#include <algorithm>
#include <array>
#include <utility>

#include "NumberText.h"

namespace pelliko::contacts
{
namespace
{

// As many characters as a row of number_parts has.
constexpr size_t longest_part = 6;

// The last character is counted up, so it must not be the last one there is.
bool isIndexable(const std::string &folded)
{
    return !folded.empty() &&
           std::all_of(folded.begin(), folded.end(), [](char c) { return c >= ' ' && c <= '~'; });
}

// A text is looked up by its end, because beginnings (country, network) are shared by very many
// numbers; a short one is the beginning of a part.
SqlText contains(const Property &property, const std::string &folded)
{
    const std::string test = "instr(" + std::string(property.folded) + ", ?) > 0";
    if (property.matching != Matching::NumberText || !isIndexable(folded))
        return {test, {folded}};
    const std::string first = folded.substr(folded.size() - std::min(folded.size(), longest_part));
    std::string beyond = first;
    ++beyond.back();
    return {"n.id IN (SELECT number_id FROM number_parts WHERE part >= ? AND part < ?) AND " + test,
            {first, beyond, folded}};
}

// instr and substr give % and _ of a match value no meaning, which LIKE would.
SqlText textCondition(const Property &property, const TextMatch &match)
{
    const std::string column = property.column;
    if (match.flag == CONTACTS_MATCH_EXISTS)
        return {column + " IS NOT NULL", {}};
    if (match.flag == CONTACTS_MATCH_EXACTLY)
        return {column + " = ?", {match.value}};
    const std::string folded_column = property.folded;
    const std::string folded = foldText(match.value);
    switch (match.flag) {
    case CONTACTS_MATCH_CONTAINS:
        return contains(property, folded);
    case CONTACTS_MATCH_STARTSWITH:
        return {"instr(" + folded_column + ", ?) = 1", {folded}};
    case CONTACTS_MATCH_ENDSWITH:
        if (folded.empty())
            return {column + " IS NOT NULL", {}};
        return {"substr(" + folded_column + ", -length(?)) = ?", {folded, folded}};
    default:
        return {folded_column + " = ?", {folded}};
    }
}

SqlText numberCondition(const Property &property, const TextMatch &match)
{
    if (match.flag == CONTACTS_MATCH_EXISTS)
        return {std::string(property.column) + " IS NOT NULL", {}};
    const bool normalized = property.matching == Matching::Normalized;
    return {std::string(property.column) + " = ?",
            {normalized ? normalizeNumber(match.value) : cleanNumber(match.value)}};
}

SqlText integerCondition(const Property &property, const IntegerMatch &match)
{
    static constexpr std::array operators{" = ?", " > ?", " >= ?", " < ?", " <= ?", " <> ?"};
    if (match.flag == CONTACTS_MATCH_NONE)
        return {std::string(property.column) + " IS NULL", {}};
    return {std::string(property.column) + operators.at(static_cast<size_t>(match.flag)),
            {match.value}};
}

SqlText sqlOf(const Condition &condition)
{
    const Property &property = *condition.property;
    if (const auto *integer = std::get_if<IntegerMatch>(&condition.match))
        return integerCondition(property, *integer);
    const TextMatch &match = std::get<TextMatch>(condition.match);
    return property.isReadable() ? textCondition(property, match)
                                 : numberCondition(property, match);
}

} // namespace

SqlText whereExpression(const Conditions &row)
{
    SqlText all;
    for (size_t i = 0; i < row.conditions.size(); ++i) {
        SqlText next = sqlOf(row.conditions[i]);
        if (i == 0) {
            all = {"(" + next.text + ")", std::move(next.values)};
            continue;
        }
        const bool both = row.operators[i - 1] == CONTACTS_FILTER_OPERATOR_AND;
        all.text = "(" + all.text + (both ? " AND (" : " OR (") + next.text + "))";
        all.values.insert(all.values.end(), next.values.begin(), next.values.end());
    }
    return all;
}

std::string selectFrom(const View &view)
{
    std::string columns;
    for (const Property &property : view.properties) {
        if (property.isReadable())
            columns += (columns.empty() ? "" : ", ") + std::string(property.column);
    }
    return "SELECT " + columns + " FROM " + view.from;
}

SqlText selectText(const View &view, const Conditions &row, int offset, int limit)
{
    constexpr int all = -1;
    SqlText select = whereExpression(row);
    const std::string where = select.text.empty() ? "" : " WHERE " + select.text;
    select.text = selectFrom(view) + where + " ORDER BY " + view.order + " LIMIT ? OFFSET ?";
    select.values.emplace_back(limit == 0 ? all : limit);
    select.values.emplace_back(offset);
    return select;
}

} // namespace pelliko::contacts
