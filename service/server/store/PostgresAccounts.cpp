#include "store/PostgresMetadata.h"
#include "store/PostgresRows.h"

namespace pelliko::server
{
namespace
{

Account accountOf(const PostgresRows &row)
{
    return {row.integer(0), row.text(1), row.text(2), row.integer(3)};
}

/// Blobs of the account's unfinished shares, which somebody may be writing.
std::vector<std::int64_t> blobsInWork(PostgresConnection &db, std::int64_t account)
{
    PostgresRows rows = db.query("SELECT f.blob FROM files f JOIN shares s ON s.id = f.share"
                                 " WHERE s.account = $1 AND s.state = 0 AND f.blob IS NOT NULL",
                                 account);
    std::vector<std::int64_t> blobs;
    while (rows.next())
        blobs.push_back(rows.integer(0));
    return blobs;
}

} // namespace

void lockAccount(PostgresConnection &db, std::int64_t account)
{
    db.query("SELECT 1 FROM accounts WHERE id = $1 FOR NO KEY UPDATE", account);
}

bool PostgresMetadata::addAccount(const std::string &number, const std::string &name,
                                  const std::string &tokenHash, Seconds now)
{
    return m_pool->write([&](PostgresConnection &db) {
        return db.query("INSERT INTO accounts (number, name, token_hash, created)"
                        " VALUES ($1, $2, $3, $4) ON CONFLICT (number) DO NOTHING",
                        number, name, Bytes{tokenHash}, now)
                   .changed() == 1;
    });
}

bool PostgresMetadata::removeAccount(const std::string &number)
{
    return m_pool->write([&](PostgresConnection &db) {
        // No share of the account is begun from here on.
        PostgresRows row = db.query("SELECT id FROM accounts WHERE number = $1 FOR UPDATE", number);
        if (!row.next())
            return false;
        const std::int64_t account = row.integer(0);
        tellServers(db, "stop", blobsInWork(db, account));
        db.query("UPDATE blobs SET doomed = true WHERE id IN (SELECT f.blob FROM files f"
                 " JOIN shares s ON s.id = f.share WHERE s.account = $1)",
                 account);
        db.query("DELETE FROM accounts WHERE id = $1", account);
        tellServers(db, "push", {account});
        tellServers(db, "sweep", {});
        return true;
    });
}

std::vector<Account> PostgresMetadata::listAccounts()
{
    return m_pool->single([](PostgresConnection &db) {
        std::vector<Account> accounts;
        PostgresRows rows = db.query("SELECT id, number, name, created FROM accounts ORDER BY id");
        while (rows.next())
            accounts.push_back(accountOf(rows));
        return accounts;
    });
}

bool PostgresMetadata::hasAccounts()
{
    return m_pool->single(
        [](PostgresConnection &db) { return db.query("SELECT 1 FROM accounts LIMIT 1").next(); });
}

std::optional<Account> PostgresMetadata::findAccount(const std::string &tokenHash)
{
    return m_pool->single([&](PostgresConnection &db) -> std::optional<Account> {
        PostgresRows row =
            db.query("SELECT id, number, name, created FROM accounts WHERE token_hash = $1",
                     Bytes{tokenHash});
        if (!row.next())
            return std::nullopt;
        return accountOf(row);
    });
}

std::uint64_t PostgresMetadata::usedBytes(std::int64_t account, Seconds since)
{
    return m_pool->single([&](PostgresConnection &db) {
        PostgresRows row = db.query("SELECT coalesce(sum(bytes), 0)::bigint FROM usage"
                                    " WHERE account = $1 AND at > $2",
                                    account, since);
        return row.next() ? row.size(0) : std::uint64_t{0};
    });
}

} // namespace pelliko::server
