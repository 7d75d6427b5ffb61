#include "QueueFile.h"

#include <SQLiteCpp/SQLiteCpp.h>
#include <glib.h>
#include <glib/gstdio.h>
#include <sqlite3.h>

#include <array>
#include <cerrno>
#include <stdexcept>

namespace pelliko::service
{
namespace
{
constexpr int busyMs =
    60'000; // a backup that holds the file locked makes the service wait, not fail

constexpr const char *firstLayout = R"sql(
CREATE TABLE requests (
  id INTEGER PRIMARY KEY AUTOINCREMENT CHECK (id BETWEEN 1 AND 2147483647),
  state INTEGER NOT NULL,
  wifi_only INTEGER NOT NULL,
  reshare_of TEXT NOT NULL,
  idempotency_key TEXT NOT NULL,
  share TEXT NOT NULL DEFAULT '',
  url TEXT NOT NULL DEFAULT '',
  expires INTEGER NOT NULL DEFAULT 0,
  sms_state INTEGER NOT NULL DEFAULT 0,
  sms_attempts INTEGER NOT NULL DEFAULT 0,
  end_status INTEGER NOT NULL DEFAULT 0,
  error INTEGER NOT NULL DEFAULT 0,
  delivered INTEGER NOT NULL DEFAULT 0,
  withdraw INTEGER NOT NULL DEFAULT 0,
  created_at INTEGER NOT NULL,
  ended_at INTEGER NOT NULL DEFAULT 0
);
CREATE INDEX requests_open ON requests (id) WHERE state < 2 OR delivered = 0;
CREATE TABLE files (
  request INTEGER NOT NULL REFERENCES requests (id) ON DELETE CASCADE,
  position INTEGER NOT NULL,
  path BLOB NOT NULL,
  size INTEGER NOT NULL,
  mtime_ns INTEGER NOT NULL,
  PRIMARY KEY (request, position)
) WITHOUT ROWID;
CREATE TABLE recipients (
  request INTEGER NOT NULL REFERENCES requests (id) ON DELETE CASCADE,
  position INTEGER NOT NULL,
  ccc TEXT NOT NULL,
  number TEXT NOT NULL,
  number_id INTEGER NOT NULL,
  PRIMARY KEY (request, position)
) WITHOUT ROWID;
CREATE TABLE sms_numbers (
  request INTEGER NOT NULL REFERENCES requests (id) ON DELETE CASCADE,
  position INTEGER NOT NULL,
  number TEXT NOT NULL,
  PRIMARY KEY (request, position)
) WITHOUT ROWID;
)sql";

// What is found out about a recipient stands beside what the client said.
constexpr const char *withForms = R"sql(
ALTER TABLE recipients ADD COLUMN e164 TEXT NOT NULL DEFAULT '';
ALTER TABLE recipients ADD COLUMN fault TEXT NOT NULL DEFAULT '';
ALTER TABLE recipients ADD COLUMN joined INTEGER NOT NULL DEFAULT 0;
)sql";

// What others share with this user, how far the pushes are, and what is no longer shown.
constexpr const char *withReceived = R"sql(
ALTER TABLE requests ADD COLUMN withdrawn INTEGER NOT NULL DEFAULT 0;
ALTER TABLE requests ADD COLUMN forgotten INTEGER NOT NULL DEFAULT 0;
CREATE TABLE push_positions (
  account TEXT PRIMARY KEY,
  stored INTEGER NOT NULL,
  acknowledged INTEGER NOT NULL
) WITHOUT ROWID;
CREATE TABLE received (
  id INTEGER PRIMARY KEY AUTOINCREMENT,
  token TEXT NOT NULL UNIQUE,
  received_at INTEGER NOT NULL,
  known INTEGER NOT NULL DEFAULT 0,
  told INTEGER NOT NULL DEFAULT 0,
  launches INTEGER NOT NULL DEFAULT 0,
  forgotten INTEGER NOT NULL DEFAULT 0,
  sender TEXT NOT NULL DEFAULT '',
  created_at INTEGER NOT NULL DEFAULT 0,
  expires INTEGER NOT NULL DEFAULT 0,
  state INTEGER NOT NULL DEFAULT 0
);
CREATE TABLE received_files (
  share INTEGER NOT NULL REFERENCES received (id) ON DELETE CASCADE,
  position INTEGER NOT NULL,
  name TEXT NOT NULL,
  size INTEGER NOT NULL,
  type TEXT NOT NULL,
  PRIMARY KEY (share, position)
) WITHOUT ROWID;
)sql";

