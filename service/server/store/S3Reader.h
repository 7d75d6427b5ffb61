#pragma once

#include "s3/Client.h"
#include "store/Blobs.h"

#include <memory>
#include <string>

namespace pelliko::server
{

/// Reads an object: the first MiB at once, so that most files take one request, then a stream that
/// follows the reader and is begun again elsewhere when the reader jumps or the stream breaks.
class S3Reader final : public BlobReader
{
public:
    /// Null when there is no such object.
    static std::unique_ptr<S3Reader> open(s3::Client &client, const std::string &name);

    std::size_t read(std::uint64_t offset, std::span<char> into) override;

private:
    S3Reader(s3::Client &client, std::string name, const s3::Client::Stream &beginning);

    void begin(std::uint64_t offset);
    std::size_t readStream(std::span<char> into);

    s3::Client &m_client;
    const std::string m_name;
    const std::uint64_t m_size;
    const std::string m_etag;
    /// The object's first bytes.
    std::string m_first;
    std::shared_ptr<s3::Wire> m_stream;
    /// Of the stream's next byte.
    std::uint64_t m_at = 0;
};

} // namespace pelliko::server
