#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

namespace pelliko::server
{

/// All times are whole seconds since the epoch, given by the caller: a store has no clock.
using Seconds = std::int64_t;

struct Account {
    std::int64_t id = 0;
    std::string number;
    std::string name;
    Seconds created = 0;
};

/// Makes accounts for those who know its code.
struct Invitation {
    std::int64_t id = 0;
    /// The number whose account the code renews; empty for one that makes new accounts.
    std::string number;
    int uses = 1;
    int used = 0;
    Seconds created = 0;
    Seconds expires = 0;
};

struct NewInvitation {
    std::string codeHash;
    std::string number;
    int uses = 1;
    Seconds now = 0;
    Seconds expires = 0;
};

/// Somebody who has an invitation and wants an account.
struct Registration {
    std::string codeHash;
    std::string number;
    std::string tokenHash;
    /// The same again, after an answer that was lost, gives the account another token.
    std::string keyHash;
    Seconds now = 0;
};

enum class RegisterResult {
    registered,
    codeUnknown,
    codeExpired,
    codeUsedUp,
    /// The code renews another number's account.
    codeForOther,
    numberTaken,
};

struct Recipient {
    std::string number;
    /// The sender's country calling code, or empty.
    std::string callingCode;
};

enum class ShareState { uploading = 0, finished = 1, withdrawn = 2, expired = 3 };

struct FileRecord {
    std::string name;
    std::string type;
    std::uint64_t size = 0;
    /// Bytes on stable storage; 0 once the bytes were dropped.
    std::uint64_t offset = 0;
    /// The token of the file's upload address.
    std::string upload;
    /// The key of the file's bytes; empty once they were dropped.
    std::string blob;

    [[nodiscard]] bool complete() const { return !blob.empty() && offset == size; }
};

struct ShareRecord {
    std::string key;
    ShareState state = ShareState::uploading;
    Seconds created = 0;
    /// When a finished share expires, or an unfinished one is given up.
    Seconds deadline = 0;
    std::vector<FileRecord> files;
    std::vector<Recipient> recipients;

    /// Whether the store has lost the bytes of this one of its files. A share that has ended has no
    /// bytes any more, but lost none.
    [[nodiscard]] bool lost(const FileRecord &file) const
    {
        return state == ShareState::finished && file.blob.empty();
    }
};

struct NewFile {
    std::string name;
    std::string type;
    std::uint64_t size = 0;
};

struct NewShare {
    std::int64_t account = 0;
    /// Absent for a share that is not to be found again by it.
    std::optional<std::string> idempotencyKey;
    /// Empty when `reshareOf` names the share whose files these are.
    std::vector<NewFile> files;
    std::optional<std::string> reshareOf;
    std::vector<Recipient> recipients;
    Seconds now = 0;
    Seconds deadline = 0;
    /// Bytes that the account may announce within `limitWindow`, those of this share included.
    std::uint64_t dailyLimit = 0;
    Seconds limitWindow = 86400;
};

struct CreateResult {
    enum class Outcome {
        created,
        known,
        overDailyLimit,
        sourceMissing,
        sourceUnfinished,
        sourceGone
    };
    Outcome outcome = Outcome::created;
    ShareRecord share;
    /// With overDailyLimit: seconds after which the same share fits.
    Seconds retryAfter = 0;
};

struct FinishResult {
    enum class Outcome { finished, missing, incomplete, gone };
    Outcome outcome = Outcome::missing;
    ShareRecord share;
    /// Recipients without an account, each number once, in the share's order.
    std::vector<std::string> sms;
    /// Accounts that have a new push, each once.
    std::vector<std::int64_t> pushed;
};

/// "Somebody shared this with you", waiting until its account acknowledges it.
struct Push {
    /// Grows within the account and is never used twice.
    std::int64_t id = 0;
    std::string contentToken;
};

/// How an account names a share that it received: by the push's id, or else by the hash of its
/// content token.
struct ReceivedKey {
    std::int64_t push = 0;
    std::string tokenHash;
};

/// A share as the account sees it that received it.
struct ReceivedRecord {
    std::int64_t push = 0;
    std::string senderNumber;
    ShareRecord share;
};

/// Which of these numbers have accounts, asked by an account that may ask for so many a day.
struct JoinedQuestion {
    std::int64_t account = 0;
    /// Each once.
    std::vector<std::string> numbers;
    Seconds now = 0;
    /// Numbers that the account may name within `limitWindow`, those of this question included.
    std::uint64_t dailyLimit = 0;
    Seconds limitWindow = 86400;
};

struct JoinedAnswer {
    /// False when the limit is used up: nothing was looked up, nothing counted.
    bool allowed = true;
    /// Those of the numbers that have accounts, in the question's order.
    std::vector<std::string> joined;
    /// When not allowed: seconds after which the same question fits.
    Seconds retryAfter = 0;
};

/// One file as its upload address sees it.
struct UploadRecord {
    std::string share;
    ShareState state = ShareState::uploading;
    Seconds deadline = 0;
    FileRecord file;
};

/// A share as its link sees it.
struct LinkRecord {
    std::string senderNumber;
    ShareRecord share;
};

/// What the server knows about accounts, shares and files. Thread-safe; calls may block. A call has
/// either happened completely and durably when it returns, or throws StorageFailure and has not
/// happened. A share whose deadline is at or before `now` is seen as expired, swept or not.
class Metadata
{
public:
    virtual ~Metadata() = default;

