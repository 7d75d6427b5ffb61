#pragma once

#include "moving/Ledger.h"
#include "moving/Progress.h"
#include "store/Blobs.h"

#include <cstdint>
#include <string>
#include <vector>

namespace pelliko::server
{

/// Copies blobs from one store to another, several at a time, and reads each back: it counts as
/// copied only when what the target gives has the same SHA-256. What is in the ledger is not copied
/// again.
class BlobCopies
{
public:
    /// `rows` are the metadata that know the source's blobs.
    BlobCopies(Blobs &from, Blobs &to, TableSession &rows, Ledger &ledger, TableSession &ledgers);

    /// The finished ones, beside servers that go on.
    void copyWhole() { copyAll(false); }
    /// Everything else; nobody writes meanwhile.
    void copyRest() { copyAll(true); }
    /// Removes from the target what nobody needs any more.
    void removeUnneeded();

    [[nodiscard]] std::uint64_t count() const { return m_count; }
    [[nodiscard]] std::uint64_t bytes() const { return m_bytes; }

private:
    struct Outcome;
    using Group = std::vector<NeededBlob>;

    void copyAll(bool isLast);
    [[nodiscard]] Group missingOf(const Group &blobs, bool isLast, Progress &progress);
    void copyGroup(const Group &blobs, bool isLast, Progress &progress);
    void prepareUnfinished(const Group &blobs);
    std::string copyOne(const NeededBlob &blob, Progress &progress);
    bool isStillNeeded(const NeededBlob &blob);

    Blobs &m_from;
    Blobs &m_to;
    TableSession &m_rows;
    Ledger &m_ledger;
    TableSession &m_ledgers;
    std::uint64_t m_count = 0;
    std::uint64_t m_bytes = 0;
};

} // namespace pelliko::server
