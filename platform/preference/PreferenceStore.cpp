#include "PreferenceStore.h"

#include <ApplicationId.h>
#include <StateDir.h>

#include <SQLiteCpp/SQLiteCpp.h>
#include <dlog.h>
#include <sqlite3.h>

#include <filesystem>
#include <limits>
#include <memory>
#include <mutex>

namespace pelliko::preference
{

namespace
{

constexpr int kBusyMilliseconds = 5000;

// Numbers of the types in the file; the order of Value's alternatives.
enum Type { kInt = 0, kDouble = 1, kText = 2, kBoolean = 3 };

std::mutex storeMutex;
std::unique_ptr<SQLite::Database> opened;

std::unique_ptr<SQLite::Database> openSound(const std::string &file)
{
    auto made = std::make_unique<SQLite::Database>(
        file, SQLite::OPEN_READWRITE | SQLite::OPEN_CREATE, kBusyMilliseconds);
    // One write to stable storage per set: the log of the journal is flushed before it returns.
    made->exec("PRAGMA journal_mode = WAL");
    made->exec("PRAGMA synchronous = FULL");
    made->exec("CREATE TABLE IF NOT EXISTS preference "
               "(key TEXT PRIMARY KEY, type INTEGER NOT NULL, value)");
    if (made->execAndGet("PRAGMA quick_check(1)").getString() != "ok")
        throw SQLite::Exception("the file is damaged", SQLITE_CORRUPT);
    return made;
}

// Who cannot keep a value any more waits for it forever: values that are lost cost less.
std::unique_ptr<SQLite::Database> open()
{
    const std::string folder = platform::stateDirectory() + "/preferences";
    platform::createPrivateDirectories(folder);
    const std::string file = folder + "/" + platform::applicationId() + ".db";
    try {
        return openSound(file);
    } catch (const SQLite::Exception &error) {
        if (error.getErrorCode() != SQLITE_NOTADB && error.getErrorCode() != SQLITE_CORRUPT)
            throw;
    }
    dlog_print(DLOG_ERROR, "PREFERENCE", "%s is damaged: it is kept as .broken, a new one begins",
               file.c_str());
    std::filesystem::rename(file, file + ".broken");
    return openSound(file);
}

// Runs `work` on the open store. An error closes it, so that the next call starts afresh.
template <typename Work> Outcome onStore(const char *what, Work work) noexcept
{
    const std::lock_guard<std::mutex> lock(storeMutex);
    try {
        if (!opened)
            opened = open();
        return work(*opened);
    } catch (const std::exception &error) {
        dlog_print(DLOG_ERROR, "PREFERENCE", "cannot %s: %s", what, error.what());
        opened.reset();
        return Outcome::Failed;
    }
}

std::optional<Value> valueOf(const SQLite::Column &type, const SQLite::Column &value)
{
    switch (type.getInt()) {
    case kInt:
        return Value(value.getInt());
    case kDouble:
        // SQLite keeps "not a number" as NULL.
        return Value(value.isNull() ? std::numeric_limits<double>::quiet_NaN() : value.getDouble());
    case kText:
        return Value(value.getString());
    case kBoolean:
        return Value(value.getInt() != 0);
    default:
        return std::nullopt;
    }
}

struct Binder {
    SQLite::Statement &statement;
    int index;
    void operator()(int value) const { statement.bind(index, value); }
    void operator()(double value) const { statement.bind(index, value); }
    void operator()(const std::string &value) const { statement.bind(index, value); }
    void operator()(bool value) const { statement.bind(index, value ? 1 : 0); }
};

} // namespace

Outcome readValue(const std::string &key, std::optional<Value> *value)
{
    return onStore("read a value", [&](SQLite::Database &store) {
        SQLite::Statement query(store, "SELECT type, value FROM preference WHERE key = ?");
        query.bind(1, key);
        if (!query.executeStep())
            return Outcome::Absent;
        *value = valueOf(query.getColumn(0), query.getColumn(1));
        return *value ? Outcome::Done : Outcome::Failed;
    });
}

Outcome writeValue(const std::string &key, const Value &value)
{
    return onStore("write a value", [&](SQLite::Database &store) {
        SQLite::Statement insert(store,
                                 "INSERT INTO preference (key, type, value) VALUES (?, ?, ?) "
                                 "ON CONFLICT (key) DO UPDATE SET type = excluded.type, "
                                 "value = excluded.value");
        insert.bind(1, key);
        insert.bind(2, static_cast<int>(value.index()));
        std::visit(Binder{insert, 3}, value);
        insert.exec();
        return Outcome::Done;
    });
}

Outcome removeValue(const std::string &key)
{
    return onStore("remove a value", [&](SQLite::Database &store) {
        SQLite::Statement removal(store, "DELETE FROM preference WHERE key = ?");
        removal.bind(1, key);
        return removal.exec() > 0 ? Outcome::Done : Outcome::Absent;
    });
}

Outcome removeAllValues()
{
    return onStore("remove all values", [&](SQLite::Database &store) {
        store.exec("DELETE FROM preference");
        return Outcome::Done;
    });
}

} // namespace pelliko::preference
