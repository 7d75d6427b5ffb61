#include "Store.h"

#include <filesystem>
#include <optional>

#include <SQLiteCpp/SQLiteCpp.h>
#include <sqlite3.h>

#include "notification.h"

namespace pelliko::quickpanel
{
namespace
{

// The desktop's number sits in the notification's own row, so that it goes when the row goes.
constexpr const char *schema = R"(
    CREATE TABLE IF NOT EXISTS notification (
        id INTEGER PRIMARY KEY AUTOINCREMENT,
        app TEXT NOT NULL,
        tag TEXT,
        content TEXT NOT NULL,
        desktop_number INTEGER NOT NULL DEFAULT 0,
        desktop_owner TEXT NOT NULL DEFAULT '');
    CREATE UNIQUE INDEX IF NOT EXISTS notification_tag ON notification (app, tag);
    CREATE TABLE IF NOT EXISTS history (
        sequence INTEGER PRIMARY KEY AUTOINCREMENT,
        content TEXT NOT NULL);
)";

std::string print(const Variant &value)
{
    gchar *text = g_variant_print(value.get(), TRUE);
    std::string result = text;
    g_free(text);
    return result;
}

// An unreadable row reads as an empty notification rather than stopping the panel.
Variant parse(const char *text)
{
    GVariant *value = g_variant_parse(G_VARIANT_TYPE_VARDICT, text, nullptr, nullptr, nullptr);
    if (!value)
        return Variant(g_variant_new("a{sv}", nullptr));
    return Variant::adopt(value);
}

Record recordOf(SQLite::Statement &row)
{
    Record record = notification::recordFrom(parse(row.getColumn(2).getText()).get());
    record.id = row.getColumn(0).getInt64();
    record.app = row.getColumn(1).getText();
    return record;
}

} // namespace

class Store::Database : public SQLite::Database
{
public:
    explicit Database(const std::string &path)
        : SQLite::Database(path, SQLite::OPEN_READWRITE | SQLite::OPEN_CREATE, 2000)
    {
        exec("PRAGMA journal_mode = WAL");
        exec("PRAGMA synchronous = FULL");
        // What is damaged deep inside would refuse every post from now on.
        if (execAndGet("PRAGMA quick_check(1)").getString() != "ok")
            throw SQLite::Exception("the file is damaged", SQLITE_CORRUPT);
        exec(schema);
    }

    void insert(Record &record)
    {
        SQLite::Statement statement(
            *this, "INSERT INTO notification (app, tag, content) VALUES (?, ?, ?)");
        statement.bind(1, record.app);
        bindTag(statement, 2, record);
        statement.bind(3, print(notification::toVariant(record)));
        statement.exec();
        record.id = getLastInsertRowid();
    }

    // What replaces a notification takes over its place on the desktop.
    void inheritDesktop(int64_t from, int64_t to)
    {
        SQLite::Statement statement(
            *this, "UPDATE notification SET (desktop_number, desktop_owner) = "
                   "(SELECT desktop_number, desktop_owner FROM notification WHERE id = ?1) "
                   "WHERE id = ?2 AND EXISTS (SELECT 1 FROM notification WHERE id = ?1)");
        statement.bind(1, from);
        statement.bind(2, to);
        statement.exec();
    }

    void clearTag(int64_t id)
    {
        SQLite::Statement statement(*this, "UPDATE notification SET tag = NULL WHERE id = ?");
        statement.bind(1, id);
        statement.exec();
    }

    void change(const Record &record)
    {
        SQLite::Statement statement(*this,
                                    "UPDATE notification SET tag = ?, content = ? WHERE id = ?");
        bindTag(statement, 1, record);
        statement.bind(2, print(notification::toVariant(record)));
        statement.bind(3, record.id);
        statement.exec();
    }

    void erase(int64_t id)
    {
        SQLite::Statement statement(*this, "DELETE FROM notification WHERE id = ?");
        statement.bind(1, id);
        statement.exec();
    }

    void appendHistory(Event &event)
    {
        event.at = g_get_real_time();
        SQLite::Statement statement(*this, "INSERT INTO history (content) VALUES (?)");
        statement.bind(1, print(toVariant(event)));
        statement.exec();
        event.sequence = getLastInsertRowid();
        SQLite::Statement trim(*this, "DELETE FROM history WHERE sequence <= ?");
        trim.bind(1, event.sequence - historyLength);
        trim.exec();
    }

private:
    static void bindTag(SQLite::Statement &statement, int index, const Record &record)
    {
        // Null tags do not count for the unique index.
        if (record.tag.empty())
            statement.bind(index);
        else
            statement.bind(index, record.tag);
    }
};

namespace
{

// While it lives a commit does not wait until the disk has it. A killed panel loses nothing
// thereby, a power cut perhaps the last changes.
class WithoutWaiting
{
public:
    explicit WithoutWaiting(SQLite::Database &database) : database_(database)
    {
        database_.tryExec("PRAGMA synchronous = NORMAL");
    }
    ~WithoutWaiting() { database_.tryExec("PRAGMA synchronous = FULL"); }
    WithoutWaiting(const WithoutWaiting &) = delete;
    WithoutWaiting &operator=(const WithoutWaiting &) = delete;

private:
    SQLite::Database &database_;
};

} // namespace

