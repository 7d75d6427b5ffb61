// What was received, on disk
#pragma once

#include "Account.h"

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

namespace SQLite
{
class Database;
}

namespace pelliko::service
{

class UploadQueue;

/** What became of a received share; the values are on disk. */
enum class ReceivedState { available = 0, expired = 1, withdrawn = 2 };

struct ReceivedFile {
    std::string name; ///< as the server tells it
    int64_t size = 0;
    std::string type;
};

/** What the server tells of a received share. */
struct ReceivedDetails {
    std::string sender;
    int64_t created = 0;
    int64_t expires = 0;
    ReceivedState state = ReceivedState::available;
    std::vector<ReceivedFile> files;
};

/** A received share as it is kept. */
struct ReceivedShare {
    std::string token;
    int64_t received = 0; ///< seconds since the epoch
    ReceivedDetails details;
};

/** How far the pushes of an account are. */
struct PushPosition {
    int64_t stored = 0;       ///< the last push that is in the journal
    int64_t acknowledged = 0; ///< the last one that the server knows of
};

/**
 * The shares that were received, in the queue's file. Every change is on disk when the call
 * returns. A token is taken in once, however often it is announced, also after it was forgotten.
 * Belongs to the main loop; throws std::exception when the disk fails.
 */
class ReceivedJournal
{
public:
    explicit ReceivedJournal(UploadQueue &queue);

    PushPosition position(const Account &account);
    /** A push arrived: its token and the new position, in one step. @param id greater than 0 */
    void announce(const Account &account, int64_t id, const std::string &token, int64_t now);
    void setAcknowledged(const Account &account, int64_t upTo);
    /** The server does not know the position: the stream begins anew. */
    void forgetPosition(const Account &account);

    /** Tokens of which nothing but the announcement is known, oldest first. */
    std::vector<std::string> unread();
    void setDetails(const std::string &token, const ReceivedDetails &details);
    /** Keeps a share that was not announced but asked for. */
    void keep(const std::string &token, const ReceivedDetails &details, int64_t now);

    /** Tokens that the application has to be told, oldest first, with the launches whose receipt is
     * missing. */
    struct Untold {
        std::string token;
        int attempts = 0;
    };
    std::vector<Untold> untold(size_t most);
    void countLaunch(const std::vector<Untold> &tokens, int change);
    void setTold(const std::vector<Untold> &tokens);

    std::optional<ReceivedShare> find(const std::string &token);
    /** All that are known, newest first. */
    std::vector<ReceivedShare> all();

    /** Leaves nothing but the token, so that it is not taken in again. @param onServer whether the
     * server is to forget it too */
    void forget(const std::string &token, bool onServer);
    std::vector<std::string> toForgetOnServer();
    void forgottenOnServer(const std::string &token);

    /** Drops shares that ended before that time, and marks of forgotten ones as old. */
    void dropBefore(int64_t epochSeconds);

private:
    std::vector<ReceivedFile> filesOf(int64_t share);
    std::vector<std::string> tokens(const char *sql);
    void writeDetails(const std::string &token, const ReceivedDetails &details);

    SQLite::Database &db_;
};

} // namespace pelliko::service
