#pragma once

#include "moving/BlobCopies.h"
#include "moving/Ledger.h"
#include "store/OpenStores.h"

#include <memory>
#include <optional>
#include <string>

namespace pelliko::server
{

/// A move of an installation's data to other stores: metadata, blobs, or both. It may be ended in
/// any way at any moment; the next one with the same addresses goes on. Until the end data are
/// served where they were; never at both places.
class Migration
{
public:
    /// Where an address of `to` is the same as that of `from`, that half stays where it is. Throws
    /// std::exception with a sentence when the places cannot be moved from or to.
    Migration(const StoreUrls &from, const StoreUrls &to);

    /// Moves what can be moved. False when servers still run at the source, and the last step waits
    /// for their end. Throws std::exception with a sentence.
    bool run();

private:
    [[nodiscard]] TableSession &keeper() const { return m_target ? *m_target : *m_source; }
    void takeLocks();
    void begin();
    void beginMetadata(const std::optional<StoreMark> &source);
    void beginBlobs(const std::optional<StoreMark> &source);
    bool moveAll();
    void moveRows();
    void moveTable(const Table &table, Progress &progress);
    void end();

    std::unique_ptr<TableSession> m_source;
    /// Null when the metadata stay.
    std::unique_ptr<TableSession> m_target;
    /// Null when the blobs stay.
    std::unique_ptr<Blobs> m_from;
    std::unique_ptr<Blobs> m_to;
    std::shared_ptr<const void> m_sourceLock;
    std::shared_ptr<const void> m_targetLock;
    std::shared_ptr<const void> m_sourceServersLock;
    std::shared_ptr<const void> m_targetServersLock;
    Ledger m_ledger;
    std::string m_id;
    /// Everything is at the target, but not every mark is set.
    bool m_hasArrived = false;
    bool m_isOver = false;
    std::uint64_t m_rows = 0;
};

} // namespace pelliko::server
