#include "store/S3Reader.h"

#include "store/StorageFailure.h"

#include <algorithm>
#include <cstring>
#include <utility>

namespace pelliko::server
{
namespace
{

constexpr std::uint64_t firstBytes = 1024UL * 1024;
/// One after the other without a byte in between.
constexpr int mostBreaks = 4;

/// The stream's bytes up to `size`.
std::string readAll(s3::Wire &stream, std::uint64_t size)
{
    std::string bytes(size, '\0');
    std::uint64_t filled = 0;
    while (filled < size) {
        const std::size_t count = stream.read({bytes.data() + filled, size - filled});
        if (count == 0)
            throw s3::TransportFailure("the store's answer was too short");
        filled += count;
    }
    return bytes;
}

} // namespace

std::unique_ptr<S3Reader> S3Reader::open(s3::Client &client, const std::string &name)
{
    for (int breaks = 1;; ++breaks) {
        auto stream = client.read(name, 0, firstBytes);
        if (!stream)
            return nullptr;
        std::unique_ptr<S3Reader> reader(new S3Reader(client, name, *stream));
        try {
            if (stream->wire)
                reader->m_first = readAll(*stream->wire, std::min(stream->size, firstBytes));
            return reader;
        } catch (const s3::TransportFailure &failure) {
            if (breaks == mostBreaks)
                throw StorageFailure(StorageFailure::Kind::unavailable, failure.what());
        }
    }
}

S3Reader::S3Reader(s3::Client &client, std::string name, const s3::Client::Stream &beginning)
    : m_client(client), m_name(std::move(name)), m_size(beginning.size), m_etag(beginning.etag)
{
}

std::size_t S3Reader::read(std::uint64_t offset, std::span<char> into)
{
    if (offset >= m_size || into.empty())
        return 0;
    if (offset < m_first.size()) {
        const std::size_t count = std::min(into.size(), m_first.size() - offset);
        std::memcpy(into.data(), m_first.data() + offset, count);
        return count;
    }
    if (!m_stream || offset != m_at)
        begin(offset);
    return readStream(into.first(std::min<std::uint64_t>(into.size(), m_size - m_at)));
}

void S3Reader::begin(std::uint64_t offset)
{
    m_stream = nullptr;
    auto stream = m_client.read(m_name, offset, 0, m_etag);
    if (!stream || !stream->wire)
        throw StorageFailure(StorageFailure::Kind::broken,
                             "the blob " + m_name + " was removed while it was read");
    m_stream = std::move(stream->wire);
    m_at = offset;
}

std::size_t S3Reader::readStream(std::span<char> into)
{
    for (int breaks = 1;; ++breaks) {
        try {
            const std::size_t count = m_stream->read(into);
            m_at += count;
            if (count > 0)
                return count;
            throw s3::TransportFailure("the store's answer was too short");
        } catch (const s3::TransportFailure &failure) {
            if (breaks == mostBreaks)
                throw StorageFailure(StorageFailure::Kind::unavailable, failure.what());
        }
        begin(m_at);
    }
}

} // namespace pelliko::server
