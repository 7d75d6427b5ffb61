#pragma once

#include "store/TableSession.h"

#include <cstdint>
#include <map>
#include <string>
#include <vector>

namespace pelliko::server
{

/// A blob that has bytes and is needed, as its row tells.
struct NeededBlob {
    std::int64_t id = 0;
    std::string key;
    std::uint64_t received = 0;
    /// Nothing is written to it any more.
    bool whole = false;
};

/// Those with ids greater than `after`, `most` at a time, in the order of their ids.
[[nodiscard]] std::vector<NeededBlob> neededBlobsAfter(TableSession &session, std::int64_t after,
                                                       std::int64_t most);

/// Which blobs have been copied, kept in the metadata that the copies are for.
class Ledger
{
public:
    struct Entry {
        std::string key;
        /// Nothing for one that was only begun.
        std::optional<std::uint64_t> size;
    };

    explicit Ledger(TableSession &session) : m_session(session) {}

    void make();
    /// Inside a transaction or not.
    void drop();

    /// By the blobs' ids, from the first to the last of these.
    [[nodiscard]] std::map<std::int64_t, Entry> between(std::int64_t first, std::int64_t last);
    /// Some that follow `after`.
    [[nodiscard]] std::map<std::int64_t, Entry> after(std::int64_t after, std::int64_t most);

    /// From here on there may be something of the blob in the target.
    void noteBegun(const NeededBlob &blob);
    /// The blob is in the target, and has this hash there.
    void noteCopied(const NeededBlob &blob, const std::string &hash);
    void forget(std::int64_t id);

private:
    [[nodiscard]] std::map<std::int64_t, Entry> read(const std::string &condition,
                                                     const std::vector<Cell> &values);

    TableSession &m_session;
};

} // namespace pelliko::server
