#include "Database.h"

#include <filesystem>
#include <new>

#include <SQLiteCpp/SQLiteCpp.h>
#include <sqlite3.h>

#include "NumberText.h"
#include "StateDir.h"
#include "contacts.h"

namespace pelliko::contacts
{
namespace
{

constexpr int schema_version = 2;
constexpr int busy_timeout_ms = 5000;

// A row of contacts in the service's book stands for one phone number of its person: number_id
// names it, sync2 holds the service's letters. AUTOINCREMENT keeps an id from being given out
// twice, since other programs remember number ids.
constexpr const char *schema = R"sql(
CREATE TABLE address_books (
    id INTEGER PRIMARY KEY,
    name TEXT NOT NULL UNIQUE,
    mode INTEGER NOT NULL DEFAULT 0);
CREATE TABLE persons (
    id INTEGER PRIMARY KEY AUTOINCREMENT,
    display_contact_id INTEGER,
    ringtone_path TEXT);
CREATE TABLE contacts (
    id INTEGER PRIMARY KEY AUTOINCREMENT,
    person_id INTEGER NOT NULL REFERENCES persons (id),
    address_book_id INTEGER NOT NULL DEFAULT 0 REFERENCES address_books (id),
    uid TEXT,
    display_name TEXT,
    display_source_type INTEGER NOT NULL DEFAULT 0,
    ringtone_path TEXT,
    image_thumbnail_path TEXT,
    number_id TEXT,
    sync2 TEXT);
CREATE INDEX contacts_by_person ON contacts (person_id);
CREATE INDEX contacts_by_uid ON contacts (uid) WHERE uid IS NOT NULL;
CREATE INDEX contacts_by_name ON contacts (display_name);
CREATE INDEX contacts_by_picture ON contacts (image_thumbnail_path)
    WHERE image_thumbnail_path IS NOT NULL;
CREATE INDEX contacts_by_number_id ON contacts (lower(number_id));
CREATE TABLE numbers (
    id INTEGER PRIMARY KEY AUTOINCREMENT,
    contact_id INTEGER NOT NULL REFERENCES contacts (id) ON DELETE CASCADE,
    type INTEGER NOT NULL DEFAULT 0,
    label TEXT,
    is_default INTEGER NOT NULL DEFAULT 0,
    number TEXT NOT NULL,
    folded TEXT NOT NULL,
    cleaned TEXT,
    normalized TEXT);
CREATE INDEX numbers_by_contact ON numbers (contact_id);
CREATE INDEX numbers_by_number ON numbers (number);
CREATE INDEX numbers_by_folded ON numbers (folded);
CREATE INDEX numbers_by_cleaned ON numbers (cleaned);
CREATE INDEX numbers_by_normalized ON numbers (normalized);
)sql";

// Finds a number by any part of it: every place of a number begins a row of the six characters from
// there on, fewer at its end. A full-text index of three characters was tried; what it reads grows
// with the store, as a thousand threes are shared by all numbers.
constexpr const char *parts = R"sql(
CREATE TABLE number_parts (
    part TEXT NOT NULL,
    number_id INTEGER NOT NULL,
    PRIMARY KEY (part, number_id)) WITHOUT ROWID;
CREATE INDEX number_parts_by_number ON number_parts (number_id);
CREATE VIEW parts_of_numbers AS
    SELECT substr(folded, place.key + 1, 6) AS part, numbers.id AS number_id
    FROM numbers, json_each('[' || replace(hex(zeroblob(length(folded))), '00', '0,') || '0]') AS place
    WHERE place.key < length(folded);
CREATE TRIGGER number_added AFTER INSERT ON numbers BEGIN
    INSERT OR IGNORE INTO number_parts
    SELECT part, number_id FROM parts_of_numbers WHERE number_id = new.id;
END;
CREATE TRIGGER number_removed AFTER DELETE ON numbers BEGIN
    DELETE FROM number_parts WHERE number_id = old.id;
END;
CREATE TRIGGER number_changed AFTER UPDATE OF folded ON numbers BEGIN
    DELETE FROM number_parts WHERE number_id = old.id;
    INSERT OR IGNORE INTO number_parts
    SELECT part, number_id FROM parts_of_numbers WHERE number_id = new.id;
END;
)sql";

