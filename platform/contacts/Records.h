// What is behind the record and list handles.
#pragma once

#include <memory>
#include <string>
#include <variant>
#include <vector>

#include "Views.h"
#include "contacts.h"

struct __contacts_record_h {
    const pelliko::contacts::View *view;
    /// One value for each readable property of the view, in its order; monostate is "no value".
    std::vector<std::variant<std::monostate, int, std::string>> values;
};

struct __contacts_list_h {
    std::vector<std::unique_ptr<__contacts_record_h>> records;
    size_t current = 0; ///< records.size() is past the end
};
