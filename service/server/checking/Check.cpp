#include "checking/Check.h"

#include <algorithm>
#include <utility>

namespace pelliko::server
{
namespace
{

using Kind = Column::Kind;

constexpr std::size_t atOnce = 1000;
/// A blob may be on its way from one form to another between two questions to the store.
constexpr int mostLooks = 3;

std::string sizeText(const std::optional<std::uint64_t> &size)
{
    return size ? std::to_string(*size) + " bytes" : "an unfinished upload";
}

} // namespace

std::vector<Check::Row> Check::rowsWhere(const std::string &condition,
                                         const std::vector<Cell> &values)
{
    std::vector<Row> rows;
    m_rows.query("SELECT b.id, b.key, b.received, b.doomed,"
                 " (SELECT max(f.size) FROM files f WHERE f.blob = b.id) FROM blobs b WHERE " +
                     condition,
                 values, {Kind::integer, Kind::text, Kind::integer, Kind::flag, Kind::integer},
                 [&](const TableRow &row) {
                     rows.push_back({numberIn(row, 0), textIn(row, 1),
                                     static_cast<std::uint64_t>(numberIn(row, 2)),
                                     numberIn(row, 3) != 0, std::nullopt});
                     if (!isNull(row, 4))
                         rows.back().size = static_cast<std::uint64_t>(numberIn(row, 4));
                 });
    return rows;
}

std::vector<Check::Row> Check::rowsAfter(const std::string &key)
{
    return rowsWhere("b.key > $1 ORDER BY b.key LIMIT $2",
                     {key, static_cast<std::int64_t>(atOnce)});
}

std::optional<Check::Row> Check::rowOf(const std::string &key)
{
    std::vector<Row> rows = rowsWhere("b.key = $1", {key});
    return rows.empty() ? std::nullopt : std::optional(std::move(rows.front()));
}

const StoredBlob *Check::nextStored()
{
    if (m_storedAt == m_stored.size() && !m_storedEnded) {
        m_stored = m_blobs.list(m_lastStored, atOnce);
        m_storedAt = 0;
        m_storedEnded = m_stored.empty();
        m_lastStored = m_storedEnded ? m_lastStored : m_stored.back().key;
    }
    return m_storedEnded ? nullptr : &m_stored[m_storedAt];
}

Check::Report Check::run()
{
    std::string last;
    for (auto rows = rowsAfter(last); !rows.empty(); rows = rowsAfter(last)) {
        for (const Row &row : rows) {
            const StoredBlob *stored = nextStored();
            for (; stored != nullptr && stored->key < row.key; stored = nextStored()) {
                takeForStray(*stored);
                ++m_storedAt;
            }
            const bool isThere = stored != nullptr && stored->key == row.key;
            compare(row, isThere ? stored : nullptr);
            if (isThere)
                ++m_storedAt;
            m_report.blobs += isThere ? 1 : 0;
            ++m_report.rows;
        }
        last = rows.back().key;
    }
    for (const StoredBlob *stored = nextStored(); stored != nullptr; stored = nextStored()) {
        takeForStray(*stored);
        ++m_storedAt;
    }
    confirmStrays();
    return m_report;
}

void Check::compare(const Row &row, const StoredBlob *stored)
{
    if (row.doomed)
        return;
    if (!row.size) {
        mendUnused(row);
        return;
    }
    if (row.received > 0 && (stored == nullptr || stored->size.value_or(0) < row.received))
        lookForLost(row);
    else if (stored != nullptr && stored->hasLeftovers && row.received == *row.size) {
        ++m_report.leftovers;
        m_tell("left over: parts or tails beside the whole file " + row.key);
        if (m_mendAt) {
            m_blobs.removeLeftovers(row.key);
            ++m_report.mended;
        }
    }
}

void Check::takeForStray(const StoredBlob &blob)
{
    ++m_report.blobs;
    m_strays.push_back(blob);
    if (m_strays.size() == atOnce)
        confirmStrays();
}

/// A row may have been made since the rows were read.
void Check::confirmStrays()
{
    std::vector<std::string> keys;
    for (const StoredBlob &blob : m_strays)
        keys.push_back(blob.key);
    const auto unknown = m_metadata.unknownBlobs(keys);
    // Without accounts the metadata may still have to be put back.
    const bool mend = m_mendAt && !unknown.empty() && m_metadata.hasAccounts();
    for (const StoredBlob &blob : std::exchange(m_strays, {})) {
        if (std::find(unknown.begin(), unknown.end(), blob.key) == unknown.end())
            continue;
        ++m_report.strays;
        m_tell("stray: nobody knows " + blob.key + ", " + sizeText(blob.size));
        if (mend) {
            m_blobs.remove(blob.key);
            ++m_report.mended;
        }
    }
}

void Check::lookForLost(const Row &row)
{
    std::optional<Row> now;
    std::uint64_t there = 0;
    for (int look = 0; look < mostLooks; ++look) {
        now = rowOf(row.key);
        if (!now || now->doomed)
            return;
        there = m_blobs.sizeOf(row.key).value_or(0);
        if (there >= now->received)
            return;
    }
    now = rowOf(row.key);
    if (!now || now->doomed)
        return;
    ++m_report.lost;
    tellLost(*now, there);
    if (m_mendAt && mendLost(*now))
        ++m_report.mended;
}

void Check::tellLost(const Row &row, std::uint64_t there)
{
    const std::string what =
        std::to_string(there) + " of " + std::to_string(row.received) + " bytes are there of ";
    m_rows.query("SELECT f.position, s.key, a.number, s.state FROM files f"
                 " JOIN shares s ON s.id = f.share JOIN accounts a ON a.id = s.account"
                 " WHERE f.blob = $1 ORDER BY f.share, f.position",
                 {row.id}, {Kind::integer, Kind::text, Kind::text, Kind::integer},
                 [&](const TableRow &file) {
                     const bool finished =
                         numberIn(file, 3) == static_cast<int>(ShareState::finished);
                     m_tell("lost: " + what + "file " + std::to_string(numberIn(file, 0) + 1) +
                            (finished ? " of the share " : " of the unfinished share ") +
                            textIn(file, 1) + " by " + textIn(file, 2));
                 });
}

/// Who is still uploading has the file and sends it again; whoever follows the link of a finished
/// share is told.
bool Check::mendLost(const Row &row)
{
    std::vector<std::pair<std::int64_t, std::string>> uploads;
    m_rows.query("SELECT s.account, f.upload FROM files f JOIN shares s ON s.id = f.share"
                 " WHERE f.blob = $1 AND s.state = 0",
                 {row.id}, {Kind::integer, Kind::text}, [&](const TableRow &file) {
                     uploads.emplace_back(numberIn(file, 0), textIn(file, 1));
                 });
    for (const auto &[account, upload] : uploads)
        m_metadata.resetUpload(account, upload, *m_mendAt);
    m_rows.begin();
    try {
        m_rows.change("UPDATE files SET blob = NULL WHERE blob = $1"
                      " AND share IN (SELECT id FROM shares WHERE state <> 0)",
                      {row.id});
        m_rows.change("UPDATE blobs SET doomed = true WHERE id = $1"
                      " AND NOT EXISTS (SELECT 1 FROM files f WHERE f.blob = blobs.id)",
                      {row.id});
        m_rows.commit();
    } catch (...) {
        m_rows.rollBack();
        throw;
    }
    const auto now = rowOf(row.key);
    return !now || now->doomed;
}

void Check::mendUnused(const Row &row)
{
    ++m_report.unused;
    m_tell("unused: no file has " + row.key);
    if (m_mendAt && m_rows.change("UPDATE blobs SET doomed = true WHERE id = $1"
                                  " AND NOT EXISTS (SELECT 1 FROM files f WHERE f.blob = blobs.id)",
                                  {row.id}) == 1)
        ++m_report.mended;
}

} // namespace pelliko::server
