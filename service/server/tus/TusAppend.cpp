#include "tus/TusAppend.h"

#include "http/Errors.h"
#include "shares/ShareRules.h"
#include "store/StorageFailure.h"
#include "tus/Checkpoints.h"
#include "tus/TusHeaders.h"

#include <algorithm>
#include <cstdio>
#include <exception>
#include <utility>

namespace pelliko::server
{
namespace
{

/// How much one thread of the pool stores before others get their turn.
constexpr std::size_t stepSize = 1024 * 1024;

Task<void> openWriter(Context &context, ActiveWrite &write)
{
    write.writer = co_await context.blobPool.run(
        [&]() -> std::shared_ptr<BlobWriter> { return context.blobs.openForWriting(write.key); });
}

/// Stores a body up to the end of the file; what comes behind that is counted only.
class BlobSink final : public BodySink
{
public:
    explicit BlobSink(ActiveWrite &write) : m_write(write), m_at(write.written) {}

    void take(std::string_view piece) override
    {
        piece = piece.substr(0, rest());
        m_write.writer->write(m_at, piece);
        m_at += piece.size();
    }

    std::optional<std::size_t> fillNow(const Filler &fill) override
    {
        if (rest() == 0)
            return std::nullopt;
        const auto filled = m_write.writer->fill(m_at, [&](std::span<char> room) {
            return fill(room.first(std::min(room.size(), rest())));
        });
        m_at += filled.value_or(0);
        return filled;
    }

    /// Where the next byte belongs.
    [[nodiscard]] std::uint64_t at() const { return m_at; }

private:
    [[nodiscard]] std::size_t rest() const { return m_write.size - m_at; }

