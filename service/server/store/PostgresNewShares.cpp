#include "store/PostgresMetadata.h"
#include "store/PostgresRows.h"
#include "text/Secrets.h"

#include <utility>

namespace pelliko::server
{
namespace
{

using Outcome = CreateResult::Outcome;

/// Seconds until the share fits the account's limit; nothing when it fits now.
std::optional<Seconds> waitForLimit(PostgresConnection &db, const NewShare &share)
{
    const std::uint64_t wanted = announcedBytes(share);
    if (wanted == 0)
        return std::nullopt;
    PostgresRows rows = db.query("SELECT at, bytes FROM usage"
                                 " WHERE account = $1 AND at > $2 ORDER BY at",
                                 share.account, share.now - share.limitWindow);
    std::vector<Use> uses;
    while (rows.next())
        uses.push_back({rows.integer(0), rows.size(1)});
    return waitForRoom(wanted, uses, {share.dailyLimit, share.limitWindow, share.now});
}

void addRecipients(PostgresConnection &db, std::int64_t share,
                   const std::vector<Recipient> &recipients)
{
    std::vector<std::string> numbers;
    std::vector<std::string> codes;
    for (const Recipient &recipient : recipients) {
        numbers.push_back(recipient.number);
        codes.push_back(recipient.callingCode);
    }
    db.query("INSERT INTO recipients (share, position, number, ccc)"
             " SELECT $1, r.position - 1, r.number, r.ccc"
             " FROM unnest($2, $3) WITH ORDINALITY AS r (number, ccc, position)",
             share, numbers, codes);
}

std::int64_t addShareRow(PostgresConnection &db, const NewShare &share)
{
    PostgresRows row = db.query("INSERT INTO shares"
                                " (key, account, idempotency_key, state, created, deadline)"
                                " VALUES ($1, $2, $3, $4, $5, $6) RETURNING id",
                                randomToken(), share.account, share.idempotencyKey,
                                static_cast<int>(ShareState::uploading), share.now, share.deadline);
    const std::int64_t id = row.next() ? row.integer(0) : 0;
    addRecipients(db, id, share.recipients);
    return id;
}

void addFiles(PostgresConnection &db, std::int64_t share, const std::vector<NewFile> &files)
{
    std::vector<std::string> names;
    std::vector<std::string> types;
    std::vector<std::int64_t> sizes;
    std::vector<std::string> uploads;
    std::vector<std::string> keys;
    for (const NewFile &file : files) {
        names.push_back(file.name);
        types.push_back(file.type);
        sizes.push_back(static_cast<std::int64_t>(file.size));
        uploads.push_back(randomToken());
        keys.push_back(randomToken());
    }
    db.query("WITH made AS (INSERT INTO blobs (key) SELECT unnest($6) RETURNING id, key)"
             " INSERT INTO files (share, position, name, type, size, upload, blob)"
             " SELECT $1, f.position - 1, f.name, f.type, f.size, f.upload, made.id"
             " FROM unnest($2, $3, $4, $5, $6) WITH ORDINALITY"
             " AS f (name, type, size, upload, key, position) JOIN made USING (key)",
             share, names, types, sizes, uploads, keys);
}

/// The new share's files have the bytes of the source's.
void copyFiles(PostgresConnection &db, std::int64_t share, const ShareRow &source)
{
    std::vector<std::string> uploads;
    for (std::size_t count = source.record.files.size(); count > 0; --count)
        uploads.push_back(randomToken());
    const int copied =
        db.query("INSERT INTO files (share, position, name, type, size, upload, blob)"
                 " SELECT $1, position, name, type, size, ($3)[position + 1], blob"
                 " FROM files WHERE share = $2 AND blob IS NOT NULL",
                 share, source.id, uploads)
            .changed();
    if (static_cast<std::size_t>(copied) != uploads.size())
        throw StorageFailure(StorageFailure::Kind::broken, "a finished file has no blob");
}

std::optional<std::int64_t> shareOfKey(PostgresConnection &db, const NewShare &share)
{
    if (!share.idempotencyKey)
        return std::nullopt;
    PostgresRows row = db.query("SELECT id FROM shares WHERE account = $1 AND idempotency_key = $2",
                                share.account, *share.idempotencyKey);
    return row.next() ? std::optional(row.integer(0)) : std::nullopt;
}

CreateResult reshare(PostgresConnection &db, const NewShare &share, std::optional<ShareRow> &source)
{
    if (!source)
        return {Outcome::sourceMissing, {}, 0};
    if (source->record.state == ShareState::uploading)
        return {Outcome::sourceUnfinished, {}, 0};
    if (source->record.state != ShareState::finished)
        return {Outcome::sourceGone, {}, 0};
    addParts(db, *source);
    if (hasLostFile(source->record))
        return {Outcome::sourceGone, {}, 0};
    const std::int64_t id = addShareRow(db, share);
    copyFiles(db, id, *source);
    return {Outcome::created, shareById(db, id, share.now).record, 0};
}

CreateResult create(PostgresConnection &db, const NewShare &share)
{
    if (const auto wait = waitForLimit(db, share))
        return {Outcome::overDailyLimit, {}, *wait};
    const std::int64_t id = addShareRow(db, share);
    addFiles(db, id, share.files);
    db.query("INSERT INTO usage (account, share, at, bytes) VALUES ($1, $2, $3, $4)", share.account,
             id, share.now, announcedBytes(share));
    return {Outcome::created, shareById(db, id, share.now).record, 0};
}

} // namespace

CreateResult PostgresMetadata::createShare(const NewShare &share)
{
    return m_pool->write([&](PostgresConnection &db) -> CreateResult {
        // Shares are locked before accounts everywhere.
        std::optional<ShareRow> source;
        if (share.reshareOf)
            source = findShareRow(db, share.account, *share.reshareOf, share.now, true);
        lockAccount(db, share.account);
        if (const auto known = shareOfKey(db, share))
            return {Outcome::known, shareById(db, *known, share.now).record, 0};
        return share.reshareOf ? reshare(db, share, source) : create(db, share);
    });
}

} // namespace pelliko::server
