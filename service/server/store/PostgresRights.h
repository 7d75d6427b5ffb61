#pragma once

#include "store/Peers.h"
#include "store/PostgresConnection.h"

#include <chrono>
#include <list>
#include <map>
#include <optional>
#include <set>
#include <string>

namespace pelliko::server
{

/// The rights to write blobs that one session has or waits for. One thread.
class PostgresRights
{
public:
    using Clock = std::chrono::steady_clock;

    /// Takes the session's number from the database.
    explicit PostgresRights(PostgresConnection &db);

    /// As Peers::claim; while another server has the blob it is asked for it and this one waits.
    void claim(const std::string &blob, Peers::ClaimDone done);
    void release(const std::string &blob);

    /// Another server has let go of this blob.
    void freed(std::int64_t id);
    /// Another server wants this blob, or its share has ended: its key, when it is ours.
    std::optional<std::string> wanted(std::int64_t id);

    /// When `takeOver` has something to do.
    [[nodiscard]] std::optional<Clock::time_point> nextTakeOver() const;
    /// Takes the blobs whose holders were asked long enough ago.
    void takeOver();

    /// Tells all who wait that there is nothing to wait for.
    void fail(const std::exception_ptr &error);

private:
    struct Waiting {
        std::string blob;
        std::int64_t id = 0;
        Clock::time_point until;
        Peers::ClaimDone done;
    };

    /// What came of trying to take a blob.
    struct Try {
        std::int64_t id = 0;
        /// It is this session's now, or is not there at all.
        bool isOurs = true;
        std::optional<std::uint64_t> noted{};
    };

    Try tryTake(const std::string &blob);
    void letGo(const std::string &blob);
    void hold(const std::string &blob, const Try &taken, const Peers::ClaimDone &done);
    void unlock(std::int64_t id);
    void tell(const char *word, std::int64_t id);

    PostgresConnection &m_db;
    std::int64_t m_number = 0;
    /// Blobs that this session writes.
    std::map<std::string, std::int64_t> m_held;
    std::map<std::int64_t, std::string> m_keys;
    /// Those of them that somebody waits for.
    std::set<std::int64_t> m_wanted;
    std::list<Waiting> m_waiting;
};

} // namespace pelliko::server
