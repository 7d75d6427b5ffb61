#include "store/PostgresLayout.h"
#include "store/PostgresMetadata.h"
#include "store/PostgresRows.h"
#include "text/Secrets.h"

#include <map>
#include <utility>

namespace pelliko::server
{
namespace
{

/// What one notification carries at most is 8000 bytes: so many numbers always fit.
constexpr std::size_t numbersAtOnce = 300;

/// Files and then recipients of the shares that fit the condition, as addPart reads them.
#define PELLIKO_PARTS(condition)                                                                   \
    "SELECT f.share, f.position, 0 AS kind, f.name, f.type, f.size,"                               \
    " coalesce(b.received, 0) AS received, f.upload, coalesce(b.key, '') AS blob"                  \
    " FROM files f LEFT JOIN blobs b ON b.id = f.blob WHERE f.share " condition                    \
    " UNION ALL SELECT r.share, r.position, 1, r.number, r.ccc, 0, 0, '', ''"                      \
    " FROM recipients r WHERE r.share " condition

/// One statement, for nothing is asked more often and each further one is a round trip.
constexpr const char *linkWithParts =
    "WITH link AS MATERIALIZED (SELECT " PELLIKO_SHARE_COLUMNS ", a.number FROM shares s"
    " JOIN accounts a ON a.id = s.account WHERE s.link_hash = $1)"
    " SELECT link.*, parts.* FROM link LEFT JOIN LATERAL (" PELLIKO_PARTS(
        "= link.id") ") parts ON true ORDER BY parts.kind, parts.position";
constexpr int firstOfParts = 6;

/// What a row of PELLIKO_PARTS tells, whose columns begin at `first`.
void addPart(const PostgresRows &row, int first, ShareRecord &share)
{
    const std::string name = row.text(first + 3);
    const std::string type = row.text(first + 4);
    if (row.integer(first + 2) == 0)
        share.files.push_back({name, type, row.size(first + 5), row.size(first + 6),
                               row.text(first + 7), row.text(first + 8)});
    else
        share.recipients.push_back({name, type});
}

std::vector<std::int64_t> idsOf(const std::vector<ShareRow> &shares)
{
    std::vector<std::int64_t> ids;
    ids.reserve(shares.size());
    for (const ShareRow &share : shares)
        ids.push_back(share.id);
    return ids;
}

} // namespace

void addParts(PostgresConnection &db, std::vector<ShareRow> &shares)
{
    if (shares.empty())
        return;
    std::map<std::int64_t, ShareRecord *> byId;
    for (ShareRow &share : shares)
        byId[share.id] = &share.record;
    const std::vector<std::int64_t> ids = idsOf(shares);
    PostgresRows parts =
        db.query(PELLIKO_PARTS("= ANY ($1)") " ORDER BY share, kind, position", ids);
    while (parts.next())
        addPart(parts, 0, *byId.at(parts.integer(0)));
}

void addParts(PostgresConnection &db, ShareRow &share)
{
    std::vector<ShareRow> one{std::move(share)};
    addParts(db, one);
    share = std::move(one.front());
}

std::optional<ShareRow> findShareRow(PostgresConnection &db, std::int64_t account,
                                     const std::string &key, Seconds now, bool lock)
{
    // Also spares the database what is no text.
    if (!looksLikeToken(key))
        return std::nullopt;
    PostgresRows row = lock ? db.query("SELECT " PELLIKO_SHARE_COLUMNS " FROM shares s"
                                       " WHERE s.account = $1 AND s.key = $2 FOR NO KEY UPDATE",
                                       account, key)
                            : db.query("SELECT " PELLIKO_SHARE_COLUMNS " FROM shares s"
                                       " WHERE s.account = $1 AND s.key = $2",
                                       account, key);
    if (!row.next())
        return std::nullopt;
    return shareRowOf(row, now);
}

ShareRow shareById(PostgresConnection &db, std::int64_t id, Seconds now)
{
    PostgresRows row =
        db.query("SELECT " PELLIKO_SHARE_COLUMNS " FROM shares s WHERE s.id = $1", id);
    if (!row.next())
        throw StorageFailure(StorageFailure::Kind::broken, "a share that was made is absent");
    ShareRow share = shareRowOf(row, now);
    addParts(db, share);
    return share;
}

void tellServers(PostgresConnection &db, const std::string &word,
                 const std::vector<std::int64_t> &numbers)
{
    std::string text = word;
    std::size_t count = 0;
    for (const std::int64_t number : numbers) {
        text += " " + std::to_string(number);
        if (++count % numbersAtOnce == 0)
            db.query("SELECT pg_notify('" PELLIKO_CHANNEL "', $1)", std::exchange(text, word));
    }
    if (text != word || numbers.empty())
        db.query("SELECT pg_notify('" PELLIKO_CHANNEL "', $1)", text);
}

std::vector<std::string> endShare(PostgresConnection &db, ShareRow &share, ShareState state,
                                  Seconds now)
{
    // Of two shares that end at once, each with the other's last file, one has to see the other's
    // end, and no offset grows while the bytes that came are counted.
    PostgresRows locked = db.query("SELECT id, key FROM blobs WHERE id IN"
                                   " (SELECT blob FROM files WHERE share = $1)"
                                   " ORDER BY id FOR UPDATE",
                                   share.id);
    std::vector<std::int64_t> ids;
    std::vector<std::string> keys;
    while (locked.next()) {
        ids.push_back(locked.integer(0));
        keys.push_back(locked.text(1));
    }
    // Bytes that were announced and never came do not count against the account.
    if (share.stored == ShareState::uploading) {
        db.query("UPDATE usage SET bytes = (SELECT coalesce(sum(b.received), 0) FROM files f"
                 " JOIN blobs b ON b.id = f.blob WHERE f.share = $1) WHERE share = $1",
                 share.id);
        if (!ids.empty())
            tellServers(db, "stop", ids);
    }
    db.query("UPDATE blobs SET doomed = true WHERE id = ANY ($2)"
             " AND NOT EXISTS (SELECT 1 FROM files f WHERE f.blob = blobs.id AND f.share <> $1)",
             share.id, ids);
    db.query("UPDATE files SET blob = NULL WHERE share = $1", share.id);
    db.query("UPDATE pushes SET state = $2, token = NULL WHERE share = $1 AND state = 0", share.id,
             static_cast<int>(PushState::dropped));
    db.query("UPDATE shares SET state = $2, ended = $3 WHERE id = $1", share.id,
             static_cast<int>(state), now);
    return keys;
}

std::optional<ShareRecord> PostgresMetadata::findShare(std::int64_t account, const std::string &key,
                                                       Seconds now)
{
    return m_pool->read([&](PostgresConnection &db) -> std::optional<ShareRecord> {
        auto share = findShareRow(db, account, key, now, false);
        if (!share)
            return std::nullopt;
        addParts(db, *share);
        return std::move(share->record);
    });
}

std::vector<ShareRecord> PostgresMetadata::listShares(std::int64_t account, Seconds now)
{
    return m_pool->read([&](PostgresConnection &db) {
        PostgresRows rows = db.query("SELECT " PELLIKO_SHARE_COLUMNS
                                     " FROM shares s WHERE s.account = $1 ORDER BY s.id DESC",
                                     account);
        std::vector<ShareRow> shares;
        while (rows.next())
            shares.push_back(shareRowOf(rows, now));
        addParts(db, shares);
        std::vector<ShareRecord> records;
        records.reserve(shares.size());
        for (ShareRow &share : shares)
            records.push_back(std::move(share.record));
        return records;
    });
}

std::optional<std::vector<std::string>>
PostgresMetadata::withdrawShare(std::int64_t account, const std::string &key, Seconds now)
{
    return m_pool->write([&](PostgresConnection &db) -> std::optional<std::vector<std::string>> {
        auto share = findShareRow(db, account, key, now, true);
        if (!share)
            return std::nullopt;
        const ShareState state = share->record.state;
        if (state != ShareState::uploading && state != ShareState::finished)
            return std::vector<std::string>{};
        return endShare(db, *share, ShareState::withdrawn, now);
    });
}

std::optional<LinkRecord> PostgresMetadata::findLink(const std::string &linkHash, Seconds now)
{
    return m_pool->single([&](PostgresConnection &db) -> std::optional<LinkRecord> {
        PostgresRows rows = db.query(linkWithParts, Bytes{linkHash});
        std::optional<LinkRecord> link;
        while (rows.next()) {
            if (!link)
                link = LinkRecord{rows.text(5), shareRowOf(rows, now).record};
            if (!rows.isNull(firstOfParts))
                addPart(rows, firstOfParts, link->share);
        }
        return link;
    });
}

} // namespace pelliko::server