// Who of the contacts has joined, and how often the server was asked.
constexpr const char *withJoined = R"sql(
CREATE TABLE joined_numbers (
  e164 TEXT PRIMARY KEY,
  server TEXT NOT NULL,
  joined INTEGER NOT NULL,
  marked INTEGER NOT NULL DEFAULT 0,
  asked_at INTEGER NOT NULL
) WITHOUT ROWID;
CREATE TABLE joined_questions (
  asked_at INTEGER NOT NULL,
  numbers INTEGER NOT NULL
);
)sql";

/** The way from each version of the layout to the next; a fresh file goes all of it. */
constexpr std::array layouts{firstLayout, withForms, withReceived, withJoined};

void migrate(SQLite::Database &db)
{
    SQLite::Transaction transaction(db, SQLite::TransactionBehavior::IMMEDIATE);
    const int version = db.execAndGet("PRAGMA user_version").getInt();
    const int newest = static_cast<int>(layouts.size());
    if (version > newest) {
        throw std::runtime_error("the queue was made by a newer pelliko-service");
    }
    if (version == newest) {
        return;
    }
    for (auto step = static_cast<size_t>(version); step < layouts.size(); ++step) {
        db.exec(layouts[step]);
    }
    db.exec("PRAGMA user_version = " + std::to_string(newest));
    transaction.commit();
}

std::unique_ptr<SQLite::Database> openSound(const std::string &file)
{
    auto db = std::make_unique<SQLite::Database>(
        file, SQLite::OPEN_READWRITE | SQLite::OPEN_CREATE | SQLite::OPEN_FULLMUTEX, busyMs);
    db->exec("PRAGMA journal_mode = WAL");
    db->exec("PRAGMA synchronous = FULL");
    db->exec("PRAGMA foreign_keys = ON");
    // What is damaged deep inside would end the service again and again.
    if (db->execAndGet("PRAGMA quick_check(1)").getString() != "ok") {
        throw SQLite::Exception("the file is damaged", SQLITE_CORRUPT);
    }
    migrate(*db);
    return db;
}

bool meansDamage(const SQLite::Exception &fault)
{
    return fault.getErrorCode() == SQLITE_NOTADB || fault.getErrorCode() == SQLITE_CORRUPT;
}

// The log belongs to the file: what it still holds can only be read with it.
void setAside(const std::string &file)
{
    for (const char *part : {"", "-wal", "-shm"}) {
        const std::string aside = file + ".broken" + part;
        if (g_rename((file + part).c_str(), aside.c_str()) != 0 && errno != ENOENT) {
            throw std::runtime_error("cannot rename " + file + part);
        }
    }
}

// Ids are remembered by others. The minutes since 1970 are more than there were requests.
constexpr const char *idsGoOn = "INSERT INTO sqlite_sequence (name, seq)"
                                " VALUES ('requests', CAST(strftime('%s', 'now') AS INTEGER) / 60)";

std::unique_ptr<SQLite::Database> beginAnew(const std::string &file)
{
    g_warning("the queue %s is damaged: it is kept as %s.broken, a new one begins", file.c_str(),
              file.c_str());
    setAside(file);
    auto db = openSound(file);
    db->exec(idsGoOn);
    return db;
}
} // namespace

std::unique_ptr<SQLite::Database> openQueueFile(const std::string &file)
{
    g_autofree char *folder = g_path_get_dirname(file.c_str());
    if (g_mkdir_with_parents(folder, 0700) != 0) {
        throw std::runtime_error(std::string("cannot make ") + folder);
    }
    try {
        return openSound(file);
    } catch (const SQLite::Exception &fault) {
        if (!meansDamage(fault)) {
            throw;
        }
    }
    return beginAnew(file);
}

} // namespace pelliko::service