// Version 1 had a full-text index in the place of the parts.
constexpr const char *from_version_1 = R"sql(
DROP TRIGGER number_added;
DROP TRIGGER number_removed;
DROP TRIGGER number_changed;
DROP TABLE number_trigrams;
)sql";

void addBook(SQLite::Database &database, int id, const char *name, int mode)
{
    SQLite::Statement insert(database,
                             "INSERT INTO address_books (id, name, mode) VALUES (?, ?, ?)");
    insert.bind(1, id);
    insert.bind(2, name);
    insert.bind(3, mode);
    insert.exec();
}

int storedVersion(SQLite::Database &database)
{
    return database.execAndGet("PRAGMA user_version").getInt();
}

// Two processes may meet here on a fresh store; the second one finds the tables made.
void prepareTables(SQLite::Database &database)
{
    if (storedVersion(database) == schema_version)
        return;
    SQLite::Transaction transaction(database, SQLite::TransactionBehavior::IMMEDIATE);
    const int version = storedVersion(database);
    if (version > schema_version)
        throw SQLite::Exception("the contacts store was made by a newer version", SQLITE_MISMATCH);
    if (version == 0) {
        constexpr int changeable = 0;
        constexpr int read_only = 1;
        database.exec(schema);
        addBook(database, device_book, "Device", changeable);
        addBook(database, service_book, service_book_name, read_only);
    }
    if (version == 1)
        database.exec(from_version_1);
    if (version < schema_version) {
        database.exec(parts);
        database.exec(
            "INSERT OR IGNORE INTO number_parts SELECT part, number_id FROM parts_of_numbers");
        database.exec("PRAGMA user_version = " + std::to_string(schema_version));
    }
    transaction.commit();
}

void foldFunction(sqlite3_context *context, int, sqlite3_value **arguments)
{
    if (sqlite3_value_type(arguments[0]) == SQLITE_NULL)
        return;
    try {
        const void *text = sqlite3_value_text(arguments[0]);
        const auto size = static_cast<size_t>(sqlite3_value_bytes(arguments[0]));
        const std::string folded = foldText({static_cast<const char *>(text), size});
        sqlite3_result_text(context, folded.data(), static_cast<int>(folded.size()),
                            SQLITE_TRANSIENT);
    } catch (const std::bad_alloc &) {
        sqlite3_result_error_nomem(context);
    }
}

} // namespace

std::unique_ptr<SQLite::Database> openDatabase(Access access)
{
    const std::filesystem::path file =
        std::filesystem::path(platform::stateDirectory()) / "contacts.db";
    auto database = std::make_unique<SQLite::Database>(
        file.string(), SQLite::OPEN_READWRITE | SQLite::OPEN_CREATE, busy_timeout_ms);
    database->createFunction("fold", 1, true, nullptr, foldFunction);
    database->exec("PRAGMA journal_mode = WAL");
    database->exec("PRAGMA foreign_keys = ON");
    // A large store stays as quick as a small one once it is warm; only pages that are used take
    // room.
    database->exec("PRAGMA cache_size = -65536");
    prepareTables(*database);
    database->exec(access == Access::Read ? "PRAGMA query_only = ON" : "PRAGMA synchronous = FULL");
    return database;
}

int errorOfException() noexcept
{
    try {
        throw;
    } catch (const SQLite::Exception &error) {
        switch (error.getErrorCode()) {
        case SQLITE_BUSY:
        case SQLITE_LOCKED:
            return CONTACTS_ERROR_DB_LOCKED;
        case SQLITE_FULL:
            return CONTACTS_ERROR_FILE_NO_SPACE;
        case SQLITE_NOMEM:
            return CONTACTS_ERROR_OUT_OF_MEMORY;
        case SQLITE_PERM:
        case SQLITE_AUTH:
        case SQLITE_READONLY:
            return CONTACTS_ERROR_PERMISSION_DENIED;
        default:
            return CONTACTS_ERROR_DB;
        }
    } catch (const std::bad_alloc &) {
        return CONTACTS_ERROR_OUT_OF_MEMORY;
    } catch (...) {
        return CONTACTS_ERROR_SYSTEM;
    }
}

} // namespace pelliko::contacts
