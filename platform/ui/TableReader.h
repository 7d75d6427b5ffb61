// Reads the small XML files behind the changeable tables.
#pragma once

#include <map>
#include <optional>
#include <string>
#include <vector>

namespace pelliko::ui
{

struct TableEntry {
    std::map<std::string, std::string> attributes;

    /// Empty when the attribute is missing.
    std::string get(const std::string &name) const;
};

/// The `entry` elements of the file's chosen palette, in file order; nothing when the file cannot
/// be read, is not well formed or its outermost element is not `root` (the reason goes to the log).
/// The palette is the one that the outermost element's "palette" names; entries outside any
/// <palette> belong to all of them.
std::optional<std::vector<TableEntry>> readTable(const char *path, const std::string &root,
                                                 const std::string &entry);

/// Reports why a table was refused.
void reportTable(const char *path, const std::string &reason);

} // namespace pelliko::ui
