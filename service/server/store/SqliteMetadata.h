#pragma once

#include "store/Metadata.h"

#include <filesystem>
#include <memory>

namespace pelliko::server
{

/// Metadata in one SQLite file, in write-ahead mode with a full sync at every commit. Several
/// processes may have the file open: the commands for accounts work beside a running server.
class SqliteMetadata final : public Metadata
{
public:
    explicit SqliteMetadata(const std::filesystem::path &file);
    ~SqliteMetadata() override;

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
    /// One server at a time has the file: its right to write is not looked at.
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

    /// Reads the whole file and throws StorageFailure when it is damaged: who went on with it would
    /// damage more, and answer some accounts and not others.
    void verify();

private:
    struct Connection;
    std::unique_ptr<Connection> m_connection;
};

} // namespace pelliko::server
