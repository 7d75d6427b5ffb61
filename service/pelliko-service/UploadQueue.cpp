#include "UploadQueue.h"

#include "QueueFile.h"

#include <SQLiteCpp/SQLiteCpp.h>
#include <SQLiteCpp/VariadicBind.h>
#include <glib.h>
#include <sys/random.h>

#include <array>
#include <stdexcept>

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

void addFiles(SQLite::Database &db, int64_t id, const std::vector<QueuedFile> &files)
{
    SQLite::Statement insert(db, "INSERT INTO files VALUES (?, ?, ?, ?, ?)");
    int position = 0;
    for (const QueuedFile &file : files) {
        insert.bind(1, id);
        insert.bind(2, position++);
        insert.bind(3, file.path.data(), static_cast<int>(file.path.size()));
        insert.bind(4, file.stamp.size);
        insert.bind(5, file.stamp.mtimeNs);
        insert.exec();
        insert.reset();
    }
}

void addRecipients(SQLite::Database &db, int64_t id, const std::vector<Recipient> &recipients)
{
    SQLite::Statement insert(db,
                             "INSERT INTO recipients (request, position, ccc, number, number_id)"
                             " VALUES (?, ?, ?, ?, ?)");
    int position = 0;
    for (const Recipient &recipient : recipients) {
        SQLite::bind(insert, id, position++, recipient.ccc, recipient.number, recipient.numberId);
        insert.exec();
        insert.reset();
    }
}
} // namespace

std::string randomKey()
{
    std::array<unsigned char, 16> bits{};
    if (getrandom(bits.data(), bits.size(), 0) != static_cast<ssize_t>(bits.size())) {
        throw std::runtime_error("the system gives no random numbers");
    }
    g_autofree char *text = g_base64_encode(bits.data(), bits.size());
    g_strdelimit(text, "+", '-');
    g_strdelimit(text, "/", '_');
    return std::string(text, 22);
}

std::string UploadQueue::defaultFile()
{
    g_autofree char *path =
        g_build_filename(g_get_user_data_dir(), "pelliko-service", "queue.db", nullptr);
    return path;
}

UploadQueue::UploadQueue(const std::string &file) : db_(openQueueFile(file)) {}

UploadQueue::~UploadQueue() = default;

int32_t UploadQueue::add(const NewRequest &request)
{
    SQLite::Transaction transaction(*db_, SQLite::TransactionBehavior::IMMEDIATE);
    execute(*db_,
            "INSERT INTO requests (state, wifi_only, reshare_of, idempotency_key, created_at)"
            " VALUES (0, ?, ?, ?, ?)",
            request.wifiOnly ? 1 : 0, request.reshareOf, randomKey(), request.createdAt);
    const int64_t id = db_->getLastInsertRowid();
    addFiles(*db_, id, request.files);
    addRecipients(*db_, id, request.recipients);
    transaction.commit();
    return static_cast<int32_t>(id);
}

std::optional<QueuedRequest> UploadQueue::find(int32_t id)
{
    SQLite::Statement query(
        *db_,
        "SELECT state, wifi_only, reshare_of, idempotency_key, share, url, expires, sms_state,"
        " sms_attempts, end_status, error, delivered, withdraw, withdrawn, created_at, forgotten"
        " FROM requests WHERE id = ?");
    query.bind(1, id);
    if (!query.executeStep()) {
        return std::nullopt;
    }
    QueuedRequest request;
    request.id = id;
    request.state = static_cast<RequestState>(query.getColumn(0).getInt());
    request.wifiOnly = query.getColumn(1).getInt() != 0;
    request.reshareOf = query.getColumn(2).getString();
    request.key = query.getColumn(3).getString();
    request.share = query.getColumn(4).getString();
    request.url = query.getColumn(5).getString();
    request.expires = query.getColumn(6).getInt64();
    request.smsState = static_cast<SmsState>(query.getColumn(7).getInt());
    request.smsAttempts = query.getColumn(8).getInt();
    request.endStatus = query.getColumn(9).getInt();
    request.error = query.getColumn(10).getInt();
    request.delivered = query.getColumn(11).getInt() != 0;
    request.withdraw = query.getColumn(12).getInt() != 0;
    request.withdrawn = query.getColumn(13).getInt() != 0;
    request.createdAt = query.getColumn(14).getInt64();
    request.forgotten = query.getColumn(15).getInt() != 0;
    readFiles(request);
    readRecipients(request);
    return request;
}

void UploadQueue::readFiles(QueuedRequest &request)
{
    SQLite::Statement query(
        *db_, "SELECT path, size, mtime_ns FROM files WHERE request = ? ORDER BY position");
    query.bind(1, request.id);
    while (query.executeStep()) {
        request.files.push_back({query.getColumn(0).getString(),
                                 {query.getColumn(1).getInt64(), query.getColumn(2).getInt64()}});
    }
}

