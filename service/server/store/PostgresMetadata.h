#pragma once

#include "store/Metadata.h"

#include <cstddef>
#include <memory>
#include <string>

namespace pelliko::server
{

class PostgresPool;
class PostgresClock;

/// Metadata in a PostgreSQL database, for any number of servers at once. A database that cannot be
/// reached is a StorageFailure of the kind `unavailable`.
class PostgresMetadata final : public Metadata
{
public:
    /// Connects, and makes or brings up to date the tables; `connections` is how many calls run at
    /// once, others wait.
    PostgresMetadata(const std::string &url, std::size_t connections);
    ~PostgresMetadata() override;

    bool addAccount(const std::string &number, const std::string &name,
                    const std::string &tokenHash, Seconds now) override;
    bool removeAccount(const std::string &number) override;
    std::vector<Account> listAccounts() override;
    bool hasAccounts() override;
    std::optional<Account> findAccount(const std::string &tokenHash) override;
    std::uint64_t usedBytes(std::int64_t account, Seconds since) override;

    JoinedAnswer askJoined(const JoinedQuestion &question) override;
    void addInvitation(const NewInvitation &invitation) override;
    std::vector<Invitation> listInvitations() override;
    bool removeInvitation(std::int64_t id) override;
    void forgetInvitations(Seconds expired) override;
    RegisterResult registerAccount(const Registration &registration) override;

    CreateResult createShare(const NewShare &share) override;
    std::optional<ShareRecord> findShare(std::int64_t account, const std::string &key,
                                         Seconds now) override;
    std::vector<ShareRecord> listShares(std::int64_t account, Seconds now) override;
    FinishResult finishShare(std::int64_t account, const std::string &key,
                             const std::string &linkHash, Seconds now, Seconds deadline) override;
    std::optional<std::vector<std::string>>
    withdrawShare(std::int64_t account, const std::string &key, Seconds now) override;
    std::optional<LinkRecord> findLink(const std::string &linkHash, Seconds now) override;

    std::optional<std::vector<Push>> waitingPushes(const std::string &tokenHash, std::int64_t after,
                                                   Seconds now) override;
    bool acknowledgePushes(std::int64_t account, std::int64_t upTo) override;
    std::optional<ReceivedRecord> findReceived(std::int64_t account, const ReceivedKey &key,
                                               Seconds now) override;
    std::vector<ReceivedRecord> listReceived(std::int64_t account, Seconds now) override;
    bool forgetReceived(std::int64_t account, const ReceivedKey &key) override;

    std::optional<UploadRecord> findUpload(std::int64_t account, const std::string &upload,
                                           Seconds now) override;
    bool recordOffset(const std::string &blob, std::uint64_t offset, std::int64_t right) override;
    using Metadata::recordOffset;
    bool resetUpload(std::int64_t account, const std::string &upload, Seconds now) override;

    std::vector<std::string> expireShares(Seconds now) override;
    std::optional<Seconds> nextDeadline() override;
    void forgetEnded(Seconds ended, Seconds used) override;
    std::optional<Seconds> earliestEnd() override;
    std::vector<std::string> doomedBlobs() override;
    std::vector<std::string> unknownBlobs(const std::vector<std::string> &keys) override;
    void forgetBlob(const std::string &blob) override;
    void ping() override;

    /// The database's time; set once, to be set again by whoever runs for long.
    [[nodiscard]] const std::shared_ptr<PostgresClock> &clock() const { return m_clock; }

private:
    std::unique_ptr<PostgresPool> m_pool;
    std::shared_ptr<PostgresClock> m_clock;
};

} // namespace pelliko::server
