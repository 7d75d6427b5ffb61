#include "store/PostgresMetadata.h"
#include "store/PostgresRows.h"
#include "text/Secrets.h"

#include <utility>

namespace pelliko::server
{
namespace
{

using Outcome = CreateResult::Outcome;

/// What is known of the account that decides on a new share.
struct Before {
    /// The share that was made with the same idempotency key.
    std::optional<std::int64_t> known;
    /// Within the limit's window, oldest first.
    std::vector<Use> uses;
};

/// Both in one statement: a share is made in few round trips. After lockAccount.
Before lookBefore(PostgresConnection &db, const NewShare &share)
{
    // What is shared again counts no bytes.
    const Seconds since = share.reshareOf ? share.now : share.now - share.limitWindow;
    PostgresRows rows =
        db.query("SELECT 0 AS kind, id AS at, 0 AS bytes FROM shares"
                 " WHERE account = $1 AND idempotency_key = $2"
                 " UNION ALL SELECT 1, at, bytes FROM usage WHERE account = $1 AND at > $3"
                 " ORDER BY kind, at",
                 share.account, share.idempotencyKey, since);
    Before before;
    while (rows.next()) {
        if (rows.integer(0) == 0)
            before.known = rows.integer(1);
        else
            before.uses.push_back({rows.integer(1), rows.size(2)});
    }
    return before;
}

/// A share's row as `made`, and its recipients; takes $1 to $8.
#define PELLIKO_NEW_SHARE                                                                          \
    "WITH made AS (INSERT INTO shares"                                                             \
    " (key, account, idempotency_key, state, created, deadline)"                                   \
    " VALUES ($1, $2, $3, $4, $5, $6) RETURNING id),"                                              \
    " addressed AS (INSERT INTO recipients (share, position, number, ccc)"                         \
    " SELECT made.id, r.position - 1, r.number, r.ccc"                                             \
    " FROM made, unnest($7, $8) WITH ORDINALITY AS r (number, ccc, position))"

/// What PELLIKO_NEW_SHARE takes of recipients.
struct RecipientColumns {
    explicit RecipientColumns(const std::vector<Recipient> &recipients)
    {
        for (const Recipient &recipient : recipients) {
            numbers.push_back(recipient.number);
            codes.push_back(recipient.callingCode);
        }
    }
    std::vector<std::string> numbers;
    std::vector<std::string> codes;
};

/// What the statement that adds files takes of them.
struct FileColumns {
    explicit FileColumns(const std::vector<FileRecord> &files)
    {
        for (const FileRecord &file : files) {
            names.push_back(file.name);
            types.push_back(file.type);
            sizes.push_back(static_cast<std::int64_t>(file.size));
            uploads.push_back(file.upload);
            blobs.push_back(file.blob);
        }
    }
    std::vector<std::string> names;
    std::vector<std::string> types;
    std::vector<std::int64_t> sizes;
    std::vector<std::string> uploads;
    std::vector<std::string> blobs;
};

/// The share as it is going to be, with the names that it gets.
ShareRecord recordOf(const NewShare &share)
{
    ShareRecord record{randomToken(),
                       stateAt(ShareState::uploading, share.deadline, share.now),
                       share.now,
                       share.deadline,
                       {},
                       share.recipients};
    for (const NewFile &file : share.files)
        record.files.push_back({file.name, file.type, file.size, 0, randomToken(), randomToken()});
    return record;
}

/// Makes the share with empty blobs for its files, and counts their bytes.
void addShare(PostgresConnection &db, const NewShare &share, const ShareRecord &record)
{
    const RecipientColumns recipients(record.recipients);
    const FileColumns files(record.files);
    const int added =
        db.query(PELLIKO_NEW_SHARE
                 ", room AS (INSERT INTO blobs (key) SELECT unnest($13) RETURNING id, key),"
                 " counted AS (INSERT INTO usage (account, share, at, bytes)"
                 " SELECT $2, made.id, $5, $14 FROM made)"
                 " INSERT INTO files (share, position, name, type, size, upload, blob)"
                 " SELECT made.id, f.position - 1, f.name, f.type, f.size, f.upload, room.id"
                 " FROM made, unnest($9, $10, $11, $12, $13) WITH ORDINALITY"
                 " AS f (name, type, size, upload, key, position) JOIN room USING (key)",
                 record.key, share.account, share.idempotencyKey,
                 static_cast<int>(ShareState::uploading), share.now, share.deadline,
                 recipients.numbers, recipients.codes, files.names, files.types, files.sizes,
                 files.uploads, files.blobs, announcedBytes(share))
            .changed();
    if (static_cast<std::size_t>(added) != record.files.size())
        throw StorageFailure(StorageFailure::Kind::broken, "a new file has no blob");
}

/// Makes the share without files; returns its number.
std::int64_t addShareRow(PostgresConnection &db, const NewShare &share)
{
    const RecipientColumns recipients(share.recipients);
    PostgresRows row =
        db.query(PELLIKO_NEW_SHARE " SELECT id FROM made", randomToken(), share.account,
                 share.idempotencyKey, static_cast<int>(ShareState::uploading), share.now,
                 share.deadline, recipients.numbers, recipients.codes);
    return row.next() ? row.integer(0) : 0;
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

CreateResult create(PostgresConnection &db, const NewShare &share, const std::vector<Use> &uses)
{
    const std::uint64_t wanted = announcedBytes(share);
    const auto wait =
        wanted == 0 ? std::nullopt
                    : waitForRoom(wanted, uses, {share.dailyLimit, share.limitWindow, share.now});
    if (wait)
        return {Outcome::overDailyLimit, {}, *wait};
    CreateResult result{Outcome::created, recordOf(share), 0};
    addShare(db, share, result.share);
    return result;
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
        const Before before = lookBefore(db, share);
        if (before.known)
            return {Outcome::known, shareById(db, *before.known, share.now).record, 0};
        return share.reshareOf ? reshare(db, share, source) : create(db, share, before.uses);
    });
}

} // namespace pelliko::server
