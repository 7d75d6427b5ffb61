#include "store/ShareRow.h"
#include "store/SqliteConnection.h"
#include "text/Secrets.h"

#include <utility>

namespace pelliko::server
{
namespace
{

/// Enough for one round of sweeping; the next round takes the rest.
constexpr int doomedAtOnce = 256;

} // namespace

std::optional<UploadRecord> SqliteMetadata::findUpload(std::int64_t account,
                                                       const std::string &upload, Seconds now)
{
    auto &db = *m_connection;
    return db.read([&]() -> std::optional<UploadRecord> {
        Query row =
            db.query("SELECT " PELLIKO_UPLOAD_COLUMNS " WHERE f.upload = ? AND s.account = ?",
                     upload, account);
        if (!row.next())
            return std::nullopt;
        return uploadOf(row, now);
    });
}

bool SqliteMetadata::recordOffset(const std::string &blob, std::uint64_t offset,
                                  std::int64_t /*right*/)
{
    auto &db = *m_connection;
    return db.write([&] {
        return db.query("UPDATE blobs SET received = max(received, ?) WHERE key = ? AND doomed = 0",
                        offset, blob)
                   .run() == 1;
    });
}

bool SqliteMetadata::resetUpload(std::int64_t account, const std::string &upload, Seconds now)
{
    auto &db = *m_connection;
    return db.write([&] {
        std::int64_t former = 0;
        std::uint64_t received = 0;
        {
            Query row = db.query("SELECT f.blob, b.received FROM files f"
                                 " JOIN shares s ON s.id = f.share JOIN blobs b ON b.id = f.blob"
                                 " WHERE f.upload = ? AND s.account = ? AND s.state = 0"
                                 " AND s.deadline > ?",
                                 upload, account, now);
            if (!row.next())
                return false;
            former = row.integer(0);
            received = row.size(1);
        }
        db.query("INSERT INTO blobs (key) VALUES (?)", randomToken()).run();
        db.query("UPDATE files SET blob = ? WHERE upload = ?",
                 std::int64_t{db.database.getLastInsertRowid()}, upload)
            .run();
        db.query("UPDATE blobs SET doomed = 1 WHERE id = ?"
                 " AND NOT EXISTS (SELECT 1 FROM files f WHERE f.blob = blobs.id)",
                 former)
            .run();
        // Dropped bytes were sent all the same: without this, dropping would lift the daily limit.
        db.query("INSERT INTO usage (account, at, bytes) VALUES (?, ?, ?)", account, now, received)
            .run();
        return true;
    });
}

std::vector<std::string> SqliteMetadata::expireShares(Seconds now)
{
    auto &db = *m_connection;
    return db.write([&] {
        std::vector<std::int64_t> due;
        {
            Query rows =
                db.query("SELECT id FROM shares WHERE state IN (0, 1) AND deadline <= ?", now);
            while (rows.next())
                due.push_back(rows.integer(0));
        }
        std::vector<std::string> blobs;
        for (std::int64_t id : due) {
            for (std::string &blob : db.endShare(db.shareById(id, now), ShareState::expired, now))
                blobs.push_back(std::move(blob));
        }
        return blobs;
    });
}

std::optional<Seconds> SqliteMetadata::nextDeadline()
{
    auto &db = *m_connection;
    return db.read([&]() -> std::optional<Seconds> {
        Query row = db.query("SELECT min(deadline) FROM shares WHERE state IN (0, 1)");
        if (!row.next() || row.isNull(0))
            return std::nullopt;
        return row.integer(0);
    });
}

void SqliteMetadata::forgetEnded(Seconds ended, Seconds used)
{
    auto &db = *m_connection;
    db.write([&] {
        db.query("DELETE FROM shares WHERE ended <= ?", ended).run();
        db.query("DELETE FROM usage WHERE at <= ?", used).run();
        db.query("DELETE FROM questions WHERE at <= ?", used).run();
    });
}

std::optional<Seconds> SqliteMetadata::earliestEnd()
{
    auto &db = *m_connection;
    return db.read([&]() -> std::optional<Seconds> {
        Query row = db.query("SELECT min(ended) FROM shares WHERE ended IS NOT NULL");
        if (!row.next() || row.isNull(0))
            return std::nullopt;
        return row.integer(0);
    });
}

std::vector<std::string> SqliteMetadata::unknownBlobs(const std::vector<std::string> &keys)
{
    auto &db = *m_connection;
    return db.read([&] {
        std::vector<std::string> unknown;
        for (const std::string &key : keys) {
            if (!db.query("SELECT 1 FROM blobs WHERE key = ?", key).next())
                unknown.push_back(key);
        }
        return unknown;
    });
}

std::vector<std::string> SqliteMetadata::doomedBlobs()
{
    auto &db = *m_connection;
    return db.read([&] {
        std::vector<std::string> keys;
        Query rows =
            db.query("SELECT key FROM blobs WHERE doomed = 1 ORDER BY id LIMIT ?", doomedAtOnce);
        while (rows.next())
            keys.push_back(rows.text(0));
        return keys;
    });
}

void SqliteMetadata::forgetBlob(const std::string &blob)
{
    auto &db = *m_connection;
    db.write([&] { db.query("DELETE FROM blobs WHERE key = ? AND doomed = 1", blob).run(); });
}

} // namespace pelliko::server
