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

/// What a table file holds.
struct TableFile {
    struct Entry {
        std::string palette; ///< around it; empty when it belongs to all
        TableEntry attributes;
    };
    std::string usual; ///< the palette that the outermost element asks for
    std::vector<Entry> entries;

    /// The entries of a palette, in file order, with those that belong to all. A palette that the
    /// file does not have, or none, is the usual one.
    std::vector<TableEntry> of(const std::string &palette = {}) const;
};

/// The `entry` elements of a file; nothing when it cannot be read, is not well formed or its
/// outermost element is not `root` (the reason goes to the log).
std::optional<TableFile> readTable(const char *path, const std::string &root,
                                   const std::string &entry);

/// Reports why a table was refused.
void reportTable(const char *path, const std::string &reason);

} // namespace pelliko::ui
