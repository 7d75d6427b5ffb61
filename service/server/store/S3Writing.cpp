#include "store/S3Writing.h"

#include "store/StorageFailure.h"

#include <boost/asio/post.hpp>

#include <algorithm>
#include <atomic>
#include <utility>

namespace pelliko::server
{
namespace
{

/// Of one writer, beside the part that fills up: the next ones are sent while the store works on
/// this one.
constexpr std::size_t mostUnderWay = 3;
/// The end of a part is written, not filled, since to send the part may have to wait.
constexpr std::size_t writtenEnd = 64UL * 1024;

} // namespace

void S3Couriers::send(std::function<void()> work)
{
    {
        std::unique_lock lock(m_mutex);
        m_left.wait(lock, [&] { return m_underWay < places; });
        ++m_underWay;
    }
    boost::asio::post(m_threads, [this, work = std::move(work)] {
        work();
        const std::lock_guard lock(m_mutex);
        --m_underWay;
        m_left.notify_one();
    });
}

S3Writing::S3Writing(s3::Client &client, S3Couriers &couriers, PartMemory &memory, std::string key)
    : m_client(client), m_couriers(couriers), m_memory(memory), m_key(std::move(key)),
      m_tail(noTail())
{
}

std::shared_ptr<PartBuffer> S3Writing::noTail() const
{
    return std::make_shared<PartBuffer>(m_memory);
}

void S3Writing::write(std::uint64_t offset, std::string_view bytes)
{
    std::unique_lock lock(m_mutex);
    if (!m_placed || offset != m_parts.size() * s3PartSize + m_tail->size()) {
        lock.unlock();
        moveTo(offset);
        lock.lock();
    }
    while (!bytes.empty()) {
        if (m_failure)
            std::rethrow_exception(m_failure);
        const auto count = std::min<std::size_t>(bytes.size(), s3PartSize - m_tail->size());
        changeTail(m_tail->size() + count).append(bytes.substr(0, count));
        bytes.remove_prefix(count);
        if (m_tail->size() == s3PartSize)
            sendPart(lock);
    }
}

std::optional<std::size_t> S3Writing::fill(std::uint64_t offset, const BlobWriter::Filler &fill)
{
    const std::lock_guard lock(m_mutex);
    const std::size_t size = m_tail->size();
    // A tail that others look at would have to be copied.
    if (!m_placed || m_failure || offset != m_parts.size() * s3PartSize + size ||
        size + writtenEnd >= s3PartSize || m_tail.use_count() > 1)
        return std::nullopt;
    return changeTail(size).fill(s3PartSize - writtenEnd - size, fill);
}

/// The tail, which may have so many bytes. What others still look at stays as it is.
PartBuffer &S3Writing::changeTail(std::size_t size)
{
    if (m_tail.use_count() > 1) {
        const std::size_t kept = std::min(size, m_tail->size());
        m_tail =
            std::make_shared<PartBuffer>(m_memory, m_tail->view().substr(0, kept), size - kept);
    } else {
        // Whoever let go of it has read it before that.
        std::atomic_thread_fence(std::memory_order_acquire);
    }
    return *m_tail;
}

void S3Writing::sendPart(std::unique_lock<std::mutex> &lock)
{
    m_changed.wait(lock, [&] { return m_underWay < mostUnderWay || m_failure; });
    if (m_failure)
        std::rethrow_exception(m_failure);
    if (m_parts.size() + 1 >= s3MostParts)
        throw StorageFailure(StorageFailure::Kind::full, "a blob of the store has no more parts");
    const std::size_t index = m_parts.size();
    m_parts.emplace_back();
    ++m_underWay;
    const std::shared_ptr<const PartBuffer> bytes = std::exchange(m_tail, noTail());
    lock.unlock();
    m_couriers.send(
        [self = shared_from_this(), index, bytes] { self->deliver(index, bytes->view()); });
    lock.lock();
}

void S3Writing::deliver(std::size_t index, std::string_view bytes)
{
    s3::Part part;
    std::exception_ptr failure;
    try {
        part = m_client.putPart(needUpload(), static_cast<int>(index) + 1, bytes);
    } catch (...) {
        failure = std::current_exception();
    }
    const std::lock_guard lock(m_mutex);
    if (failure && !m_failure)
        m_failure = failure;
    if (!failure)
        m_parts[index] = std::move(part);
    --m_underWay;
    m_changed.notify_all();
}

/// Returns once the first `count` parts are in the store.
void S3Writing::waitForParts(std::size_t count)
{
    std::unique_lock lock(m_mutex);
    m_changed.wait(lock, [&] {
        return m_failure || std::all_of(m_parts.begin(), m_parts.begin() + static_cast<long>(count),
                                        [](const s3::Part &part) { return part.number != 0; });
    });
    if (m_failure)
        std::rethrow_exception(m_failure);
}

S3Writing::Snapshot S3Writing::look()
{
    const std::lock_guard lock(m_mutex);
    return {m_placed, m_parts.size(), m_tail};
}

void S3Writing::truncate(std::uint64_t size)
{
    moveTo(size);
    const std::lock_guard store(m_storeMutex);
    if (!m_loaded)
        return;
    for (auto tail = m_stored.tails.upper_bound(size / s3PartSize); tail != m_stored.tails.end();) {
        m_client.remove(s3TailName(m_key, tail->first));
        tail = m_stored.tails.erase(tail);
    }
}

void S3Writing::sync()
{
    const Snapshot now = look();
    waitForParts(now.parts);
    const std::lock_guard store(m_storeMutex);
    if (!now.placed) {
        // Nothing was written: what there is stays, and what is not there is made.
        load();
        if (m_stored.empty())
            putTail(now);
        return;
    }
    // A sync that began earlier may come here later.
    if (now.end() > m_synced || m_tailStale || now.end() == 0)
        putTail(now);
}

void S3Writing::putTail(const Snapshot &now)
{
    startAnew();
    const auto stored = m_stored.tails.find(now.parts);
    if (!now.tail->empty() || now.parts == 0 || stored != m_stored.tails.end()) {
        m_client.put(s3TailName(m_key, now.parts), now.tail->view());
        m_stored.tails[now.parts] = now.tail->size();
    }
    m_synced = now.end();
    m_tailStale = false;
}

std::uint64_t S3Writing::settle()
{
    std::size_t parts = 0;
    {
        const std::lock_guard lock(m_mutex);
        parts = m_parts.size();
    }
    waitForParts(parts);
    return parts * s3PartSize;
}

void S3Writing::finish()
{
    if (!look().placed && !takeUpAll())
        return;
    const Snapshot now = look();
    waitForParts(now.parts);
    const std::lock_guard store(m_storeMutex);
    // Two may have come here for the same bytes.
    if (!look().placed)
        return;
    if (now.parts == 0)
        m_client.put(m_key, now.tail->view());
    else
        completeParts(now);
    try {
        tidy();
    } catch (const StorageFailure &) {
        // The blob is whole. What is left of its making goes with the blob.
    }
    m_stored = {};
    m_stored.whole = now.end();
    m_loaded = true;
    m_anew = false;
    m_synced = now.end();
    const std::lock_guard lock(m_mutex);
    // A further write begins with a look at the store.
    m_placed = false;
}

/// Goes on from the end of what is in the store; false when that is a whole blob.
bool S3Writing::takeUpAll()
{
    const std::lock_guard store(m_storeMutex);
    load();
    if (m_stored.whole)
        return false;
    place(m_stored.end());
    return true;
}

void S3Writing::completeParts(const Snapshot &now)
{
    std::vector<s3::Part> parts;
    {
        const std::lock_guard lock(m_mutex);
        parts.assign(m_parts.begin(), m_parts.begin() + static_cast<long>(now.parts));
    }
    if (!now.tail->empty())
        parts.push_back(
            m_client.putPart(m_stored.upload, static_cast<int>(now.parts) + 1, now.tail->view()));
    m_client.completeUpload(m_stored.upload, parts, now.end());
}

/// Removes what only served to get here, uploads included whose beginning was answered too late.
void S3Writing::tidy()
{
    if (!m_loaded)
        return;
    for (const s3::OpenUpload &upload : m_client.openUploads(m_key))
        m_client.abortUpload(upload);
    for (const auto &[parts, size] : m_stored.tails)
        m_client.remove(s3TailName(m_key, parts));
}

void S3Writing::load()
{
    if (m_loaded)
        return;
    m_stored = loadS3Parts(m_client, m_key);
    m_loaded = true;
}

/// What an earlier writer left would come before, or beside, what is written now.
void S3Writing::startAnew()
{
    load();
    if (!std::exchange(m_anew, false))
        return;
    if (m_stored.whole)
        m_client.remove(m_key);
    tidy();
    m_stored = {};
}

s3::OpenUpload S3Writing::needUpload()
{
    const std::lock_guard store(m_storeMutex);
    startAnew();
    if (m_stored.upload.id.empty())
        m_stored.upload = m_client.beginUpload(m_key);
    return m_stored.upload;
}

bool S3Writing::exists()
{
    const std::lock_guard store(m_storeMutex);
    load();
    return !m_stored.empty();
}

void S3Writing::moveTo(std::uint64_t offset)
{
    waitForParts(look().parts);
    const std::lock_guard store(m_storeMutex);
    std::unique_lock lock(m_mutex);
    if (m_failure)
        std::rethrow_exception(m_failure);
    const std::uint64_t rest = offset - std::min(offset, m_parts.size() * s3PartSize);
    if (m_placed && offset >= m_parts.size() * s3PartSize && rest <= m_tail->size()) {
        changeTail(rest).truncate(rest);
        m_tailStale = true;
        return;
    }
    if (m_placed)
        m_stored.parts = m_parts;
    lock.unlock();
    place(offset);
}

void S3Writing::place(std::uint64_t offset)
{
    if (offset > 0) {
        load();
        if (m_stored.whole)
            reopenWhole(offset);
        goBackTo(offset);
        return;
    }
    m_anew = true;
    m_synced = 0;
    const std::lock_guard lock(m_mutex);
    m_parts.clear();
    m_tail = noTail();
    m_placed = true;
}

/// Takes up the parts and the tail in front of `offset`.
void S3Writing::goBackTo(std::uint64_t offset)
{
    const std::size_t parts = offset / s3PartSize;
    const std::uint64_t rest = offset % s3PartSize;
    const auto tail = m_stored.tails.find(parts);
    if (m_stored.parts.size() < parts ||
        (rest > 0 && (tail == m_stored.tails.end() || tail->second < rest)))
        throw StorageFailure(StorageFailure::Kind::lost,
                             "the store has lost bytes of the blob " + m_key);
    auto bytes = std::make_shared<PartBuffer>(
        m_memory, rest == 0 ? "" : m_client.get(s3TailName(m_key, parts), 0, rest));
    m_synced = offset;
    m_tailStale = tail != m_stored.tails.end() && tail->second > rest;
    const std::lock_guard lock(m_mutex);
    m_parts.assign(m_stored.parts.begin(), m_stored.parts.begin() + static_cast<long>(parts));
    m_tail = std::move(bytes);
    m_placed = true;
}

/// Makes parts and a tail of a blob that was whole: its end was not noted, or it was read early.
void S3Writing::reopenWhole(std::uint64_t offset)
{
    const std::size_t parts = offset / s3PartSize;
    const std::uint64_t rest = offset % s3PartSize;
    if (*m_stored.whole < offset)
        throw StorageFailure(StorageFailure::Kind::lost,
                             "the store has lost bytes of the blob " + m_key);
    tidy();
    S3Parts apart;
    if (parts > 0)
        apart.upload = m_client.beginUpload(m_key);
    for (std::size_t index = 0; index < parts; ++index)
        apart.parts.push_back(m_client.copyPart(apart.upload, static_cast<int>(index) + 1, m_key,
                                                index * s3PartSize, s3PartSize));
    if (rest > 0 || parts == 0) {
        m_client.put(s3TailName(m_key, parts),
                     rest == 0 ? "" : m_client.get(m_key, parts * s3PartSize, rest));
        apart.tails[parts] = rest;
    }
    m_client.remove(m_key);
    m_stored = std::move(apart);
}

} // namespace pelliko::server
