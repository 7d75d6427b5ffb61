// What is behind the filter and query handles.
#pragma once

#include <string>
#include <variant>
#include <vector>

#include "Views.h"
#include "contacts.h"

namespace pelliko::contacts
{

struct TextMatch {
    contacts_match_str_flag_e flag;
    std::string value;
};

struct IntegerMatch {
    contacts_match_int_flag_e flag;
    int value;
};

struct Condition {
    const Property *property;
    std::variant<TextMatch, IntegerMatch> match;
};

/// Conditions with an operator between each two: operators[i] joins all up to conditions[i] with
/// conditions[i + 1].
struct Conditions {
    std::vector<Condition> conditions;
    std::vector<contacts_filter_operator_e> operators;

    [[nodiscard]] bool endsInOperator() const
    {
        return !operators.empty() && operators.size() == conditions.size();
    }
};

} // namespace pelliko::contacts

struct __contacts_filter_h {
    const pelliko::contacts::View *view;
    pelliko::contacts::Conditions row;
};

struct __contacts_query_h {
    const pelliko::contacts::View *view;
    pelliko::contacts::Conditions row;
};
