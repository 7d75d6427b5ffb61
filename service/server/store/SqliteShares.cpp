#include "store/ShareRow.h"
#include "store/SqliteConnection.h"

#include <utility>

namespace pelliko::server
{

void SqliteMetadata::Connection::addParts(ShareRow &share)
{
    Query files = query("SELECT f.name, f.type, f.size, f.upload, coalesce(b.key, ''),"
                        " coalesce(b.received, 0) FROM files f LEFT JOIN blobs b ON b.id = f.blob"
                        " WHERE f.share = ? ORDER BY f.position",
                        share.id);
    while (files.next()) {
        share.record.files.push_back({files.text(0), files.text(1), files.size(2), files.size(5),
                                      files.text(3), files.text(4)});
    }
    Query recipients =
        query("SELECT number, ccc FROM recipients WHERE share = ? ORDER BY position", share.id);
    while (recipients.next())
        share.record.recipients.push_back({recipients.text(0), recipients.text(1)});
}

std::optional<ShareRow> SqliteMetadata::Connection::findShare(std::int64_t account,
                                                              const std::string &key, Seconds now)
{
    std::optional<ShareRow> share;
    {
        Query row = query("SELECT " PELLIKO_SHARE_COLUMNS
                          " FROM shares s WHERE s.account = ? AND s.key = ?",
                          account, key);
        if (!row.next())
            return std::nullopt;
        share = shareRowOf(row, now);
    }
    addParts(*share);
    return share;
}

std::optional<ShareRecord> SqliteMetadata::findShare(std::int64_t account, const std::string &key,
                                                     Seconds now)
{
    auto &db = *m_connection;
    return db.read([&]() -> std::optional<ShareRecord> {
        std::optional<ShareRow> share = db.findShare(account, key, now);
        if (!share)
            return std::nullopt;
        return std::move(share->record);
    });
}

std::vector<ShareRecord> SqliteMetadata::listShares(std::int64_t account, Seconds now)
{
    auto &db = *m_connection;
    return db.read([&] {
        std::vector<ShareRecord> shares;
        Query rows = db.query("SELECT " PELLIKO_SHARE_COLUMNS
                              " FROM shares s WHERE s.account = ? ORDER BY s.id DESC",
                              account);
        while (rows.next()) {
            ShareRow share = shareRowOf(rows, now);
            db.addParts(share);
            shares.push_back(std::move(share.record));
        }
        return shares;
    });
}

FinishResult SqliteMetadata::finishShare(std::int64_t account, const std::string &key,
                                         const std::string &linkHash, Seconds now, Seconds deadline)
{
    using Outcome = FinishResult::Outcome;
    auto &db = *m_connection;
    return db.write([&]() -> FinishResult {
        std::optional<ShareRow> share = db.findShare(account, key, now);
        if (!share)
            return {};
        ShareRecord &record = share->record;
        if (const auto refused = markFinished(record, deadline))
            return {*refused, std::move(record), {}, {}};
        db.query("UPDATE shares SET state = ?, deadline = ?, link_hash = ? WHERE id = ?",
                 static_cast<int>(record.state), record.deadline, Bytes{linkHash}, share->id)
            .run();
        FinishResult result{Outcome::finished, {}, {}, {}};
        db.tellRecipients(*share, result);
        result.share = std::move(record);
        return result;
    });
}

std::vector<std::string> SqliteMetadata::Connection::endShare(const ShareRow &share,
                                                              ShareState state, Seconds now)
{
    // Bytes that were announced and never came do not count against the account.
    if (share.stored == ShareState::uploading) {
        query("UPDATE usage SET bytes = (SELECT coalesce(sum(b.received), 0) FROM files f"
              " JOIN blobs b ON b.id = f.blob WHERE f.share = ?1) WHERE share = ?1",
              share.id)
            .run();
    }
    query("UPDATE blobs SET doomed = 1 WHERE id IN (SELECT blob FROM files WHERE share = ?1)"
          " AND NOT EXISTS (SELECT 1 FROM files f WHERE f.blob = blobs.id AND f.share <> ?1)",
          share.id)
        .run();
    query("UPDATE files SET blob = NULL WHERE share = ?", share.id).run();
    dropPushes(share.id);
    query("UPDATE shares SET state = ?, ended = ? WHERE id = ?", static_cast<int>(state), now,
          share.id)
        .run();
    std::vector<std::string> blobs;
    for (const FileRecord &file : share.record.files) {
        if (!file.blob.empty())
            blobs.push_back(file.blob);
    }
    return blobs;
}

std::optional<std::vector<std::string>>
SqliteMetadata::withdrawShare(std::int64_t account, const std::string &key, Seconds now)
{
    auto &db = *m_connection;
    return db.write([&]() -> std::optional<std::vector<std::string>> {
        std::optional<ShareRow> share = db.findShare(account, key, now);
        if (!share)
            return std::nullopt;
        const ShareState state = share->record.state;
        if (state != ShareState::uploading && state != ShareState::finished)
            return std::vector<std::string>{};
        return db.endShare(*share, ShareState::withdrawn, now);
    });
}

std::optional<LinkRecord> SqliteMetadata::findLink(const std::string &linkHash, Seconds now)
{
    auto &db = *m_connection;
    return db.read([&]() -> std::optional<LinkRecord> {
        ShareRow share;
        std::string sender;
        {
            Query row = db.query("SELECT " PELLIKO_SHARE_COLUMNS ", a.number FROM shares s"
                                 " JOIN accounts a ON a.id = s.account WHERE s.link_hash = ?",
                                 Bytes{linkHash});
            if (!row.next())
                return std::nullopt;
            share = shareRowOf(row, now);
            sender = row.text(5);
        }
        db.addParts(share);
        return LinkRecord{std::move(sender), std::move(share.record)};
    });
}

} // namespace pelliko::server
