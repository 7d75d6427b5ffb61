#include "ReceivedJournal.h"

#include "UploadQueue.h"

#include <SQLiteCpp/SQLiteCpp.h>
#include <SQLiteCpp/VariadicBind.h>
#include <glib.h>

namespace pelliko::service
{
namespace
{
template <typename... Values>
void execute(SQLite::Database &db, const char *sql, const Values &...values)
{
    SQLite::Statement statement(db, sql);
    SQLite::bind(statement, values...);
    statement.exec();
}

// Another account, or the same number with another token, counts its pushes anew. Hashed, because
// the token is kept in one place only.
std::string keyOf(const Account &account)
{
    const std::string text = account.server + "\n" + account.number + "\n" + account.token;
    g_autofree char *sum = g_compute_checksum_for_string(G_CHECKSUM_SHA256, text.c_str(), -1);
    return sum;
}

constexpr const char *shareColumns =
    "SELECT id, token, received_at, sender, created_at, expires, state FROM received ";

struct Row {
    int64_t id;
    ReceivedShare share;
};

Row rowOf(SQLite::Statement &query)
{
    Row row{query.getColumn(0).getInt64(), {}};
    row.share.token = query.getColumn(1).getString();
    row.share.received = query.getColumn(2).getInt64();
    row.share.details.sender = query.getColumn(3).getString();
    row.share.details.created = query.getColumn(4).getInt64();
    row.share.details.expires = query.getColumn(5).getInt64();
    row.share.details.state = static_cast<ReceivedState>(query.getColumn(6).getInt());
    return row;
}
} // namespace

ReceivedJournal::ReceivedJournal(UploadQueue &queue) : db_(queue.database()) {}

PushPosition ReceivedJournal::position(const Account &account)
{
    SQLite::Statement query(db_,
                            "SELECT stored, acknowledged FROM push_positions WHERE account = ?");
    query.bind(1, keyOf(account));
    if (!query.executeStep()) {
        return {};
    }
    return {query.getColumn(0).getInt64(), query.getColumn(1).getInt64()};
}

void ReceivedJournal::announce(const Account &account, int64_t id, const std::string &token,
                               int64_t now)
{
    SQLite::Transaction transaction(db_, SQLite::TransactionBehavior::IMMEDIATE);
    execute(db_, "INSERT OR IGNORE INTO received (token, received_at) VALUES (?, ?)", token, now);
    execute(db_,
            "INSERT INTO push_positions (account, stored, acknowledged) VALUES (?, ?, 0)"
            " ON CONFLICT (account) DO UPDATE SET stored = max(stored, excluded.stored)",
            keyOf(account), id);
    transaction.commit();
}

void ReceivedJournal::setAcknowledged(const Account &account, int64_t upTo)
{
    execute(db_, "UPDATE push_positions SET acknowledged = max(acknowledged, ?) WHERE account = ?",
            upTo, keyOf(account));
}

void ReceivedJournal::forgetPosition(const Account &account)
{
    execute(db_, "DELETE FROM push_positions WHERE account = ?", keyOf(account));
}

std::vector<std::string> ReceivedJournal::tokens(const char *sql)
{
    SQLite::Statement query(db_, sql);
    std::vector<std::string> result;
    while (query.executeStep()) {
        result.push_back(query.getColumn(0).getString());
    }
    return result;
}

std::vector<std::string> ReceivedJournal::unread()
{
    return tokens("SELECT token FROM received WHERE known = 0 AND forgotten = 0 ORDER BY id");
}

void ReceivedJournal::writeDetails(const std::string &token, const ReceivedDetails &details)
{
    execute(db_,
            "UPDATE received SET known = 1, sender = ?, created_at = ?, expires = ?, state = ?"
            " WHERE token = ? AND forgotten = 0",
            details.sender, details.created, details.expires, static_cast<int>(details.state),
            token);
    execute(db_,
            "DELETE FROM received_files WHERE share = (SELECT id FROM received WHERE token = ?)",
            token);
    int position = 0;
    for (const ReceivedFile &file : details.files) {
        execute(db_,
                "INSERT INTO received_files (share, position, name, size, type)"
                " SELECT id, ?, ?, ?, ? FROM received WHERE token = ? AND forgotten = 0",
                position++, file.name, file.size, file.type, token);
    }
}

void ReceivedJournal::setDetails(const std::string &token, const ReceivedDetails &details)
{
    SQLite::Transaction transaction(db_, SQLite::TransactionBehavior::IMMEDIATE);
    writeDetails(token, details);
    transaction.commit();
}

void ReceivedJournal::keep(const std::string &token, const ReceivedDetails &details, int64_t now)
{
    SQLite::Transaction transaction(db_, SQLite::TransactionBehavior::IMMEDIATE);
    execute(db_, "INSERT OR IGNORE INTO received (token, received_at, told) VALUES (?, ?, 1)",
            token, details.created > 0 ? details.created : now);
    writeDetails(token, details);
    transaction.commit();
}

std::vector<ReceivedJournal::Untold> ReceivedJournal::untold(size_t most)
{
    SQLite::Statement query(db_, "SELECT token, launches FROM received WHERE known = 1 AND told = 0"
                                 " AND forgotten = 0 AND state = 0 ORDER BY id LIMIT ?");
    query.bind(1, static_cast<int64_t>(most));
    std::vector<Untold> result;
    while (query.executeStep()) {
        result.push_back({query.getColumn(0).getString(), query.getColumn(1).getInt()});
    }
    return result;
}

void ReceivedJournal::countLaunch(const std::vector<Untold> &tokens, int change)
{
    SQLite::Transaction transaction(db_, SQLite::TransactionBehavior::IMMEDIATE);
    for (const Untold &one : tokens) {
        execute(db_, "UPDATE received SET launches = launches + ? WHERE token = ?", change,
                one.token);
    }
    transaction.commit();
}

void ReceivedJournal::setTold(const std::vector<Untold> &tokens)
{
    SQLite::Transaction transaction(db_, SQLite::TransactionBehavior::IMMEDIATE);
    for (const Untold &one : tokens) {
        execute(db_, "UPDATE received SET told = 1 WHERE token = ?", one.token);
    }
    transaction.commit();
}

std::vector<ReceivedFile> ReceivedJournal::filesOf(int64_t share)
{
    SQLite::Statement query(
        db_, "SELECT name, size, type FROM received_files WHERE share = ? ORDER BY position");
    query.bind(1, share);
    std::vector<ReceivedFile> files;
    while (query.executeStep()) {
        files.push_back({query.getColumn(0).getString(), query.getColumn(1).getInt64(),
                         query.getColumn(2).getString()});
    }
    return files;
}

std::optional<ReceivedShare> ReceivedJournal::find(const std::string &token)
{
    SQLite::Statement query(db_, std::string(shareColumns) +
                                     "WHERE token = ? AND known = 1 AND forgotten = 0");
    query.bind(1, token);
    if (!query.executeStep()) {
        return std::nullopt;
    }
    Row row = rowOf(query);
    row.share.details.files = filesOf(row.id);
    return std::move(row.share);
}

std::vector<ReceivedShare> ReceivedJournal::all()
{
    SQLite::Statement query(db_, std::string(shareColumns) + "WHERE known = 1 AND forgotten = 0"
                                                             " ORDER BY received_at DESC, id DESC");
    std::vector<ReceivedShare> result;
    while (query.executeStep()) {
        Row row = rowOf(query);
        row.share.details.files = filesOf(row.id);
        result.push_back(std::move(row.share));
    }
    return result;
}

void ReceivedJournal::forget(const std::string &token, bool onServer)
{
    SQLite::Transaction transaction(db_, SQLite::TransactionBehavior::IMMEDIATE);
    execute(db_,
            "DELETE FROM received_files WHERE share = (SELECT id FROM received WHERE token = ?)",
            token);
    execute(db_,
            "UPDATE received SET sender = '', created_at = 0, known = 1, told = 1, forgotten = ?"
            " WHERE token = ?",
            onServer ? 2 : 1, token);
    transaction.commit();
}

std::vector<std::string> ReceivedJournal::toForgetOnServer()
{
    return tokens("SELECT token FROM received WHERE forgotten = 2 ORDER BY id");
}

void ReceivedJournal::forgottenOnServer(const std::string &token)
{
    execute(db_, "UPDATE received SET forgotten = 1 WHERE token = ? AND forgotten = 2", token);
}

void ReceivedJournal::dropBefore(int64_t epochSeconds)
{
    execute(db_,
            "DELETE FROM received WHERE forgotten < 2"
            " AND max(received_at, CASE known WHEN 1 THEN expires ELSE 0 END) < ?",
            epochSeconds);
}

} // namespace pelliko::service
