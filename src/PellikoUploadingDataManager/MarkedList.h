// Lists inside one text, as launch requests carry them: each item ends with "?".
#pragma once

#include <algorithm>
#include <string>
#include <string_view>
#include <vector>

namespace pelliko
{

/// The items in their order; a last one that was cut before its mark counts too.
inline std::vector<std::string> splitMarkedList(std::string_view text)
{
    std::vector<std::string> items;
    while (!text.empty()) {
        const size_t end = std::min(text.find('?'), text.size());
        items.emplace_back(text.substr(0, end));
        text.remove_prefix(std::min(end + 1, text.size()));
    }
    return items;
}

} // namespace pelliko