    ActiveWrite &m_write;
    std::uint64_t m_at;
};

/// Copies the body into the blob.
Task<void> copyBody(Exchange &exchange, Context &context, std::shared_ptr<ActiveWrite> write,
                    Checkpoints &checkpoints)
{
    if (exchange.request().bodyLength == 0)
        co_return;
    co_await openWriter(context, *write);
    BlobSink sink(*write);
    while (true) {
        const std::size_t count = co_await exchange.takeBody(stepSize, sink);
        if (count == 0)
            co_return;
        const std::uint64_t before = std::exchange(write->written, sink.at());
        if (write->written - before < count)
            throw Refusal(Error::tooLarge, "The upload is longer than announced.");
        co_await checkpoints.advance();
    }
}

/// Turns what ended a body into what its sender is told.
[[noreturn]] void rethrowEnding(const std::exception_ptr &ending)
{
    try {
        std::rethrow_exception(ending);
    } catch (const Interrupted &) {
        throw Refusal(Error::conflict, "Another request has taken over this upload.");
    }
}

bool isFailure(const std::exception_ptr &ending, StorageFailure::Kind kind)
{
    try {
        std::rethrow_exception(ending);
    } catch (const StorageFailure &failure) {
        return failure.kind() == kind;
    } catch (...) {
        return false;
    }
}

/// Gives back the space of bytes that no offset counts: with a full store, even noting that
/// something else was deleted needs some.
Task<void> dropUnnoted(Context &context, std::shared_ptr<ActiveWrite> write)
{
    write->written = write->kept;
    if (!write->writer)
        co_return;
    bool isOurs = write->right == 0;
    // What another server has stored since is not this one's to drop.
    if (!isOurs)
        isOurs = co_await context.pool.run(
            [&] { return context.metadata.recordOffset(write->key, 0, write->right); });
    if (isOurs)
        co_await context.blobPool.run([&] { write->writer->truncate(write->kept); });
}

void checkAppend(const Request &request, const UploadRecord &upload, std::uint64_t offset)
{
    if (offset != upload.file.offset)
        throw Refusal(Error::conflict, "Upload-Offset is not the upload's offset.",
                      {{"Upload-Offset", std::to_string(upload.file.offset)}});
    const std::uint64_t rest = upload.file.size - offset;
    if (request.bodyLength.value_or(0) > rest)
        throw Refusal(Error::tooLarge, "The upload is longer than announced.");
}

/// Copies the body and makes durable what came of it, whatever ends it.
Task<void> appendHeld(Exchange &exchange, Context &context, std::shared_ptr<ActiveWrite> write)
{
    Checkpoints checkpoints(context, write);
    std::exception_ptr ending;
    try {
        co_await copyBody(exchange, context, write, checkpoints);
    } catch (const std::exception &) {
        ending = std::current_exception();
    }
    try {
        co_await checkpoints.finish();
    } catch (const std::exception &) {
        ending = std::current_exception();
    }
    if (ending && isFailure(ending, StorageFailure::Kind::full))
        co_await dropUnnoted(context, write);
    co_await checkpoint(context, write);
    if (ending)
        rethrowEnding(ending);
}

/// The store does not have what it had taken: only the sender still has the file, and is told to
/// send it from its beginning.
Task<void> beginAgain(Context &context, std::int64_t account, std::string upload,
                      std::exception_ptr failure)
{
    try {
        std::rethrow_exception(failure);
    } catch (const std::exception &error) {
        std::fprintf(stderr, "pelliko-server: an upload begins again: %s\n", error.what());
    }
    const Seconds now = context.now();
    const bool begun = co_await context.pool.run(
        [&] { return context.metadata.resetUpload(account, upload, now); });
    if (!begun)
        throw Refusal(Error::gone);
    context.peers.wakeSweeper();
    throw Refusal(Error::conflict, "The store has lost bytes of the upload: it begins again.",
                  {{"Upload-Offset", "0"}});
}

struct Append {
    std::int64_t account = 0;
    std::string upload;
    std::shared_ptr<ActiveWrite> write;
};

Task<void> appendOrBeginAgain(Exchange &exchange, Context &context, Append append)
{
    std::exception_ptr failure;
    try {
        co_await appendHeld(exchange, context, append.write);
    } catch (const std::exception &) {
        failure = std::current_exception();
    }
    // Without other servers nobody removes a blob that is being written.
    if (failure && append.write->writer && append.write->right != 0)
        context.doubt(append.write->key);
    if (failure && isFailure(failure, StorageFailure::Kind::lost))
        co_await beginAgain(context, append.account, append.upload, failure);
    if (failure)
        std::rethrow_exception(failure);
}

} // namespace

Task<UploadRecord> findWantedUpload(Context &context, std::int64_t account, std::string upload)
{
    const Seconds now = context.now();
    auto found = co_await context.pool.run(
        [&] { return context.metadata.findUpload(account, upload, now); });
    if (!found)
        throw Refusal(Error::notFound);
    checkLive(found->state);
    co_return std::move(*found);
}

Task<UploadRecord> appendBody(Exchange &exchange, Context &context, std::int64_t account,
                              std::string upload)
{
    const std::uint64_t offset = requiredNumber(exchange.request(), "Upload-Offset");
    const UploadRecord before = co_await findWantedUpload(context, account, upload);
    const ActiveWrites::Lease lease =
        co_await context.writes.take(before.file.blob, [&exchange] { exchange.interrupt(); });
    // The former writer may have got on, or the upload may have been dropped.
    UploadRecord current = before;
    if (lease.write()->noted)
        current.file.offset = *lease.write()->noted;
    else
        current = co_await findWantedUpload(context, account, upload);
    if (current.file.blob != before.file.blob)
        throw Refusal(Error::conflict, "The upload was dropped meanwhile.");
    checkAppend(exchange.request(), current, offset);
    lease.write()->written = lease.write()->kept = offset;
    lease.write()->size = current.file.size;
    const Append append{account, upload, lease.write()};
    co_await appendOrBeginAgain(exchange, context, append);
    // That the upload was dropped meanwhile, or ended by somebody, its last note has told; its time
    // may be over as well.
    if (current.deadline <= context.now())
        throw Refusal(Error::expired);
    current.file.offset = lease.write()->written;
    co_return std::move(current);
}

} // namespace pelliko::server
