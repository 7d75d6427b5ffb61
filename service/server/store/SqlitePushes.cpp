// Pushes and what accounts see of the shares that they received
#include "store/ShareRow.h"
#include "store/SqliteConnection.h"
#include "text/Secrets.h"

#include <algorithm>
#include <utility>

namespace pelliko::server
{
namespace
{

} // namespace

bool SqliteMetadata::Connection::addPush(std::int64_t account, std::int64_t share)
{
    {
        Query known = query("SELECT 1 FROM pushes WHERE share = ? AND account = ?", share, account);
        if (known.next())
            return false;
    }
    query("UPDATE accounts SET last_push = last_push + 1 WHERE id = ?", account).run();
    const std::string token = randomToken();
    const std::string hash = sha256(token);
    query("INSERT INTO pushes (account, id, share, state, token, token_hash)"
          " SELECT id, last_push, ?, 0, ?, ? FROM accounts WHERE id = ?",
          share, token, Bytes{hash}, account)
        .run();
    return true;
}

void SqliteMetadata::Connection::tellRecipients(const ShareRow &share, FinishResult &result)
{
    for (const Recipient &recipient : share.record.recipients) {
        std::int64_t account = 0;
        {
            Query row = query("SELECT id FROM accounts WHERE number = ?", recipient.number);
            account = row.next() ? row.integer(0) : 0;
        }
        std::vector<std::string> &sms = result.sms;
        if (account != 0) {
            if (addPush(account, share.id))
                result.pushed.push_back(account);
        } else if (std::find(sms.begin(), sms.end(), recipient.number) == sms.end()) {
            sms.push_back(recipient.number);
        }
    }
}

void SqliteMetadata::Connection::dropPushes(std::int64_t share)
{
    query("UPDATE pushes SET state = ?, token = NULL WHERE share = ? AND state = 0",
          static_cast<int>(PushState::dropped), share)
        .run();
}

std::optional<std::vector<Push>> SqliteMetadata::waitingPushes(const std::string &tokenHash,
                                                               std::int64_t after, Seconds now)
{
    auto &db = *m_connection;
    return db.read([&]() -> std::optional<std::vector<Push>> {
        std::int64_t account = 0;
        {
            Query row = db.query("SELECT id, last_push FROM accounts WHERE token_hash = ?",
                                 Bytes{tokenHash});
            if (!row.next())
                return std::nullopt;
            account = row.integer(0);
            if (after > row.integer(1))
                after = 0;
        }
        std::vector<Push> pushes;
        // A share whose end has come is not waited for the sweeper to be noticed.
        Query rows = db.query("SELECT p.id, p.token FROM pushes p JOIN shares s ON s.id = p.share"
                              " WHERE p.account = ? AND p.state = 0 AND p.id > ? AND s.deadline > ?"
                              " ORDER BY p.id LIMIT ?",
                              account, after, now, pushesAtOnce);
        while (rows.next())
            pushes.push_back({rows.integer(0), rows.text(1)});
        return pushes;
    });
}

bool SqliteMetadata::acknowledgePushes(std::int64_t account, std::int64_t upTo)
{
    auto &db = *m_connection;
    return db.write([&] {
        {
            Query known =
                db.query("SELECT 1 FROM accounts WHERE id = ? AND last_push >= ?", account, upTo);
            if (!known.next())
                return false;
        }
        db.query("UPDATE pushes SET state = 1, token = NULL"
                 " WHERE account = ? AND state = 0 AND id <= ?",
                 account, upTo)
            .run();
        return true;
    });
}

std::optional<ReceivedRecord> SqliteMetadata::findReceived(std::int64_t account,
                                                           const ReceivedKey &key, Seconds now)
{
    auto &db = *m_connection;
    return db.read([&]() -> std::optional<ReceivedRecord> {
        ShareRow share;
        ReceivedRecord received;
        {
            Query row = db.query("SELECT " PELLIKO_RECEIVED
                                 " WHERE p.account = ? AND (p.id = ? OR p.token_hash = ?)"
                                 " AND p.state <> 3",
                                 account, key.push, Bytes{key.tokenHash});
            if (!row.next())
                return std::nullopt;
            share = shareRowOf(row, now);
            received.senderNumber = row.text(5);
            received.push = row.integer(6);
        }
        db.addParts(share);
        received.share = std::move(share.record);
        return received;
    });
}

std::vector<ReceivedRecord> SqliteMetadata::listReceived(std::int64_t account, Seconds now)
{
    auto &db = *m_connection;
    return db.read([&] {
        std::vector<ReceivedRecord> list;
        Query rows = db.query("SELECT " PELLIKO_RECEIVED " WHERE p.account = ? AND (p.state = 1 OR"
                              " (p.state = 0 AND s.deadline > ?)) ORDER BY p.id DESC",
                              account, now);
        while (rows.next()) {
            ShareRow share = shareRowOf(rows, now);
            db.addParts(share);
            list.push_back({rows.integer(6), rows.text(5), std::move(share.record)});
        }
        return list;
    });
}

bool SqliteMetadata::forgetReceived(std::int64_t account, const ReceivedKey &key)
{
    auto &db = *m_connection;
    return db.write([&] {
        return db.query("UPDATE pushes SET state = 3, token = NULL"
                        " WHERE account = ? AND (id = ? OR token_hash = ?)",
                        account, key.push, Bytes{key.tokenHash})
                   .run() == 1;
    });
}

} // namespace pelliko::server
