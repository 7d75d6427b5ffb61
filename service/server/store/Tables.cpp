#include "store/Tables.h"

#include "text/Secrets.h"

#include <cstring>

namespace pelliko::server
{
namespace
{

using Kind = Column::Kind;

constexpr std::array accounts{Column{"id", Kind::integer},      Column{"number", Kind::text},
                              Column{"name", Kind::text},       Column{"token_hash", Kind::bytes},
                              Column{"created", Kind::integer}, Column{"last_push", Kind::integer}};
constexpr std::array invitations{Column{"id", Kind::integer},     Column{"code_hash", Kind::bytes},
                                 Column{"number", Kind::text},    Column{"uses", Kind::integer},
                                 Column{"used", Kind::integer},   Column{"created", Kind::integer},
                                 Column{"expires", Kind::integer}};
constexpr std::array redemptions{Column{"invitation", Kind::integer},
                                 Column{"account", Kind::integer}, Column{"key_hash", Kind::bytes}};
constexpr std::array questions{Column{"account", Kind::integer}, Column{"at", Kind::integer},
                               Column{"numbers", Kind::integer}};
constexpr std::array shares{
    Column{"id", Kind::integer},       Column{"key", Kind::text},
    Column{"account", Kind::integer},  Column{"idempotency_key", Kind::text},
    Column{"state", Kind::integer},    Column{"created", Kind::integer},
    Column{"deadline", Kind::integer}, Column{"ended", Kind::integer},
    Column{"link_hash", Kind::bytes}};
constexpr std::array recipients{Column{"share", Kind::integer}, Column{"position", Kind::integer},
                                Column{"number", Kind::text}, Column{"ccc", Kind::text}};
constexpr std::array blobs{Column{"id", Kind::integer}, Column{"key", Kind::text},
                           Column{"received", Kind::integer}, Column{"doomed", Kind::flag}};
constexpr std::array files{Column{"share", Kind::integer}, Column{"position", Kind::integer},
                           Column{"name", Kind::text},     Column{"type", Kind::text},
                           Column{"size", Kind::integer},  Column{"upload", Kind::text},
                           Column{"blob", Kind::integer}};
constexpr std::array usage{Column{"account", Kind::integer}, Column{"share", Kind::integer},
                           Column{"at", Kind::integer}, Column{"bytes", Kind::integer}};
constexpr std::array pushes{Column{"account", Kind::integer}, Column{"id", Kind::integer},
                            Column{"share", Kind::integer},   Column{"state", Kind::integer},
                            Column{"token", Kind::text},      Column{"token_hash", Kind::bytes}};

constexpr std::array tables{
    Table{"accounts", accounts, "id", true},
    Table{"invitations", invitations, "id", true},
    Table{"redemptions", redemptions, "invitation, account, key_hash", false},
    Table{"questions", questions, "account, at", false},
    Table{"shares", shares, "id", true},
    Table{"recipients", recipients, "share, position", false},
    Table{"blobs", blobs, "id", true},
    Table{"files", files, "share, position", false},
    Table{"usage", usage, "account, at", false},
    Table{"pushes", pushes, "account, id", false},
};

void append(std::string &text, std::uint64_t number)
{
    text.append(reinterpret_cast<const char *>(&number), sizeof number);
}

/// No two rows have the same.
std::string encoded(const TableRow &row)
{
    std::string text;
    for (const Cell &cell : row) {
        text += static_cast<char>(cell.index());
        if (const auto *number = std::get_if<std::int64_t>(&cell)) {
            append(text, static_cast<std::uint64_t>(*number));
        } else if (const auto *bytes = std::get_if<std::string>(&cell)) {
            append(text, bytes->size());
            text += *bytes;
        }
    }
    return text;
}

} // namespace

std::span<const Table> metadataTables()
{
    return tables;
}

void TableDigest::add(const TableRow &row)
{
    const std::string hash = sha256(encoded(row));
    std::array<std::uint64_t, 4> numbers{};
    std::memcpy(numbers.data(), hash.data(), sizeof numbers);
    for (std::size_t index = 0; index < numbers.size(); ++index)
        m_sum.at(index) += numbers.at(index);
    ++m_rows;
}

const std::string &textIn(const TableRow &row, std::size_t column)
{
    return std::get<std::string>(row.at(column));
}

std::int64_t numberIn(const TableRow &row, std::size_t column)
{
    return std::get<std::int64_t>(row.at(column));
}

bool isNull(const TableRow &row, std::size_t column)
{
    return std::holds_alternative<std::monostate>(row.at(column));
}

} // namespace pelliko::server
