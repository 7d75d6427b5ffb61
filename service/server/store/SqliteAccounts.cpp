#include "store/SqliteConnection.h"

namespace pelliko::server
{
namespace
{

Account accountOf(const Query &row)
{
    return {row.integer(0), row.text(1), row.text(2), row.integer(3)};
}

} // namespace

bool SqliteMetadata::addAccount(const std::string &number, const std::string &name,
                                const std::string &tokenHash, Seconds now)
{
    auto &db = *m_connection;
    return db.write([&] {
        return db.query("INSERT INTO accounts (number, name, token_hash, created)"
                        " VALUES (?, ?, ?, ?) ON CONFLICT (number) DO NOTHING",
                        number, name, Bytes{tokenHash}, now)
                   .run() == 1;
    });
}

bool SqliteMetadata::removeAccount(const std::string &number)
{
    auto &db = *m_connection;
    return db.write([&] {
        db.query("UPDATE blobs SET doomed = 1 WHERE id IN (SELECT f.blob FROM files f"
                 " JOIN shares s ON s.id = f.share JOIN accounts a ON a.id = s.account"
                 " WHERE a.number = ?)",
                 number)
            .run();
        return db.query("DELETE FROM accounts WHERE number = ?", number).run() == 1;
    });
}

std::vector<Account> SqliteMetadata::listAccounts()
{
    auto &db = *m_connection;
    return db.read([&] {
        std::vector<Account> accounts;
        Query rows = db.query("SELECT id, number, name, created FROM accounts ORDER BY id");
        while (rows.next())
            accounts.push_back(accountOf(rows));
        return accounts;
    });
}

bool SqliteMetadata::hasAccounts()
{
    auto &db = *m_connection;
    return db.read([&] { return db.query("SELECT 1 FROM accounts LIMIT 1").next(); });
}

std::optional<Account> SqliteMetadata::findAccount(const std::string &tokenHash)
{
    auto &db = *m_connection;
    return db.read([&]() -> std::optional<Account> {
        Query row = db.query("SELECT id, number, name, created FROM accounts WHERE token_hash = ?",
                             Bytes{tokenHash});
        if (!row.next())
            return std::nullopt;
        return accountOf(row);
    });
}

std::uint64_t SqliteMetadata::usedBytes(std::int64_t account, Seconds since)
{
    auto &db = *m_connection;
    return db.read([&] {
        Query row =
            db.query("SELECT coalesce(sum(bytes), 0) FROM usage WHERE account = ? AND at > ?",
                     account, since);
        return row.next() ? row.size(0) : std::uint64_t{0};
    });
}

} // namespace pelliko::server