    /// False when the number has an account already.
    virtual bool addAccount(const std::string &number, const std::string &name,
                            const std::string &tokenHash, Seconds now) = 0;
    /// Removes the account with all its shares; false when there is none. Bytes become doomed.
    virtual bool removeAccount(const std::string &number) = 0;
    virtual std::vector<Account> listAccounts() = 0;
    virtual bool hasAccounts() = 0;
    virtual std::optional<Account> findAccount(const std::string &tokenHash) = 0;
    /// Bytes that the account announced after `since`.
    virtual std::uint64_t usedBytes(std::int64_t account, Seconds since) = 0;

    /// Counts the numbers towards the account's limit, then tells which of them have accounts. Only
    /// how many were asked for is kept, never which.
    virtual JoinedAnswer askJoined(const JoinedQuestion &question) = 0;
    virtual void addInvitation(const NewInvitation &invitation) = 0;
    /// Oldest first, the used up and expired ones too as long as they are remembered.
    virtual std::vector<Invitation> listInvitations() = 0;
    /// False when there is none. Accounts that it made stay.
    virtual bool removeInvitation(std::int64_t id) = 0;
    /// Forgets the invitations that expired at or before `expired`.
    virtual void forgetInvitations(Seconds expired) = 0;
    /// Makes an account, or renews one, and counts a use of the code; or does neither.
    virtual RegisterResult registerAccount(const Registration &registration) = 0;

    virtual CreateResult createShare(const NewShare &share) = 0;
    virtual std::optional<ShareRecord> findShare(std::int64_t account, const std::string &key,
                                                 Seconds now) = 0;
    /// Newest first.
    virtual std::vector<ShareRecord> listShares(std::int64_t account, Seconds now) = 0;
    /// Ends the upload, replaces the link and makes a push for each account among the recipients
    /// that has none for this share yet; `deadline` holds only for the first finish.
    virtual FinishResult finishShare(std::int64_t account, const std::string &key,
                                     const std::string &linkHash, Seconds now,
                                     Seconds deadline) = 0;
    /// Returns the keys of the blobs that the share had, or nothing when there is no such share.
    /// Withdrawing a share that is not live changes nothing.
    virtual std::optional<std::vector<std::string>>
    withdrawShare(std::int64_t account, const std::string &key, Seconds now) = 0;
    virtual std::optional<LinkRecord> findLink(const std::string &linkHash, Seconds now) = 0;

    /// The account's oldest pushes that wait, with ids greater than `after`, some of them; an
    /// `after` that was never given out counts as 0. Nothing when the token is no account's.
    virtual std::optional<std::vector<Push>> waitingPushes(const std::string &tokenHash,
                                                           std::int64_t after, Seconds now) = 0;
    /// Ends the waiting of the pushes with ids of at most `upTo`; false when that was never given
    /// out.
    virtual bool acknowledgePushes(std::int64_t account, std::int64_t upTo) = 0;
    /// Also shares that have ended, as long as they are remembered.
    virtual std::optional<ReceivedRecord> findReceived(std::int64_t account, const ReceivedKey &key,
                                                       Seconds now) = 0;
    /// Newest first, without those that ended before their push was acknowledged.
    virtual std::vector<ReceivedRecord> listReceived(std::int64_t account, Seconds now) = 0;
    /// Hides a received share from its account; false when there is none. Forgetting again is true.
    virtual bool forgetReceived(std::int64_t account, const ReceivedKey &key) = 0;

    virtual std::optional<UploadRecord> findUpload(std::int64_t account, const std::string &upload,
                                                   Seconds now) = 0;
    /// Notes that `offset` bytes of the blob are on stable storage; never goes back. False when the
    /// blob is no longer wanted, or `right`, which Peers gave for writing it, is no longer the last
    /// one that was given; 0 asks for no right.
    virtual bool recordOffset(const std::string &blob, std::uint64_t offset,
                              std::int64_t right) = 0;
    bool recordOffset(const std::string &blob, std::uint64_t offset)
    {
        return recordOffset(blob, offset, 0);
    }
    /// Gives the file a new, empty blob; the former one's bytes stay in the account's use. False
    /// when the upload does not exist or its share is not uploading.
    virtual bool resetUpload(std::int64_t account, const std::string &upload, Seconds now) = 0;

    /// Ends every live share whose deadline is at or before `now`; returns their blobs' keys.
    virtual std::vector<std::string> expireShares(Seconds now) = 0;
    /// The earliest deadline of a live share.
    virtual std::optional<Seconds> nextDeadline() = 0;
    /// Forgets the shares that ended at or before `ended`, with their names and numbers, and uses
    /// and questions at or before `used`, which no limit counts any more.
    virtual void forgetEnded(Seconds ended, Seconds used) = 0;
    /// When the first share that is still remembered ended.
    virtual std::optional<Seconds> earliestEnd() = 0;
    /// Keys of blobs that no live share needs, some of them, oldest first.
    virtual std::vector<std::string> doomedBlobs() = 0;
    /// Those of the keys that are no blob's: neither needed, nor doomed and not yet forgotten.
    virtual std::vector<std::string> unknownBlobs(const std::vector<std::string> &keys) = 0;
    /// The blob's bytes are gone: forgets its key.
    virtual void forgetBlob(const std::string &blob) = 0;

    /// Throws when the store does not answer.
    virtual void ping() = 0;
};

} // namespace pelliko::server
