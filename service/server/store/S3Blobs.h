#pragma once

#include "s3/Address.h"
#include "store/Blobs.h"

#include <memory>

namespace pelliko::server
{

/// Blobs as objects of an S3 store, each named by its key. One that is still being written is an
/// upload in parts, and an object for the bytes that are no whole part yet; any server on the same
/// store goes on from there.
class S3Blobs final : public Blobs
{
public:
    /// Throws std::runtime_error when there are no credentials.
    explicit S3Blobs(s3::Address address);
    ~S3Blobs() override;

    std::unique_ptr<BlobWriter> openForWriting(const std::string &key) override;
    std::unique_ptr<BlobReader> openForReading(const std::string &key) override;
    std::vector<StoredBlob> list(const std::string &after, std::size_t most) override;
    std::optional<std::uint64_t> sizeOf(const std::string &key) override;
    void remove(const std::string &key) override;
    void removeLeftovers(const std::string &key) override;
    /// In the object "migration" below the address's prefix.
    std::optional<StoreMark> mark() override;
    void setMark(const std::optional<StoreMark> &mark) override;
    std::optional<std::string> addressOf(const std::string &key, const BlobVisit &visit) override;
    [[nodiscard]] bool wasReached() const override;
    void ping() override;
    [[nodiscard]] std::size_t callsAtOnce() const override;

private:
    struct State;
    std::unique_ptr<State> m_state;
};

} // namespace pelliko::server
