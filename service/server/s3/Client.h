#pragma once

#include "s3/Address.h"
#include "s3/Answers.h"
#include "s3/Wire.h"
#include "store/BackOff.h"

#include <atomic>
#include <cstdint>
#include <ctime>
#include <memory>
#include <optional>
#include <string>
#include <vector>

namespace pelliko::server::s3
{

/// The calls of an S3 store. Names of objects are without the address's prefix. Each call is
/// repeated with growing pauses as long as the store is away, busy or failing, for some seconds, or
/// once when it is silent; then, and for every refusal that another try would not change, it throws
/// StorageFailure. While the store cannot be reached, calls fail at once but for one that tries.
/// Each body that is sent is hashed and the store refuses one that arrives changed. Requests are
/// signed with the store's time, as far as it has told that. Thread-safe.
class Client
{
public:
    /// Seconds since the epoch, as this machine knows them.
    using Now = std::time_t (*)();

    /// Throws std::runtime_error when there are no credentials.
    explicit Client(
        Address address, Now now = [] { return std::time(nullptr); });

    /// What the store has said to a call.
    struct Answer {
        WireAnswer wire;
        std::string errorCode;
        /// Refused, having been signed with a time that is far from the store's: known by now.
        bool wasMistimed = false;

        [[nodiscard]] bool good() const { return wire.status < 300 && errorCode.empty(); }
    };

    /// A body that is read in pieces.
    struct Stream {
        std::shared_ptr<Wire> wire = {};
        /// The size of the whole object.
        std::uint64_t size = 0;
        std::string etag = {};
    };

    void put(const std::string &name, std::string_view bytes);
    /// Size of the object; nothing when there is none.
    std::optional<std::uint64_t> sizeOf(const std::string &name);
    /// Begins to read at `offset`, up to `most` bytes (0: to the end); nothing when there is no
    /// such object, or, with `etag`, when it is another one now.
    std::optional<Stream> read(const std::string &name, std::uint64_t offset, std::uint64_t most,
                               const std::string &etag = {});
    /// Exactly these bytes.
    std::string get(const std::string &name, std::uint64_t offset, std::uint64_t length);
    void remove(const std::string &name);
    std::vector<Object> objects(const std::string &namesBeginWith);
    /// Those whose names follow `name` in the order of their bytes, `most` at a time.
    Page<Object> objectsAfter(const std::string &name, std::size_t most);

    OpenUpload beginUpload(const std::string &name);
    std::vector<OpenUpload> openUploads(const std::string &namesBeginWith);
    /// Those that follow this one, `most` at a time; the store may count those of the same name in
    /// when the id is empty.
    Page<OpenUpload> uploadsAfter(const OpenUpload &upload, std::size_t most);
    /// In the order of their numbers; nothing for an upload that is not open.
    std::vector<Part> parts(const OpenUpload &upload);
    Part putPart(const OpenUpload &upload, int number, std::string_view bytes);
    Part copyPart(const OpenUpload &upload, int number, const std::string &from,
                  std::uint64_t offset, std::uint64_t length);
    /// `size` is that of the whole: an object of that size and of as many parts counts as the one
    /// that an answer was lost of.
    void completeUpload(const OpenUpload &upload, const std::vector<Part> &parts,
                        std::uint64_t size);
    void abortUpload(const OpenUpload &upload);

    /// An address that everybody may get the object from.
    std::string presigned(const std::string &name, long seconds, const std::string &disposition,
                          const std::string &type) const;

    /// False when the store could not be reached the last time.
    [[nodiscard]] bool wasReached() const { return !m_backOff.isAway(); }

    [[nodiscard]] const Address &address() const { return m_address; }

private:
    struct Call {
        std::string method;
        /// Without the prefix; empty for the bucket itself.
        std::string name = {};
        Pairs query = {};
        Pairs headers = {};
        std::string_view body = {};
        bool ofBucket = false;
        bool streamed = false;
    };

    WireRequest prepare(const Call &call, const std::string &payloadHash) const;
    Signable signable(const Call &call) const;
    Answer ask(const Call &call, std::shared_ptr<Wire> wire = nullptr);
    Answer askOnce(const Call &call, const std::string &payloadHash, Wire &wire);
    [[nodiscard]] std::time_t storesTime() const { return m_now() + m_ahead; }
    Answer need(const Call &call);

    Address m_address;
    Now m_now;
    Credentials m_credentials;
    std::shared_ptr<Wires> m_wires;
    BackOff m_backOff;
    /// Seconds by which the store's clock is ahead of this one.
    std::atomic<std::time_t> m_ahead{0};
};

} // namespace pelliko::server::s3
