#include "store/PostgresMetadata.h"
#include "store/PostgresRows.h"
#include "text/Secrets.h"

#include <iterator>
#include <utility>

namespace pelliko::server
{
namespace
{

// How much is swept at once stands in the statements themselves: a number that comes later would
// not lead to the indexes, and what takes everything might never end.

/// Runs a statement that deletes what is old enough in pieces, until nothing is left.
void deleteUpTo(PostgresPool &pool, const char *piece, Seconds end)
{
    int deleted = 1;
    while (deleted > 0) {
        deleted =
            pool.single([&](PostgresConnection &db) { return db.query(piece, end).changed(); });
    }
}

std::optional<Seconds> secondsOf(PostgresRows row)
{
    if (!row.next() || row.isNull(0))
        return std::nullopt;
    return row.integer(0);
}

/// Ends some shares whose deadline has come; their blobs' keys, or nothing when there were none.
std::optional<std::vector<std::string>> expireSome(PostgresConnection &db, Seconds now)
{
    PostgresRows rows = db.query("SELECT " PELLIKO_SHARE_COLUMNS " FROM shares s"
                                 " WHERE s.state IN (0, 1) AND s.deadline <= $1"
                                 " ORDER BY s.deadline, s.id LIMIT 64 FOR NO KEY UPDATE",
                                 now);
    std::optional<std::vector<std::string>> blobs;
    while (rows.next()) {
        ShareRow share = shareRowOf(rows, now);
        if (!blobs)
            blobs.emplace();
        for (std::string &blob : endShare(db, share, ShareState::expired, now))
            blobs->push_back(std::move(blob));
    }
    return blobs;
}

} // namespace

std::optional<UploadRecord> PostgresMetadata::findUpload(std::int64_t account,
                                                         const std::string &upload, Seconds now)
{
    // Also spares the database what is no text.
    if (!looksLikeToken(upload))
        return std::nullopt;
    return m_pool->single([&](PostgresConnection &db) -> std::optional<UploadRecord> {
        PostgresRows row =
            db.query("SELECT " PELLIKO_UPLOAD_COLUMNS " WHERE f.upload = $1 AND s.account = $2",
                     upload, account);
        if (!row.next())
            return std::nullopt;
        return uploadOf(row, now);
    });
}

bool PostgresMetadata::recordOffset(const std::string &blob, std::uint64_t offset,
                                    std::int64_t right)
{
    return m_pool->single([&](PostgresConnection &db) {
        return db.query("UPDATE blobs SET received = greatest(received, $2)"
                        " WHERE key = $1 AND NOT doomed AND ($3 = 0 OR writer = $3)",
                        blob, offset, right)
                   .changed() == 1;
    });
}

bool PostgresMetadata::resetUpload(std::int64_t account, const std::string &upload, Seconds now)
{
    return m_pool->write([&](PostgresConnection &db) {
        PostgresRows row = db.query("SELECT b.id, b.received FROM files f"
                                    " JOIN shares s ON s.id = f.share JOIN blobs b ON b.id = f.blob"
                                    " WHERE f.upload = $1 AND s.account = $2 AND s.state = 0"
                                    " AND s.deadline > $3 FOR NO KEY UPDATE OF s, f, b",
                                    upload, account, now);
        if (!row.next())
            return false;
        const std::int64_t former = row.integer(0);
        db.query("WITH made AS (INSERT INTO blobs (key) VALUES ($1) RETURNING id)"
                 " UPDATE files SET blob = made.id FROM made WHERE upload = $2",
                 randomToken(), upload);
        db.query("UPDATE blobs SET doomed = true WHERE id = $1"
                 " AND NOT EXISTS (SELECT 1 FROM files f WHERE f.blob = blobs.id)",
                 former);
        // Dropped bytes were sent all the same: without this, dropping would lift the daily limit.
        db.query("INSERT INTO usage (account, at, bytes) VALUES ($1, $2, $3)", account, now,
                 row.size(1));
        return true;
    });
}

std::vector<std::string> PostgresMetadata::expireShares(Seconds now)
{
    std::vector<std::string> all;
    while (true) {
        auto some = m_pool->write([&](PostgresConnection &db) { return expireSome(db, now); });
        if (!some)
            return all;
        std::move(some->begin(), some->end(), std::back_inserter(all));
    }
}

std::optional<Seconds> PostgresMetadata::nextDeadline()
{
    return m_pool->single([](PostgresConnection &db) {
        return secondsOf(db.query("SELECT min(deadline) FROM shares WHERE state IN (0, 1)"));
    });
}

void PostgresMetadata::forgetEnded(Seconds ended, Seconds used)
{
    deleteUpTo(*m_pool,
               "DELETE FROM shares WHERE id = ANY (ARRAY("
               "SELECT id FROM shares WHERE ended <= $1 ORDER BY ended LIMIT 1000))",
               ended);
    deleteUpTo(*m_pool,
               "DELETE FROM usage WHERE ctid = ANY (ARRAY("
               "SELECT ctid FROM usage WHERE at <= $1 ORDER BY at LIMIT 5000))",
               used);
    deleteUpTo(*m_pool,
               "DELETE FROM questions WHERE ctid = ANY (ARRAY("
               "SELECT ctid FROM questions WHERE at <= $1 ORDER BY at LIMIT 5000))",
               used);
}

std::optional<Seconds> PostgresMetadata::earliestEnd()
{
    return m_pool->single([](PostgresConnection &db) {
        return secondsOf(db.query("SELECT min(ended) FROM shares WHERE ended IS NOT NULL"));
    });
}

std::vector<std::string> PostgresMetadata::unknownBlobs(const std::vector<std::string> &keys)
{
    return m_pool->single([&](PostgresConnection &db) {
        PostgresRows rows = db.query("SELECT k FROM unnest($1) AS k WHERE NOT EXISTS"
                                     " (SELECT 1 FROM blobs b WHERE b.key = k)",
                                     keys);
        std::vector<std::string> unknown;
        while (rows.next())
            unknown.push_back(rows.text(0));
        return unknown;
    });
}

std::vector<std::string> PostgresMetadata::doomedBlobs()
{
    return m_pool->single([](PostgresConnection &db) {
        std::vector<std::string> keys;
        PostgresRows rows = db.query("SELECT key FROM blobs WHERE doomed ORDER BY id LIMIT 256");
        while (rows.next())
            keys.push_back(rows.text(0));
        return keys;
    });
}

void PostgresMetadata::forgetBlob(const std::string &blob)
{
    m_pool->single([&](PostgresConnection &db) {
        db.query("DELETE FROM blobs WHERE key = $1 AND doomed", blob);
    });
}

} // namespace pelliko::server
