// The user's file of usage records, and the switch that stops collecting them.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

namespace pelliko::velmora
{

/// Where the log lives and how large it may become.
struct RecordLogPlace {
    std::string folder;          ///< of the records, made private when missing
    std::string switchFile;      ///< exists while collecting is off
    int64_t limit = 1024 * 1024; ///< bytes of all records together

    /// $XDG_STATE_HOME/velmora and $XDG_CONFIG_HOME/velmora/usage-log-off of this user.
    static RecordLogPlace ofUser();
};

/// Whole lines, appended by any number of processes and threads. The newest are in usage.jsonl;
/// when that holds half of the limit it becomes usage.1.jsonl, and the one before is gone. Errors
/// are negated errno values.
class RecordLog
{
public:
    explicit RecordLog(RecordLogPlace place) : place_(std::move(place)) {}

    /// Makes the folder, so that a failure shows early.
    int prepare() const;

    /// Appends a line that ends in a newline: whole or not at all. It survives the end of the
    /// process at once, a loss of power as soon as the system writes it back. NOT_PERMITTED while
    /// collecting is off, INVALID_PARAMETER for a line longer than half of the limit.
    int append(const std::string &line) const;

    /// All lines without their newlines, oldest first; the lock is free again when this returns.
    int read(std::vector<std::string> &lines) const;

    /// Takes all records away; the switch stays.
    int clear() const;

    /// Off when the switch is on disk. When that cannot be told nothing is collected.
    bool collecting() const;

    /// Returns when the choice is on disk; after "off" no record is added any more.
    int setCollecting(bool on) const;

    const RecordLogPlace &place() const { return place_; }
    std::string file() const;

private:
    int switchOff() const;

    RecordLogPlace place_;
};

} // namespace pelliko::velmora