Store::Store(const std::string &path)
{
    try {
        database_ = std::make_unique<Database>(path);
    } catch (const SQLite::Exception &error) {
        if (error.getErrorCode() != SQLITE_NOTADB && error.getErrorCode() != SQLITE_CORRUPT)
            throw;
        g_printerr("quickpanel: %s is no readable store, it is kept as %s.broken\n", path.c_str(),
                   path.c_str());
        std::filesystem::rename(path, path + ".broken");
        database_ = std::make_unique<Database>(path);
    }
}

Store::~Store() = default;

std::optional<Record> Store::find(int64_t id) const
{
    SQLite::Statement statement(*database_,
                                "SELECT id, app, content FROM notification WHERE id = ?");
    statement.bind(1, id);
    return statement.executeStep() ? std::optional(recordOf(statement)) : std::nullopt;
}

std::optional<Record> Store::findByTag(const std::string &app, const std::string &tag) const
{
    SQLite::Statement statement(
        *database_, "SELECT id, app, content FROM notification WHERE app = ? AND tag = ?");
    statement.bind(1, app);
    statement.bind(2, tag);
    return statement.executeStep() ? std::optional(recordOf(statement)) : std::nullopt;
}

std::optional<std::string> Store::posterOf(int64_t id) const
{
    SQLite::Statement statement(*database_, "SELECT app FROM notification WHERE id = ?");
    statement.bind(1, id);
    return statement.executeStep() ? std::optional(statement.getColumn(0).getString())
                                   : std::nullopt;
}

std::optional<int64_t> Store::idOfTag(const std::string &app, const std::string &tag) const
{
    SQLite::Statement statement(*database_,
                                "SELECT id FROM notification WHERE app = ? AND tag = ?");
    statement.bind(1, app);
    statement.bind(2, tag);
    return statement.executeStep() ? std::optional(statement.getColumn(0).getInt64())
                                   : std::nullopt;
}

std::vector<Record> Store::list(const std::string &app) const
{
    SQLite::Statement statement(
        *database_,
        "SELECT id, app, content FROM notification WHERE ?1 = '' OR app = ?1 ORDER BY id");
    statement.bind(1, app);
    std::vector<Record> records;
    while (statement.executeStep())
        records.push_back(recordOf(statement));
    return records;
}

std::vector<Variant> Store::history() const
{
    SQLite::Statement statement(*database_,
                                "SELECT sequence, content FROM history ORDER BY sequence");
    std::vector<Variant> events;
    while (statement.executeStep()) {
        GVariantDict event;
        g_variant_dict_init(&event, parse(statement.getColumn(1).getText()).get());
        g_variant_dict_insert(&event, "seq", "x", statement.getColumn(0).getInt64());
        events.emplace_back(g_variant_dict_end(&event));
    }
    return events;
}

void Store::post(Event &event)
{
    SQLite::Transaction transaction(*database_);
    if (event.replaced != 0)
        database_->clearTag(event.replaced);
    database_->insert(event.record);
    if (event.replaced != 0) {
        database_->inheritDesktop(event.replaced, event.record.id);
        database_->erase(event.replaced);
    }
    database_->appendHistory(event);
    transaction.commit();
}

// How far an upload is comes many times a second, while its poster waits, and is worth nothing
// after a power cut: only that there is such a notification is.
void Store::update(Event &event)
{
    std::optional<WithoutWaiting> hasty;
    if (event.record.type == NOTIFICATION_TYPE_ONGOING)
        hasty.emplace(*database_);
    SQLite::Transaction transaction(*database_);
    database_->change(event.record);
    database_->appendHistory(event);
    transaction.commit();
}

void Store::remove(Event &event)
{
    SQLite::Transaction transaction(*database_);
    database_->erase(event.record.id);
    database_->appendHistory(event);
    transaction.commit();
}

void Store::removeAll(std::vector<Event> &events)
{
    SQLite::Transaction transaction(*database_);
    for (auto &event : events) {
        database_->erase(event.record.id);
        database_->appendHistory(event);
    }
    transaction.commit();
}

void Store::append(Event &event)
{
    SQLite::Transaction transaction(*database_);
    database_->appendHistory(event);
    transaction.commit();
}

void Store::forget(int64_t id)
{
    database_->erase(id);
}

DesktopId Store::desktopId(int64_t id) const
{
    SQLite::Statement statement(
        *database_, "SELECT desktop_number, desktop_owner FROM notification WHERE id = ?");
    statement.bind(1, id);
    if (!statement.executeStep())
        return {};
    return {statement.getColumn(0).getUInt(), statement.getColumn(1).getText()};
}

void Store::setDesktopId(int64_t id, const DesktopId &shown)
{
    SQLite::Statement statement(
        *database_, "UPDATE notification SET desktop_number = ?, desktop_owner = ? WHERE id = ?");
    statement.bind(1, static_cast<int64_t>(shown.number));
    statement.bind(2, shown.owner);
    statement.bind(3, id);
    statement.exec();
}

} // namespace pelliko::quickpanel
