#include "moving/Migration.h"

#include "text/Secrets.h"

#include <cstdio>
#include <stdexcept>

namespace pelliko::server
{
namespace
{

using State = StoreMark::State;

constexpr std::size_t rowsAtOnce = 2000;

bool is(const std::optional<StoreMark> &mark, State state)
{
    return mark && mark->state == state;
}

bool is(const std::optional<StoreMark> &mark, const std::string &id, State state)
{
    return is(mark, state) && mark->id == id;
}

TableDigest digestOf(TableSession &session, const Table &table)
{
    TableDigest digest;
    session.read(table, [&](const TableRow &row) { digest.add(row); });
    return digest;
}

std::uint64_t countOf(TableSession &session, const Table &table)
{
    std::uint64_t count = 0;
    session.query(
        "SELECT count(*) FROM " + std::string(table.name), {}, {Column::Kind::integer},
        [&](const TableRow &row) { count = static_cast<std::uint64_t>(numberIn(row, 0)); });
    return count;
}

} // namespace

Migration::Migration(const StoreUrls &from, const StoreUrls &to)
    : m_source(openTables(from.metadata, Absent::fails)),
      m_target(to.metadata == from.metadata ? nullptr : openTables(to.metadata, Absent::isMade)),
      m_from(to.blobs == from.blobs ? nullptr : openBlobs(from.blobs)),
      m_to(to.blobs == from.blobs ? nullptr : openBlobs(to.blobs)), m_ledger(keeper())
{
    takeLocks();
    begin();
}

void Migration::takeLocks()
{
    m_sourceLock = m_source->keepMoversAway();
    m_targetLock = m_target ? m_target->keepMoversAway() : m_sourceLock;
    if (!m_sourceLock || !m_targetLock)
        throw std::runtime_error("another migration of these data is running");
    if (!m_target)
        return;
    m_targetServersLock = m_target->keepServersAway();
    if (!m_targetServersLock)
        throw std::runtime_error("a server runs at the target");
}

void Migration::begin()
{
    const auto source = markOf(*m_source);
    if (is(source, State::arriving) || is(source, State::arrived))
        throw std::runtime_error("the metadata of the source are themselves only half moved there");
    const bool known = is(source, State::leaving) || is(source, State::left);
    m_id = known ? source->id : randomToken();
    if (m_target)
        beginMetadata(source);
    else if (is(source, State::left))
        throw std::runtime_error("the metadata of the source were moved elsewhere");
    if (m_from && !m_isOver)
        beginBlobs(source);
}

void Migration::beginMetadata(const std::optional<StoreMark> &source)
{
    const auto target = markOf(*m_target);
    m_isOver = is(source, State::left) && is(target, m_id, State::here);
    m_hasArrived = is(target, m_id, State::arrived);
    const bool isGoingOn = is(target, m_id, State::arriving);
    if (m_isOver || m_hasArrived || (isGoingOn && is(source, State::left)))
        return;
    if (is(source, State::left))
        throw std::runtime_error("the metadata of the source were moved elsewhere");
    if (!isGoingOn && (target || !isEmpty(*m_target)))
        throw std::runtime_error("the metadata of the target are not empty: they belong to another "
                                 "installation or another migration");
    setMark(*m_source, {m_id, State::leaving});
    setMark(*m_target, {m_id, State::arriving});
}

void Migration::beginBlobs(const std::optional<StoreMark> &source)
{
    const auto from = m_from->mark();
    const auto to = m_to->mark();
    if (!m_target && is(from, State::left) && is(source, from->id, State::here)) {
        m_isOver = true;
        return;
    }
    const bool hasLeft = is(from, m_id, State::left);
    m_hasArrived = m_hasArrived || (!m_target && hasLeft);
    if (from && !hasLeft)
        throw std::runtime_error("the blobs of the source were moved elsewhere, or are only half "
                                 "moved there");
    const bool ours = is(to, m_id, State::arriving) || (m_hasArrived && !to);
    if (!ours && (to || !m_to->list("", 1).empty()))
        throw std::runtime_error("the blobs of the target are not empty: they belong to another "
                                 "installation or another migration");
    if (!m_target && !m_hasArrived)
        setMark(*m_source, {m_id, State::leaving});
    if (!m_hasArrived)
        m_to->setMark(StoreMark{m_id, State::arriving});
}

bool Migration::run()
{
    if (m_isOver) {
        std::fprintf(stderr, "pelliko-server: everything was moved before\n");
        return true;
    }
    if (!m_hasArrived && !moveAll())
        return false;
    end();
    return true;
}

bool Migration::moveAll()
{
    std::unique_ptr<BlobCopies> copies;
    if (m_from) {
        m_ledger.make();
        copies = std::make_unique<BlobCopies>(*m_from, *m_to, *m_source, m_ledger, keeper());
        copies->copyWhole();
    }
    m_sourceServersLock = m_source->keepServersAway();
    if (!m_sourceServersLock) {
        std::fprintf(stderr,
                     "pelliko-server: %llu files were copied now. Servers still run at the source: "
                     "stop them and give the same command again, which moves the rest.\n",
                     static_cast<unsigned long long>(copies ? copies->count() : 0));
        return false;
    }
    if (m_target)
        m_source->beginAlone();
    if (copies) {
        copies->copyRest();
        copies->removeUnneeded();
    }
    if (m_target)
        moveRows();
    std::fprintf(stderr,
                 "pelliko-server: %llu files with %llu bytes and %llu rows were moved now\n",
                 static_cast<unsigned long long>(copies ? copies->count() : 0),
                 static_cast<unsigned long long>(copies ? copies->bytes() : 0),
                 static_cast<unsigned long long>(m_rows));
    return true;
}

/// All rows or none: in one transaction of the target, which ends with the mark that they are
/// there. The source is closed just before: if this program ends in between, nobody has changed
/// anything there when the next one copies the rows once more.
void Migration::moveRows()
{
    std::uint64_t all = 0;
    for (const Table &table : metadataTables())
        all += countOf(*m_source, table);
    Progress progress("copying rows", all, 0);
    m_target->begin();
    try {
        for (const Table &table : metadataTables())
            moveTable(table, progress);
        m_ledger.drop();
        setMark(*m_target, {m_id, State::arrived});
        setMark(*m_source, {m_id, State::left});
        m_source->commit();
        m_target->commit();
    } catch (...) {
        m_target->rollBack();
        throw;
    }
}

void Migration::moveTable(const Table &table, Progress &progress)
{
    TableDigest sent;
    std::vector<TableRow> rows;
    const auto flush = [&] {
        m_target->append(table, rows);
        progress.addThings(rows.size());
        rows.clear();
    };
    m_source->read(table, [&](const TableRow &row) {
        sent.add(row);
        rows.push_back(row);
        if (rows.size() == rowsAtOnce)
            flush();
    });
    flush();
    if (digestOf(*m_target, table) != sent)
        throw std::runtime_error("the target gives other rows of " + std::string(table.name) +
                                 " than it was given");
    if (table.hasCounter)
        m_target->setCounter(table, m_source->counter(table));
    m_rows += sent.rows();
}

/// Each mark says no more than what is true by then, so that whoever comes after an interruption
/// ends the move or is refused.
void Migration::end()
{
    if (m_from) {
        m_from->setMark(StoreMark{m_id, State::left});
        m_to->setMark(std::nullopt);
    }
    m_ledger.drop();
    setMark(keeper(), {m_id, State::here});
}

} // namespace pelliko::server
