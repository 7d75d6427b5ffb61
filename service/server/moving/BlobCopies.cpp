#include "moving/BlobCopies.h"

#include "store/StorageFailure.h"
#include "text/Sha256.h"

#include <fcntl.h>

#include <algorithm>
#include <atomic>
#include <exception>
#include <set>
#include <stdexcept>
#include <thread>

namespace pelliko::server
{
namespace
{

constexpr std::int64_t rowsAtOnce = 1000;
/// What a kill costs at most: so much is noted at a time.
constexpr std::size_t groupBlobs = 128;
constexpr std::uint64_t groupBytes = 256UL * 1024 * 1024;
constexpr std::size_t mostThreads = 8;
constexpr std::size_t pieceSize = 1024UL * 1024;

/// The hash of the blob's first `size` bytes, each piece of which `take` gets as well.
template <class Take>
std::string hashOf(BlobReader &reader, const std::string &key, std::uint64_t size, Take take)
{
    Sha256 hash;
    std::vector<char> piece(std::min<std::uint64_t>(pieceSize, size));
    for (std::uint64_t offset = 0; offset < size;) {
        const std::size_t wanted = std::min<std::uint64_t>(piece.size(), size - offset);
        const std::size_t count = reader.read(offset, {piece.data(), wanted});
        if (count == 0)
            throw std::runtime_error("the file " + key +
                                     " is shorter than its offset: \"pelliko-server "
                                     "check\" tells what is missing");
        const std::string_view bytes(piece.data(), count);
        hash.add(bytes);
        take(offset, bytes);
        offset += count;
    }
    return hash.hex();
}

std::unique_ptr<BlobReader> openThere(Blobs &blobs, const std::string &key)
{
    auto reader = blobs.openForReading(key);
    if (!reader)
        throw std::runtime_error("the file " + key +
                                 " is not there: \"pelliko-server check\" tells "
                                 "what is missing");
    // Read what is on the disk, not what is still in memory.
    if (reader->descriptor() >= 0)
        posix_fadvise(reader->descriptor(), 0, 0, POSIX_FADV_DONTNEED);
    return reader;
}

} // namespace

struct BlobCopies::Outcome {
    std::string hash;
    std::exception_ptr failure;
};

BlobCopies::BlobCopies(Blobs &from, Blobs &to, TableSession &rows, Ledger &ledger,
                       TableSession &ledgers)
    : m_from(from), m_to(to), m_rows(rows), m_ledger(ledger), m_ledgers(ledgers)
{
}

void BlobCopies::copyAll(bool isLast)
{
    std::uint64_t count = 0;
    std::uint64_t bytes = 0;
    m_rows.query("SELECT count(*), coalesce(sum(received), 0) FROM blobs"
                 " WHERE NOT doomed AND received > 0",
                 {}, {Column::Kind::integer, Column::Kind::integer}, [&](const TableRow &row) {
                     count = static_cast<std::uint64_t>(numberIn(row, 0));
                     bytes = static_cast<std::uint64_t>(numberIn(row, 1));
                 });
    Progress progress(isLast ? "copying the rest" : "copying files", count, bytes);
    std::int64_t last = 0;
    for (Group some = neededBlobsAfter(m_rows, last, rowsAtOnce); !some.empty();
         some = neededBlobsAfter(m_rows, last, rowsAtOnce)) {
        last = some.back().id;
        Group group;
        std::uint64_t size = 0;
        for (NeededBlob &blob : missingOf(some, isLast, progress)) {
            size += blob.received;
            group.push_back(std::move(blob));
            if (group.size() < groupBlobs && size < groupBytes)
                continue;
            copyGroup(group, isLast, progress);
            group.clear();
            size = 0;
        }
        copyGroup(group, isLast, progress);
    }
}

BlobCopies::Group BlobCopies::missingOf(const Group &blobs, bool isLast, Progress &progress)
{
    const auto entries = m_ledger.between(blobs.front().id, blobs.back().id);
    Group missing;
    for (const NeededBlob &blob : blobs) {
        const auto entry = entries.find(blob.id);
        if (entry != entries.end() && entry->second.size == blob.received) {
            progress.addBytes(blob.received);
            progress.addThings(1);
        } else if (blob.whole || isLast) {
            // What was copied of an earlier state, or only begun, is in the way.
            if (entry != entries.end())
                m_to.remove(blob.key);
            missing.push_back(blob);
        }
    }
    return missing;
}

/// A copy of an unfinished upload that was begun can only be found by its key.
void BlobCopies::prepareUnfinished(const Group &blobs)
{
    m_ledgers.begin();
    for (const NeededBlob &blob : blobs) {
        if (!blob.whole)
            m_ledger.noteBegun(blob);
    }
    m_ledgers.commit();
}

std::string BlobCopies::copyOne(const NeededBlob &blob, Progress &progress)
{
    std::string hash;
    {
        const auto reader = openThere(m_from, blob.key);
        const auto writer = m_to.openForWriting(blob.key);
        hash = hashOf(*reader, blob.key, blob.received,
                      [&](std::uint64_t offset, std::string_view bytes) {
                          writer->write(offset, bytes);
                          progress.addBytes(bytes.size());
                      });
        writer->truncate(blob.received);
        if (blob.whole)
            writer->finish();
        else
            writer->sync();
    }
    const auto copy = openThere(m_to, blob.key);
    const auto nothing = [](std::uint64_t, std::string_view) {};
    if (hashOf(*copy, blob.key, blob.received, nothing) != hash)
        throw std::runtime_error("the target gives other bytes of " + blob.key +
                                 " than it was given");
    progress.addThings(1);
    return hash;
}

bool BlobCopies::isStillNeeded(const NeededBlob &blob)
{
    bool needed = false;
    m_rows.query("SELECT 1 FROM blobs WHERE id = $1 AND NOT doomed", {blob.id},
                 {Column::Kind::integer}, [&](const TableRow &) { needed = true; });
    return needed;
}

void BlobCopies::copyGroup(const Group &blobs, bool isLast, Progress &progress)
{
    if (blobs.empty())
        return;
    if (isLast)
        prepareUnfinished(blobs);
    std::vector<Outcome> outcomes(blobs.size());
    std::atomic<std::size_t> next{0};
    const auto work = [&] {
        for (std::size_t index = next++; index < blobs.size(); index = next++) {
            try {
                outcomes[index].hash = copyOne(blobs[index], progress);
            } catch (const std::exception &) {
                outcomes[index].failure = std::current_exception();
            }
        }
    };
    {
        std::vector<std::jthread> threads;
        for (std::size_t count = 0; count < std::min(mostThreads, blobs.size()); ++count)
            threads.emplace_back(work);
    }
    std::exception_ptr failure;
    for (std::size_t index = 0; index < blobs.size(); ++index) {
        // A share may have ended while servers run: then its files are not missed.
        if (outcomes[index].failure && (isLast || isStillNeeded(blobs[index])))
            failure = outcomes[index].failure;
    }
    m_ledgers.begin();
    for (std::size_t index = 0; index < blobs.size(); ++index) {
        if (outcomes[index].failure)
            continue;
        m_ledger.noteCopied(blobs[index], outcomes[index].hash);
        ++m_count;
        m_bytes += blobs[index].received;
    }
    m_ledgers.commit();
    if (failure)
        std::rethrow_exception(failure);
}

void BlobCopies::removeUnneeded()
{
    std::int64_t last = 0;
    for (auto some = m_ledger.after(last, rowsAtOnce); !some.empty();
         some = m_ledger.after(last, rowsAtOnce)) {
        const std::int64_t first = some.begin()->first;
        last = some.rbegin()->first;
        std::set<std::int64_t> needed;
        m_rows.query("SELECT id FROM blobs WHERE id >= $1 AND id <= $2 AND NOT doomed",
                     {first, last}, {Column::Kind::integer},
                     [&](const TableRow &row) { needed.insert(numberIn(row, 0)); });
        for (const auto &[id, entry] : some) {
            if (needed.count(id) == 0) {
                m_to.remove(entry.key);
                m_ledger.forget(id);
            }
        }
    }
}

} // namespace pelliko::server
