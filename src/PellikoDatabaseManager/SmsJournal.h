#pragma once

#include <memory>
#include <optional>
#include <string>

struct sqlite3;

// What has become of each message of a share, so that a share whose messages are asked for again -
// because this application or the service was killed in between - sends only what is still owed.

namespace pelliko
{

/// What is known of one message.
enum class SmsState {
    none,    ///< never begun
    sending, ///< it was given to the messaging service; the answer is not known
    sent,
    failed, ///< refused; it is not tried again
    unknown ///< nobody can tell whether it was sent; it is not tried again
};

struct SmsEntry {
    SmsState state = SmsState::none;
    std::string text; ///< while it is being sent: the text that it was given away with
};

/// The messages of one share. Only one worker of all processes has a journal open: the next waits
/// until the first is done or dead. Every change is on disk when the call returns. Failures are
/// logged. For a worker thread, never the main loop.
class SmsJournal
{
public:
    /// @param key names the share among all shares, for good. Nothing when there is no place for
    /// the journal.
    static std::unique_ptr<SmsJournal> open(const std::string &key);
    ~SmsJournal();
    SmsJournal(const SmsJournal &) = delete;
    SmsJournal &operator=(const SmsJournal &) = delete;

    /// Nothing when the journal cannot be read.
    std::optional<SmsEntry> find(const std::string &number);
    /// To be noted before the message is given away; false: it must not be.
    bool begin(const std::string &number, const std::string &text);
    /// To be noted when its end is known. False: the message stays in the state `sending`.
    bool settle(const std::string &number, SmsState state);

private:
    SmsJournal(std::string key, int lock);
    int prepare();
    bool change(const char *statement, const std::string &number, int state,
                const std::string &text);

    std::string key_;
    int lock_;
    sqlite3 *database_ = nullptr;
};

} // namespace pelliko
