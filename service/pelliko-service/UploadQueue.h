#pragma once

#include "ShareApi.h"
#include "SourceFile.h"

#include <cstdint>
#include <memory>
#include <optional>
#include <string>
#include <vector>

namespace SQLite
{
class Database;
}

namespace pelliko::service
{

/** Where a request stands. */
enum class RequestState {
    uploading, ///< accepted; its files are not all on the server, or the server was not told so
    notifying, ///< finished on the server; the application has to send its messages
    ended
};

/** How far the messages of a finished share are. */
enum class SmsState {
    none,      ///< nobody is told by SMS
    wanted,    ///< the application has not been launched, or surely did not get the launch
    launching, ///< a launch was sent; no answer is known
    delivered  ///< the application has settled every message
};

/** A file of a request; a size of -1 means that it was no readable file when it was asked for. */
struct QueuedFile {
    std::string path;
    FileStamp stamp;
};

/** What a client asks for. */
struct NewRequest {
    std::vector<QueuedFile> files;
    std::vector<Recipient> recipients;
    bool wifiOnly = false;
    std::string reshareOf; ///< the server's name of the earlier share, empty for a new upload
    int64_t createdAt = 0; ///< seconds since the epoch
};

/** A request as it is kept. */
struct QueuedRequest {
    int32_t id = 0;
    RequestState state = RequestState::uploading;
    std::vector<QueuedFile> files;
    std::vector<Recipient> recipients;
    bool wifiOnly = false;
    std::string reshareOf;
    std::string key;   ///< random; makes creating the share and sending its messages repeatable
    std::string share; ///< the server's name, empty until it is known
    std::string url;   ///< the link, kept until the messages are on their way
    int64_t expires = 0;
    SmsState smsState = SmsState::none;
    int smsAttempts = 0; ///< launches without an answer
    std::vector<std::string> smsNumbers;
    int endStatus = 0; ///< a PellikoUploadStatus once it has ended
    int error = 0;
    bool delivered = false; ///< a client has confirmed the end, or nobody is going to
    bool withdraw = false;  ///< the share is still to be taken off the server
    bool withdrawn = false; ///< the user took the finished share back
    bool forgotten = false; ///< not shown any more
    int64_t createdAt = 0;
};

/**
 * The durable queue of requests and their history. Every change is on disk when the call returns.
 * Ids are never used again. May be opened on any thread; afterwards it belongs to the main loop.
 * Its functions throw std::exception when the disk fails.
 */
class UploadQueue
{
public:
    explicit UploadQueue(const std::string &file);
    ~UploadQueue();

    /** Where the queue is kept when nothing else is said. */
    static std::string defaultFile();

    /** Takes a request in. @return its id */
    int32_t add(const NewRequest &request);
    std::optional<QueuedRequest> find(int32_t id);
    /** Every request, oldest first. */
    std::vector<int32_t> allIds();
    /** Every request that was not forgotten, newest first. */
    std::vector<int32_t> shownIds();
    /** Requests that have not ended, or whose end no client has heard of. */
    std::vector<int32_t> openIds();

    /** Keeps what was found out about a request's recipients, who are as many as it has. */
    void setFindings(int32_t id, const std::vector<Recipient> &recipients);
    void setShare(int32_t id, const std::string &share);
    /** The server has finished the share: its link and the numbers to be told are kept. */
    void setFinished(int32_t id, const FinishedShare &finished);
    void setSms(int32_t id, SmsState state, int attempts);
    /** The one end of a request; when it leaves a share behind, the share's withdrawal is noted in
     * the same step. */
    void setEnded(int32_t id, int status, int error, bool withdraw, int64_t at);
    void setDelivered(int32_t id);

    /** Requests whose shares are still to be withdrawn from the server. */
    std::vector<int32_t> withdrawals();
    void withdrawalDone(int32_t id);

    /** The user takes a finished share back: it is to be withdrawn. */
    void setWithdrawn(int32_t id);
    /** The request is shown no more. It goes when nothing is left to be done for it. */
    void forget(int32_t id);

    /** Forgets requests that ended, and were heard of, before that time. */
    void forgetBefore(int64_t epochSeconds);

    /** The file itself, for what else is kept in it; borrowed. */
    SQLite::Database &database() { return *db_; }

private:
    void readFiles(QueuedRequest &request);
    void readRecipients(QueuedRequest &request);
    std::vector<int32_t> ids(const char *sql);
    void dropForgotten(int32_t id);

    std::unique_ptr<SQLite::Database> db_;
};

/** 128 random bits in base64url. */
std::string randomKey();

} // namespace pelliko::service