void UploadQueue::readRecipients(QueuedRequest &request)
{
    SQLite::Statement query(*db_,
                            "SELECT ccc, number, number_id, e164, fault, joined FROM recipients"
                            " WHERE request = ? ORDER BY position");
    query.bind(1, request.id);
    while (query.executeStep()) {
        request.recipients.push_back(
            {query.getColumn(0).getString(), query.getColumn(1).getString(),
             query.getColumn(2).getInt(), query.getColumn(3).getString(),
             query.getColumn(4).getString(), static_cast<Joined>(query.getColumn(5).getInt())});
    }
    SQLite::Statement sms(*db_,
                          "SELECT number FROM sms_numbers WHERE request = ? ORDER BY position");
    sms.bind(1, request.id);
    while (sms.executeStep()) {
        request.smsNumbers.push_back(sms.getColumn(0).getString());
    }
}

std::vector<int32_t> UploadQueue::ids(const char *sql)
{
    SQLite::Statement query(*db_, sql);
    std::vector<int32_t> result;
    while (query.executeStep()) {
        result.push_back(query.getColumn(0).getInt());
    }
    return result;
}

std::vector<int32_t> UploadQueue::allIds()
{
    return ids("SELECT id FROM requests ORDER BY id");
}

std::vector<int32_t> UploadQueue::shownIds()
{
    return ids("SELECT id FROM requests WHERE forgotten = 0 ORDER BY id DESC");
}

std::vector<int32_t> UploadQueue::openIds()
{
    return ids("SELECT id FROM requests WHERE state < 2 OR delivered = 0 ORDER BY id");
}

void UploadQueue::setFindings(int32_t id, const std::vector<Recipient> &recipients)
{
    SQLite::Transaction transaction(*db_, SQLite::TransactionBehavior::IMMEDIATE);
    int position = 0;
    for (const Recipient &recipient : recipients) {
        execute(*db_,
                "UPDATE recipients SET e164 = ?, fault = ?, joined = ?"
                " WHERE request = ? AND position = ?",
                recipient.e164, recipient.fault, static_cast<int>(recipient.joined), id,
                position++);
    }
    transaction.commit();
}

void UploadQueue::setShare(int32_t id, const std::string &share)
{
    execute(*db_, "UPDATE requests SET share = ? WHERE id = ?", share, id);
}

void UploadQueue::setFinished(int32_t id, const FinishedShare &finished)
{
    SQLite::Transaction transaction(*db_, SQLite::TransactionBehavior::IMMEDIATE);
    const auto sms = finished.sms.empty() ? SmsState::none : SmsState::wanted;
    execute(*db_, "UPDATE requests SET state = 1, url = ?, expires = ?, sms_state = ? WHERE id = ?",
            finished.sms.empty() ? std::string() : finished.url, finished.expires,
            static_cast<int>(sms), id);
    int position = 0;
    for (const std::string &number : finished.sms) {
        execute(*db_, "INSERT INTO sms_numbers VALUES (?, ?, ?)", id, position++, number);
    }
    transaction.commit();
}

void UploadQueue::setSms(int32_t id, SmsState state, int attempts)
{
    execute(*db_, "UPDATE requests SET sms_state = ?, sms_attempts = ? WHERE id = ?",
            static_cast<int>(state), attempts, id);
}

void UploadQueue::setEnded(int32_t id, int status, int error, bool withdraw, int64_t at)
{
    // The link opens the share for anyone: it is not kept longer than it is needed.
    execute(*db_,
            "UPDATE requests SET state = 2, url = '', end_status = ?, error = ?, withdraw = ?,"
            " ended_at = ? WHERE id = ? AND state < 2",
            status, error, withdraw ? 1 : 0, at, id);
}

void UploadQueue::setDelivered(int32_t id)
{
    execute(*db_, "UPDATE requests SET delivered = 1 WHERE id = ?", id);
    dropForgotten(id);
}

std::vector<int32_t> UploadQueue::withdrawals()
{
    return ids("SELECT id FROM requests WHERE withdraw = 1 ORDER BY id");
}

void UploadQueue::withdrawalDone(int32_t id)
{
    execute(*db_, "UPDATE requests SET withdraw = 0 WHERE id = ?", id);
    dropForgotten(id);
}

void UploadQueue::setWithdrawn(int32_t id)
{
    execute(*db_,
            "UPDATE requests SET withdrawn = 1, withdraw = 1 WHERE id = ? AND state = 2"
            " AND withdrawn = 0",
            id);
}

void UploadQueue::forget(int32_t id)
{
    execute(*db_, "UPDATE requests SET forgotten = 1 WHERE id = ? AND state = 2", id);
    dropForgotten(id);
}

void UploadQueue::dropForgotten(int32_t id)
{
    execute(*db_,
            "DELETE FROM requests WHERE id = ? AND forgotten = 1 AND state = 2 AND delivered = 1"
            " AND withdraw = 0",
            id);
}

void UploadQueue::forgetBefore(int64_t epochSeconds)
{
    execute(*db_,
            "DELETE FROM requests WHERE state = 2 AND delivered = 1 AND withdraw = 0"
            " AND ended_at < ?",
            epochSeconds);
}

} // namespace pelliko::service
