#pragma once

#include "store/Blobs.h"
#include "store/Metadata.h"
#include "store/TableSession.h"

#include <cstdint>
#include <functional>
#include <optional>
#include <string>
#include <utility>
#include <vector>

namespace pelliko::server
{

/// Compares the rows of files with the bytes that there are, both in the order of the blobs' keys
/// and some at a time, beside servers that run. A blob has its row before it has bytes, and bytes
/// before they are noted: what looks wrong is looked at again in that order before it counts.
class Check
{
public:
    struct Report {
        std::uint64_t rows = 0;
        std::uint64_t blobs = 0;
        /// Blobs that have fewer bytes than are noted, or none.
        std::uint64_t lost = 0;
        /// Blobs that no row knows.
        std::uint64_t strays = 0;
        /// Whole blobs with what is left of their making.
        std::uint64_t leftovers = 0;
        /// Rows of blobs that no file has.
        std::uint64_t unused = 0;
        /// Of all these.
        std::uint64_t mended = 0;

        [[nodiscard]] std::uint64_t found() const { return lost + strays + leftovers + unused; }
    };
    /// Gets a line for each finding.
    using Tell = std::function<void(const std::string &)>;

    Check(TableSession &rows, Metadata &metadata, Blobs &blobs, Tell tell)
        : m_rows(rows), m_metadata(metadata), m_blobs(blobs), m_tell(std::move(tell))
    {
    }

    /// Puts right what it finds, too: `now` is the time at which that happens.
    void mendAt(Seconds now) { m_mendAt = now; }

    [[nodiscard]] Report run();

private:
    struct Row {
        std::int64_t id = 0;
        std::string key;
        std::uint64_t received = 0;
        bool doomed = false;
        /// Of the file that has it; nothing when none has.
        std::optional<std::uint64_t> size;
    };

    std::vector<Row> rowsAfter(const std::string &key);
    std::optional<Row> rowOf(const std::string &key);
    std::vector<Row> rowsWhere(const std::string &condition, const std::vector<Cell> &values);

    const StoredBlob *nextStored();
    void compare(const Row &row, const StoredBlob *stored);
    void takeForStray(const StoredBlob &blob);
    void confirmStrays();

    void lookForLost(const Row &row);
    void tellLost(const Row &row, std::uint64_t there);
    bool mendLost(const Row &row);
    void mendUnused(const Row &row);

    TableSession &m_rows;
    Metadata &m_metadata;
    Blobs &m_blobs;
    Tell m_tell;
    std::optional<Seconds> m_mendAt;
    Report m_report;
    std::vector<StoredBlob> m_stored;
    std::size_t m_storedAt = 0;
    bool m_storedEnded = false;
    std::string m_lastStored;
    std::vector<StoredBlob> m_strays;
};

} // namespace pelliko::server
