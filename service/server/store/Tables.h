// The tables that every engine of metadata has, and their rows as they stand
#pragma once

#include <array>
#include <cstdint>
#include <span>
#include <string>
#include <variant>
#include <vector>

namespace pelliko::server
{

struct Column {
    enum class Kind { integer, text, bytes, flag };
    const char *name;
    Kind kind;
};

struct Table {
    const char *name;
    /// The same in every engine; what only one of them needs is left out.
    std::span<const Column> columns;
    /// In which its rows are read; also where no column is a key.
    const char *order;
    /// Its ids are given out by the engine, which remembers the highest one ever.
    bool hasCounter;
};

/// In an order in which rows refer only to those of tables before.
[[nodiscard]] std::span<const Table> metadataTables();

/// Nothing, a number (a flag is 0 or 1), or a text or bytes.
using Cell = std::variant<std::monostate, std::int64_t, std::string>;
using TableRow = std::vector<Cell>;

/// What a table holds, whatever the order of its rows.
class TableDigest
{
public:
    void add(const TableRow &row);

    [[nodiscard]] std::uint64_t rows() const { return m_rows; }
    bool operator==(const TableDigest &) const = default;

private:
    std::uint64_t m_rows = 0;
    /// The sum of all rows' SHA-256, each as four numbers.
    std::array<std::uint64_t, 4> m_sum{};
};

/// A text or a number that has to be there.
[[nodiscard]] const std::string &textIn(const TableRow &row, std::size_t column);
[[nodiscard]] std::int64_t numberIn(const TableRow &row, std::size_t column);
[[nodiscard]] bool isNull(const TableRow &row, std::size_t column);

} // namespace pelliko::server
