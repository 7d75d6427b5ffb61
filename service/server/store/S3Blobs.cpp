#include "store/S3Blobs.h"

#include "store/S3Listing.h"
#include "store/S3Reader.h"
#include "store/S3Writing.h"
#include "store/StorageFailure.h"
#include "text/Secrets.h"

#include <malloc.h>

#include <algorithm>
#include <array>
#include <map>
#include <mutex>
#include <utility>

namespace pelliko::server
{
namespace
{

/// Most of a call's time is the store's: more of them may wait than for a disk.
constexpr std::size_t atOnce = 48;
/// The longest that a signature holds.
constexpr std::int64_t longestVisit = 604800;
/// Room of this size comes from the kernel and goes back to it.
constexpr int largeBuffer = 1024 * 1024;
/// A part that was on its way may come after the end of its upload.
constexpr int mostAborts = 5;
/// No blob's key.
constexpr const char *markName = "migration";

class S3Writer final : public BlobWriter
{
public:
    explicit S3Writer(std::shared_ptr<S3Writing> writing) : m_writing(std::move(writing)) {}

    void write(std::uint64_t offset, std::string_view bytes) override
    {
        m_writing->write(offset, bytes);
    }
    std::optional<std::size_t> fill(std::uint64_t offset, const Filler &fill) override
    {
        return m_writing->fill(offset, fill);
    }
    void truncate(std::uint64_t size) override { m_writing->truncate(size); }
    void sync() override { m_writing->sync(); }
    std::uint64_t settle(std::uint64_t) override { return m_writing->settle(); }
    void finish() override { m_writing->finish(); }

private:
    std::shared_ptr<S3Writing> m_writing;
};

void checkKey(const std::string &key)
{
    if (!looksLikeToken(key))
        throw StorageFailure(StorageFailure::Kind::broken, "not a blob's key");
}

void abortUploads(s3::Client &client, const std::string &key)
{
    auto uploads = client.openUploads(key);
    for (int aborts = 0; !uploads.empty() && aborts < mostAborts; ++aborts) {
        for (const s3::OpenUpload &upload : uploads)
            client.abortUpload(upload);
        uploads = client.openUploads(key);
    }
}

} // namespace

struct S3Blobs::State {
    explicit State(s3::Address address) : client(std::move(address)) {}

    std::shared_ptr<S3Writing> writingOf(const std::string &key);

    s3::Client client;
    PartMemory memory;
    // Goes before the client and the memory: its threads still use those.
    S3Couriers couriers;
    std::mutex mutex;
    /// Blobs that this process is writing.
    std::map<std::string, std::weak_ptr<S3Writing>> writings;
};

std::shared_ptr<S3Writing> S3Blobs::State::writingOf(const std::string &key)
{
    const std::lock_guard lock(mutex);
    const auto found = writings.find(key);
    return found == writings.end() ? nullptr : found->second.lock();
}

S3Blobs::S3Blobs(s3::Address address) : m_state(std::make_unique<State>(std::move(address)))
{
    // Otherwise the C library keeps the room of parts that were sent, once for each of its arenas.
    mallopt(M_MMAP_THRESHOLD, largeBuffer);
}

S3Blobs::~S3Blobs() = default;

bool S3Blobs::wasReached() const
{
    return m_state->client.wasReached();
}

void S3Blobs::ping()
{
    // Nobody's key: that it is not there is an answer like any other.
    m_state->client.sizeOf("ping");
}

std::size_t S3Blobs::callsAtOnce() const
{
    return atOnce;
}

std::unique_ptr<BlobWriter> S3Blobs::openForWriting(const std::string &key)
{
    checkKey(key);
    auto writing =
        std::make_shared<S3Writing>(m_state->client, m_state->couriers, m_state->memory, key);
    const std::lock_guard lock(m_state->mutex);
    std::erase_if(m_state->writings, [](const auto &entry) { return entry.second.expired(); });
    m_state->writings[key] = writing;
    return std::make_unique<S3Writer>(std::move(writing));
}

std::unique_ptr<BlobReader> S3Blobs::openForReading(const std::string &key)
{
    checkKey(key);
    auto writing = m_state->writingOf(key);
    if (writing)
        writing->finish();
    if (auto reader = S3Reader::open(m_state->client, key))
        return reader;
    // Whoever wrote it ended before it was made whole: what is there is the blob.
    writing = std::make_shared<S3Writing>(m_state->client, m_state->couriers, m_state->memory, key);
    if (!writing->exists())
        return nullptr;
    writing->finish();
    return S3Reader::open(m_state->client, key);
}

std::vector<StoredBlob> S3Blobs::list(const std::string &after, std::size_t most)
{
    return S3Listing(m_state->client, after, most).next();
}

std::optional<std::uint64_t> S3Blobs::sizeOf(const std::string &key)
{
    checkKey(key);
    const S3Parts parts = loadS3Parts(m_state->client, key);
    return parts.empty() ? std::nullopt : std::optional(parts.end());
}

void S3Blobs::removeLeftovers(const std::string &key)
{
    checkKey(key);
    abortUploads(m_state->client, key);
    for (const s3::Object &object : m_state->client.objects(key + "/"))
        m_state->client.remove(object.name);
}

std::optional<StoreMark> S3Blobs::mark()
{
    const auto reader = S3Reader::open(m_state->client, markName);
    if (!reader)
        return std::nullopt;
    std::array<char, 100> text{};
    return markOf({text.data(), reader->read(0, text)});
}

void S3Blobs::setMark(const std::optional<StoreMark> &mark)
{
    if (mark)
        m_state->client.put(markName, textOf(*mark));
    else
        m_state->client.remove(markName);
}

void S3Blobs::remove(const std::string &key)
{
    checkKey(key);
    abortUploads(m_state->client, key);
    for (const s3::Object &object : m_state->client.objects(key))
        m_state->client.remove(object.name);
}

std::optional<std::string> S3Blobs::addressOf(const std::string &key, const BlobVisit &visit)
{
    checkKey(key);
    if (!m_state->client.address().redirect || visit.seconds <= 0)
        return std::nullopt;
    return m_state->client.presigned(key, std::min(visit.seconds, longestVisit), visit.disposition,
                                     visit.type);
}

} // namespace pelliko::server
