#include "moving/Ledger.h"

namespace pelliko::server
{
namespace
{

using Kind = Column::Kind;

} // namespace

std::vector<NeededBlob> neededBlobsAfter(TableSession &session, std::int64_t after,
                                         std::int64_t most)
{
    std::vector<NeededBlob> blobs;
    session.query("SELECT b.id, b.key, b.received,"
                  " (SELECT max(f.size) FROM files f WHERE f.blob = b.id) FROM blobs b"
                  " WHERE b.id > $1 AND NOT b.doomed AND b.received > 0 ORDER BY b.id LIMIT $2",
                  {after, most}, {Kind::integer, Kind::text, Kind::integer, Kind::integer},
                  [&](const TableRow &row) {
                      const bool whole = !isNull(row, 3) && numberIn(row, 2) >= numberIn(row, 3);
                      blobs.push_back({numberIn(row, 0), textIn(row, 1),
                                       static_cast<std::uint64_t>(numberIn(row, 2)), whole});
                  });
    return blobs;
}

void Ledger::make()
{
    m_session.change("CREATE TABLE IF NOT EXISTS migration_blobs"
                     " (id bigint PRIMARY KEY, key text NOT NULL, size bigint NOT NULL,"
                     " hash text NOT NULL)");
}

void Ledger::drop()
{
    m_session.change("DROP TABLE IF EXISTS migration_blobs");
}

std::map<std::int64_t, Ledger::Entry> Ledger::read(const std::string &condition,
                                                   const std::vector<Cell> &values)
{
    std::map<std::int64_t, Entry> entries;
    m_session.query("SELECT id, key, size, hash FROM migration_blobs WHERE " + condition, values,
                    {Kind::integer, Kind::text, Kind::integer, Kind::text},
                    [&](const TableRow &row) {
                        Entry entry{textIn(row, 1), {}};
                        if (!textIn(row, 3).empty())
                            entry.size = static_cast<std::uint64_t>(numberIn(row, 2));
                        entries.emplace(numberIn(row, 0), std::move(entry));
                    });
    return entries;
}

std::map<std::int64_t, Ledger::Entry> Ledger::between(std::int64_t first, std::int64_t last)
{
    return read("id >= $1 AND id <= $2", {first, last});
}

std::map<std::int64_t, Ledger::Entry> Ledger::after(std::int64_t after, std::int64_t most)
{
    return read("id > $1 ORDER BY id LIMIT $2", {after, most});
}

void Ledger::noteBegun(const NeededBlob &blob)
{
    noteCopied(blob, {});
}

void Ledger::noteCopied(const NeededBlob &blob, const std::string &hash)
{
    m_session.change("INSERT INTO migration_blobs (id, key, size, hash) VALUES ($1, $2, $3, $4)"
                     " ON CONFLICT (id) DO UPDATE SET size = excluded.size, hash = excluded.hash",
                     {blob.id, blob.key, static_cast<std::int64_t>(blob.received), hash});
}

void Ledger::forget(std::int64_t id)
{
    m_session.change("DELETE FROM migration_blobs WHERE id = $1", {id});
}

} // namespace pelliko::server
