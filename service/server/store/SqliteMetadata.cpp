#include "store/SqliteConnection.h"

#include <sqlite3.h>

#include <array>
#include <cerrno>

namespace pelliko::server
{
namespace
{

constexpr int busyMilliseconds = 10000;

constexpr const char *firstLayout = R"sql(
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

// A share that ended before its end was noted counts as ended at its deadline.
constexpr const char *withEnds = R"sql(
ALTER TABLE shares ADD COLUMN ended INTEGER;
UPDATE shares SET ended = deadline WHERE state IN (2, 3);
CREATE INDEX shares_by_end ON shares (ended) WHERE ended IS NOT NULL;
)sql";

// How many numbers an account has asked for, and when; not which.
constexpr const char *withQuestions = R"sql(
CREATE TABLE questions (
  account INTEGER NOT NULL REFERENCES accounts (id) ON DELETE CASCADE,
  at INTEGER NOT NULL,
  numbers INTEGER NOT NULL,
  PRIMARY KEY (account, at)) WITHOUT ROWID;
)sql";

constexpr const char *withInvitations = R"sql(
CREATE TABLE invitations (
  id INTEGER PRIMARY KEY AUTOINCREMENT,
  code_hash BLOB NOT NULL UNIQUE,
  number TEXT NOT NULL,
  uses INTEGER NOT NULL,
  used INTEGER NOT NULL DEFAULT 0,
  created INTEGER NOT NULL,
  expires INTEGER NOT NULL);
CREATE TABLE redemptions (
  invitation INTEGER NOT NULL REFERENCES invitations (id) ON DELETE CASCADE,
  account INTEGER NOT NULL REFERENCES accounts (id) ON DELETE CASCADE,
  key_hash BLOB NOT NULL,
  PRIMARY KEY (invitation, account, key_hash)) WITHOUT ROWID;
CREATE INDEX redemptions_by_account ON redemptions (account);
)sql";

// A push's plain token is kept while it waits; the hash stays, and tells what became of the share.
constexpr const char *withPushes = R"sql(
ALTER TABLE accounts ADD COLUMN last_push INTEGER NOT NULL DEFAULT 0;
CREATE TABLE pushes (
  account INTEGER NOT NULL REFERENCES accounts (id) ON DELETE CASCADE,
  id INTEGER NOT NULL,
  share INTEGER NOT NULL REFERENCES shares (id) ON DELETE CASCADE,
  state INTEGER NOT NULL,
  token TEXT,
  token_hash BLOB NOT NULL UNIQUE,
  PRIMARY KEY (account, id),
  UNIQUE (share, account)) WITHOUT ROWID;
CREATE INDEX pushes_waiting ON pushes (account, id) WHERE state = 0;
)sql";

/// The way from each version of the layout to the next; a fresh file goes all of it.
constexpr std::array layouts{firstLayout, withEnds, withQuestions, withInvitations, withPushes};

bool meansFull(int systemError)
{
    return systemError == ENOSPC || systemError == EDQUOT || systemError == EFBIG;
}

} // namespace

SqliteMetadata::Connection::Connection(const std::filesystem::path &file)
try : database(file.string(), SQLite::OPEN_READWRITE | SQLite::OPEN_CREATE, busyMilliseconds) {
    database.exec("PRAGMA journal_mode = WAL");
    database.exec("PRAGMA synchronous = FULL");
    database.exec("PRAGMA foreign_keys = ON");
    migrate(file);
} catch (const SQLite::Exception &error) {
    throw StorageFailure(StorageFailure::Kind::broken, std::string("metadata: ") + error.what());
}

void SqliteMetadata::Connection::migrate(const std::filesystem::path &file)
{
    SQLite::Transaction transaction(database, SQLite::TransactionBehavior::IMMEDIATE);
    const int version = database.execAndGet("PRAGMA user_version").getInt();
    const int newest = static_cast<int>(layouts.size());
    if (version > newest)
        throw StorageFailure(StorageFailure::Kind::broken,
                             file.string() + " was made by a newer server");
    if (version == newest)
        return;
    for (auto step = static_cast<std::size_t>(version); step < layouts.size(); ++step)
        database.exec(layouts[step]);
    database.exec("PRAGMA user_version = " + std::to_string(newest));
    transaction.commit();
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
    const bool full = error.getErrorCode() == SQLITE_FULL ||
                      (error.getErrorCode() == SQLITE_IOERR &&
                       meansFull(sqlite3_system_errno(database.getHandle())));
    throw StorageFailure(full ? StorageFailure::Kind::full : StorageFailure::Kind::broken,
                         std::string("metadata: ") + error.what());
}

SqliteMetadata::SqliteMetadata(const std::filesystem::path &file)
    : m_connection(std::make_unique<Connection>(file))
{
}

SqliteMetadata::~SqliteMetadata() = default;

void SqliteMetadata::verify()
{
    const std::string found = m_connection->read([&] {
        Query query = m_connection->query("PRAGMA quick_check(1)");
        return query.next() ? query.text(0) : std::string("nothing can be read");
    });
    if (found != "ok")
        throw StorageFailure(StorageFailure::Kind::broken, "metadata: the file is damaged");
}

void SqliteMetadata::ping()
{
    m_connection->read([&] {
        Query query = m_connection->query("SELECT count(*) FROM (SELECT 1 FROM accounts LIMIT 1)");
        return query.next();
    });
}

} // namespace pelliko::server
