#include "store/ShareRow.h"
#include "store/SqliteConnection.h"
#include "text/Secrets.h"

#include <utility>

namespace pelliko::server
{
namespace
{

using Outcome = CreateResult::Outcome;

} // namespace

std::optional<Seconds> SqliteMetadata::Connection::waitForLimit(const NewShare &share)
{
    const std::uint64_t wanted = announcedBytes(share);
    if (wanted == 0)
        return std::nullopt;
    std::vector<Use> uses;
    Query rows = query("SELECT at, bytes FROM usage WHERE account = ? AND at > ? ORDER BY at",
                       share.account, share.now - share.limitWindow);
    while (rows.next())
        uses.push_back({rows.integer(0), rows.size(1)});
    return waitForRoom(wanted, uses, {share.dailyLimit, share.limitWindow, share.now});
}

void SqliteMetadata::Connection::addFile(std::int64_t share, int position, const NewFile &file,
                                         std::optional<std::int64_t> blob)
{
    if (!blob) {
        query("INSERT INTO blobs (key) VALUES (?)", randomToken()).run();
        blob = database.getLastInsertRowid();
    }
    query("INSERT INTO files (share, position, name, type, size, upload, blob)"
          " VALUES (?, ?, ?, ?, ?, ?, ?)",
          share, position, file.name, file.type, file.size, randomToken(), *blob)
        .run();
}

std::int64_t SqliteMetadata::Connection::addShareRow(const NewShare &share)
{
    query("INSERT INTO shares (key, account, idempotency_key, state, created, deadline)"
          " VALUES (?, ?, ?, ?, ?, ?)",
          randomToken(), share.account, share.idempotencyKey,
          static_cast<int>(ShareState::uploading), share.now, share.deadline)
        .run();
    const std::int64_t id = database.getLastInsertRowid();
    int position = 0;
    for (const Recipient &recipient : share.recipients) {
        query("INSERT INTO recipients (share, position, number, ccc) VALUES (?, ?, ?, ?)", id,
              position++, recipient.number, recipient.callingCode)
            .run();
    }
    return id;
}

std::int64_t SqliteMetadata::Connection::copyShare(const NewShare &share, const ShareRow &source)
{
    const std::int64_t id = addShareRow(share);
    int position = 0;
    for (const FileRecord &file : source.record.files) {
        std::int64_t blob = 0;
        {
            Query row = query("SELECT id FROM blobs WHERE key = ?", file.blob);
            if (!row.next())
                throw StorageFailure(StorageFailure::Kind::broken, "a finished file has no blob");
            blob = row.integer(0);
        }
        addFile(id, position++, {file.name, file.type, file.size}, blob);
    }
    return id;
}

ShareRow SqliteMetadata::Connection::shareById(std::int64_t id, Seconds now)
{
    ShareRow share;
    {
        Query row = query("SELECT " PELLIKO_SHARE_COLUMNS " FROM shares s WHERE s.id = ?", id);
        if (!row.next())
            throw StorageFailure(StorageFailure::Kind::broken, "a share that was made is absent");
        share = shareRowOf(row, now);
    }
    addParts(share);
    return share;
}

std::optional<std::int64_t> SqliteMetadata::Connection::shareOfKey(const NewShare &share)
{
    if (!share.idempotencyKey)
        return std::nullopt;
    Query row = query("SELECT id FROM shares WHERE account = ? AND idempotency_key = ?",
                      share.account, *share.idempotencyKey);
    return row.next() ? std::optional(row.integer(0)) : std::nullopt;
}

CreateResult SqliteMetadata::Connection::reshare(const NewShare &share)
{
    std::optional<ShareRow> source = findShare(share.account, *share.reshareOf, share.now);
    if (!source)
        return {Outcome::sourceMissing, {}, 0};
    if (source->record.state == ShareState::uploading)
        return {Outcome::sourceUnfinished, {}, 0};
    if (source->record.state != ShareState::finished || hasLostFile(source->record))
        return {Outcome::sourceGone, {}, 0};
    return {Outcome::created, shareById(copyShare(share, *source), share.now).record, 0};
}

CreateResult SqliteMetadata::createShare(const NewShare &share)
{
    auto &db = *m_connection;
    return db.write([&]() -> CreateResult {
        if (const auto known = db.shareOfKey(share))
            return {Outcome::known, db.shareById(*known, share.now).record, 0};
        if (share.reshareOf)
            return db.reshare(share);
        if (const auto wait = db.waitForLimit(share))
            return {Outcome::overDailyLimit, {}, *wait};
        const std::int64_t id = db.addShareRow(share);
        int position = 0;
        for (const NewFile &file : share.files)
            db.addFile(id, position++, file, std::nullopt);
        db.query("INSERT INTO usage (account, share, at, bytes) VALUES (?, ?, ?, ?)", share.account,
                 id, share.now, announcedBytes(share))
            .run();
        return {Outcome::created, db.shareById(id, share.now).record, 0};
    });
}

} // namespace pelliko::server
