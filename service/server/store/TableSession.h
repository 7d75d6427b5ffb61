#pragma once

#include "store/StoreMark.h"
#include "store/Tables.h"

#include <cstdint>
#include <functional>
#include <memory>
#include <string>
#include <vector>

namespace pelliko::server
{

/// A session of a metadata store for commands that work on its rows as they stand, beside what
/// servers do through Metadata. Statements are in the words that all engines share, with values as
/// $1, $2, … in this order. One thread; every call throws StorageFailure when the store fails.
class TableSession
{
public:
    using Visitor = std::function<void(const TableRow &)>;

    virtual ~TableSession() = default;

    /// Runs a statement; its columns are of these kinds.
    virtual void query(const std::string &sql, const std::vector<Cell> &values,
                       const std::vector<Column::Kind> &columns, const Visitor &visit) = 0;
    /// Runs a statement without rows; returns how many it changed.
    virtual std::int64_t change(const std::string &sql, const std::vector<Cell> &values = {}) = 0;
    virtual bool hasTable(const std::string &name) = 0;

    /// One at a time; ends undone unless `commit` was called.
    virtual void begin() = 0;
    /// As `begin`, of one state that nobody else changes until its end.
    virtual void beginAlone() = 0;
    virtual void commit() = 0;
    virtual void rollBack() noexcept = 0;

    /// All rows, some at a time in memory. Inside a transaction.
    virtual void read(const Table &table, const Visitor &visit) = 0;
    /// Adds rows, with their ids. Inside a transaction.
    virtual void append(const Table &table, const std::vector<TableRow> &rows) = 0;
    /// The highest id that was ever given out.
    virtual std::int64_t counter(const Table &table) = 0;
    virtual void setCounter(const Table &table, std::int64_t highest) = 0;

    /// Keeps servers from the store as long as the result lives, or longer, up to the end of this
    /// session. Null when a server has it.
    virtual std::shared_ptr<const void> keepServersAway() = 0;
    /// The same for others that move data to or from this store.
    virtual std::shared_ptr<const void> keepMoversAway() = 0;
};

/// Where the metadata stand in a move.
[[nodiscard]] std::optional<StoreMark> markOf(TableSession &session);
void setMark(TableSession &session, const StoreMark &mark);

/// True when there is no row in any table.
[[nodiscard]] bool isEmpty(TableSession &session);

} // namespace pelliko::server
