// Finishing shares, pushes and what accounts see of the shares that they received
#include "store/PostgresMetadata.h"
#include "store/PostgresRows.h"
#include "text/Secrets.h"

#include <algorithm>
#include <map>
#include <utility>

namespace pelliko::server
{
namespace
{

/// An account that is among a share's recipients.
struct KnownRecipient {
    std::int64_t account = 0;
    /// Has a push for the share already. Others are made under the share's lock only.
    bool told = false;
};

/// Writes what finishing has changed, and gives the accounts among the recipients by number, locked
/// in the order of their ids: two shares that go to the same people take them one after the other.
std::map<std::string, KnownRecipient> noteFinish(PostgresConnection &db, const ShareRow &share,
                                                 const std::string &linkHash)
{
    const ShareRecord &record = share.record;
    std::vector<std::string> numbers;
    for (const Recipient &recipient : record.recipients)
        numbers.push_back(recipient.number);
    PostgresRows rows = db.query("WITH done AS (UPDATE shares SET state = $3, deadline = $4,"
                                 " link_hash = $5 WHERE id = $2)"
                                 " SELECT a.id, a.number, EXISTS"
                                 " (SELECT 1 FROM pushes p WHERE p.share = $2 AND p.account = a.id)"
                                 " FROM accounts a WHERE a.number = ANY ($1)"
                                 " ORDER BY a.id FOR NO KEY UPDATE OF a",
                                 numbers, share.id, static_cast<int>(record.state), record.deadline,
                                 Bytes{linkHash});
    std::map<std::string, KnownRecipient> known;
    while (rows.next())
        known[rows.text(1)] = {rows.integer(0), rows.integer(2) != 0};
    return known;
}

void addPushes(PostgresConnection &db, std::int64_t share,
               const std::vector<std::int64_t> &accounts)
{
    if (accounts.empty())
        return;
    std::vector<std::string> tokens;
    for (std::size_t count = accounts.size(); count > 0; --count)
        tokens.push_back(randomToken());
    db.query("WITH next AS (UPDATE accounts SET last_push = last_push + 1 WHERE id = ANY ($2)"
             " RETURNING id, last_push)"
             " INSERT INTO pushes (account, id, share, state, token, token_hash)"
             " SELECT next.id, next.last_push, $1, 0, t.token,"
             " sha256(convert_to(t.token, 'UTF8'))"
             " FROM next JOIN unnest($2, $3) AS t (account, token) ON t.account = next.id",
             share, accounts, tokens);
    tellServers(db, "push", accounts);
}

/// Sorts the share's recipients into those that get a push, which is made, and those of an SMS.
void tellRecipients(PostgresConnection &db, const ShareRow &share,
                    std::map<std::string, KnownRecipient> known, FinishResult &result)
{
    for (const Recipient &recipient : share.record.recipients) {
        const auto found = known.find(recipient.number);
        std::vector<std::string> &sms = result.sms;
        if (found != known.end()) {
            if (!std::exchange(found->second.told, true))
                result.pushed.push_back(found->second.account);
        } else if (std::find(sms.begin(), sms.end(), recipient.number) == sms.end()) {
            sms.push_back(recipient.number);
        }
    }
    addPushes(db, share.id, result.pushed);
}

FinishResult finish(PostgresConnection &db, ShareRow &share, const std::string &linkHash,
                    Seconds deadline)
{
    ShareRecord &record = share.record;
    if (const auto refused = markFinished(record, deadline))
        return {*refused, std::move(record), {}, {}};
    FinishResult result{FinishResult::Outcome::finished, {}, {}, {}};
    tellRecipients(db, share, noteFinish(db, share, linkHash), result);
    result.share = std::move(record);
    return result;
}

} // namespace

FinishResult PostgresMetadata::finishShare(std::int64_t account, const std::string &key,
                                           const std::string &linkHash, Seconds now,
                                           Seconds deadline)
{
    return m_pool->write([&](PostgresConnection &db) -> FinishResult {
        auto share = findShareRow(db, account, key, now, true);
        if (!share)
            return {};
        addParts(db, *share);
        return finish(db, *share, linkHash, deadline);
    });
}

std::optional<std::vector<Push>> PostgresMetadata::waitingPushes(const std::string &tokenHash,
                                                                 std::int64_t after, Seconds now)
{
    return m_pool->single([&](PostgresConnection &db) -> std::optional<std::vector<Push>> {
        // A share whose end has come is not waited for the sweeper to be noticed.
        PostgresRows rows =
            db.query("SELECT w.id, w.token FROM accounts a LEFT JOIN LATERAL"
                     " (SELECT p.id, p.token FROM pushes p JOIN shares s ON s.id = p.share"
                     " WHERE p.account = a.id AND p.state = 0 AND s.deadline > $3"
                     " AND p.id > CASE WHEN $2 > a.last_push THEN 0 ELSE $2 END"
                     " ORDER BY p.id LIMIT $4) w ON true WHERE a.token_hash = $1 ORDER BY w.id",
                     Bytes{tokenHash}, after, now, pushesAtOnce);
        bool known = false;
        std::vector<Push> pushes;
        while (rows.next()) {
            known = true;
            if (!rows.isNull(0))
                pushes.push_back({rows.integer(0), rows.text(1)});
        }
        return known ? std::optional(std::move(pushes)) : std::nullopt;
    });
}

bool PostgresMetadata::acknowledgePushes(std::int64_t account, std::int64_t upTo)
{
    return m_pool->single([&](PostgresConnection &db) {
        return db
            .query("WITH known AS (SELECT 1 FROM accounts WHERE id = $1 AND last_push >= $2),"
                   " done AS (UPDATE pushes SET state = 1, token = NULL WHERE account = $1"
                   " AND state = 0 AND id <= $2 AND EXISTS (SELECT 1 FROM known))"
                   " SELECT 1 FROM known",
                   account, upTo)
            .next();
    });
}

std::optional<ReceivedRecord> PostgresMetadata::findReceived(std::int64_t account,
                                                             const ReceivedKey &key, Seconds now)
{
    return m_pool->read([&](PostgresConnection &db) -> std::optional<ReceivedRecord> {
        PostgresRows row = db.query("SELECT " PELLIKO_RECEIVED
                                    " WHERE p.account = $1 AND (p.id = $2 OR p.token_hash = $3)"
                                    " AND p.state <> 3",
                                    account, key.push, Bytes{key.tokenHash});
        if (!row.next())
            return std::nullopt;
        ShareRow share = shareRowOf(row, now);
        addParts(db, share);
        return ReceivedRecord{row.integer(6), row.text(5), std::move(share.record)};
    });
}

std::vector<ReceivedRecord> PostgresMetadata::listReceived(std::int64_t account, Seconds now)
{
    return m_pool->read([&](PostgresConnection &db) {
        PostgresRows rows =
            db.query("SELECT " PELLIKO_RECEIVED " WHERE p.account = $1 AND (p.state = 1 OR"
                     " (p.state = 0 AND s.deadline > $2)) ORDER BY p.id DESC",
                     account, now);
        std::vector<ReceivedRecord> list;
        std::vector<ShareRow> shares;
        while (rows.next()) {
            shares.push_back(shareRowOf(rows, now));
            list.push_back({rows.integer(6), rows.text(5), {}});
        }
        addParts(db, shares);
        for (std::size_t index = 0; index < list.size(); ++index)
            list[index].share = std::move(shares[index].record);
        return list;
    });
}

bool PostgresMetadata::forgetReceived(std::int64_t account, const ReceivedKey &key)
{
    return m_pool->single([&](PostgresConnection &db) {
        return db.query("UPDATE pushes SET state = 3, token = NULL"
                        " WHERE account = $1 AND (id = $2 OR token_hash = $3)",
                        account, key.push, Bytes{key.tokenHash})
                   .changed() == 1;
    });
}

} // namespace pelliko::server
