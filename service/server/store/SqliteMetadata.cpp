#include "store/SqliteConnection.h"

#include <sqlite3.h>

namespace pelliko::server
{
namespace
{

constexpr int busyMilliseconds = 10000;
constexpr int schemaVersion = 1;

constexpr const char *schema = R"sql(
CREATE TABLE accounts (
  id INTEGER PRIMARY KEY AUTOINCREMENT,
  number TEXT NOT NULL UNIQUE,
  name TEXT NOT NULL,
  token_hash BLOB NOT NULL UNIQUE,
  created INTEGER NOT NULL);
CREATE TABLE shares (
  id INTEGER PRIMARY KEY AUTOINCREMENT,
  key TEXT NOT NULL UNIQUE,
  account INTEGER NOT NULL REFERENCES accounts (id) ON DELETE CASCADE,
  idempotency_key TEXT,
  state INTEGER NOT NULL,
  created INTEGER NOT NULL,
  deadline INTEGER NOT NULL,
  link_hash BLOB UNIQUE,
  UNIQUE (account, idempotency_key));
CREATE INDEX shares_by_deadline ON shares (state, deadline);
CREATE TABLE recipients (
  share INTEGER NOT NULL REFERENCES shares (id) ON DELETE CASCADE,
  position INTEGER NOT NULL,
  number TEXT NOT NULL,
  ccc TEXT NOT NULL,
  PRIMARY KEY (share, position)) WITHOUT ROWID;
CREATE TABLE blobs (
  id INTEGER PRIMARY KEY AUTOINCREMENT,
  key TEXT NOT NULL UNIQUE,
  received INTEGER NOT NULL DEFAULT 0,
  doomed INTEGER NOT NULL DEFAULT 0);
CREATE INDEX blobs_doomed ON blobs (id) WHERE doomed = 1;
CREATE TABLE files (
  share INTEGER NOT NULL REFERENCES shares (id) ON DELETE CASCADE,
  position INTEGER NOT NULL,
  name TEXT NOT NULL,
  type TEXT NOT NULL,
  size INTEGER NOT NULL,
  upload TEXT NOT NULL UNIQUE,
  blob INTEGER REFERENCES blobs (id),
  PRIMARY KEY (share, position)) WITHOUT ROWID;
CREATE INDEX files_by_blob ON files (blob);
CREATE TABLE usage (
  account INTEGER NOT NULL REFERENCES accounts (id) ON DELETE CASCADE,
  share INTEGER,
  at INTEGER NOT NULL,
  bytes INTEGER NOT NULL);
CREATE INDEX usage_by_time ON usage (account, at);
CREATE INDEX usage_by_share ON usage (share);
)sql";

} // namespace

SqliteMetadata::Connection::Connection(const std::filesystem::path &file)
try : database(file.string(), SQLite::OPEN_READWRITE | SQLite::OPEN_CREATE, busyMilliseconds) {
    database.exec("PRAGMA journal_mode = WAL");
    database.exec("PRAGMA synchronous = FULL");
    database.exec("PRAGMA foreign_keys = ON");
    SQLite::Transaction transaction(database, SQLite::TransactionBehavior::IMMEDIATE);
    const int version = database.execAndGet("PRAGMA user_version").getInt();
    if (version > schemaVersion)
        throw StorageFailure(StorageFailure::Kind::broken,
                             file.string() + " was made by a newer server");
    if (version == 0) {
        database.exec(schema);
        database.exec("PRAGMA user_version = " + std::to_string(schemaVersion));
    }
    transaction.commit();
} catch (const SQLite::Exception &error) {
    fail(error);
}

SQLite::Statement &SqliteMetadata::Connection::prepared(const char *sql)
{
    auto &slot = m_statements[sql];
    if (!slot)
        slot = std::make_unique<SQLite::Statement>(database, sql);
    return *slot;
}

void SqliteMetadata::Connection::fail(const SQLite::Exception &error)
{
    const bool full = error.getErrorCode() == SQLITE_FULL;
    throw StorageFailure(full ? StorageFailure::Kind::full : StorageFailure::Kind::broken,
                         std::string("metadata: ") + error.what());
}

SqliteMetadata::SqliteMetadata(const std::filesystem::path &file)
    : m_connection(std::make_unique<Connection>(file))
{
}

SqliteMetadata::~SqliteMetadata() = default;

void SqliteMetadata::ping()
{
    m_connection->read([&] {
        Query query = m_connection->query("SELECT count(*) FROM (SELECT 1 FROM accounts LIMIT 1)");
        return query.next();
    });
}

} // namespace pelliko::server
