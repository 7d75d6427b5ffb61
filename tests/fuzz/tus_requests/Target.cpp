// The bytes of one connection to the server, over a socket and with the real stores: heads, lengths
// and bodies of resumable uploads above all. In the input "{share}", "{upload}" and "{empty}" stand
// for a share that is there and for its two uploads.
#include "FileName.h"
#include "Scratch.h"

#include "http/Connection.h"
#include "http/Router.h"
#include "shares/ShareRules.h"
#include "store/DirectoryBlobs.h"
#include "store/SqliteMetadata.h"
#include "text/Secrets.h"

#include <boost/asio/co_spawn.hpp>
#include <boost/asio/detached.hpp>
#include <boost/asio/io_context.hpp>
#include <boost/asio/ip/tcp.hpp>

#include <sys/socket.h>
#include <unistd.h>

#include <array>
#include <string>

using namespace pelliko::server;
using pelliko::fuzz::promise;
namespace asio = boost::asio;

namespace
{

constexpr Seconds now = 1'700'000'000;
constexpr const char *number = "+4915112345678";
constexpr const char *token = "AAAAAAAAAAAAAAAAAAAAAA";
constexpr std::uint64_t announced = 20;
/// A stream of pushes whose reader has sent more than its request is ended when nothing else
/// happens for so long.
constexpr std::chrono::milliseconds quiet{50};
constexpr std::chrono::seconds patience{5};

Limits generousLimits()
{
    Limits limits;
    limits.registrations = 1'000'000'000;
    return limits;
}

/// The client's end of a connection.
class Client
{
public:
    explicit Client(int descriptor) : m_descriptor(descriptor) {}
    Client(const Client &) = delete;
    Client &operator=(const Client &) = delete;
    ~Client() { close(m_descriptor); }

    void send(std::string_view bytes) const
    {
        while (!bytes.empty()) {
            const ssize_t count = ::send(m_descriptor, bytes.data(), bytes.size(), MSG_NOSIGNAL);
            if (count <= 0)
                break;
            bytes.remove_prefix(static_cast<std::size_t>(count));
        }
        shutdown(m_descriptor, SHUT_WR);
    }

    void readAnswers()
    {
        std::array<char, 65536> bytes;
        ssize_t count = 0;
        while ((count = recv(m_descriptor, bytes.data(), bytes.size(), MSG_DONTWAIT)) > 0)
            answers.append(bytes.data(), static_cast<std::size_t>(count));
    }

    std::string answers;

private:
    int m_descriptor;
};

/// The server's stores with one account.
class World
{
public:
    World() : metadata(m_scratch.path() / "metadata.db"), blobs(m_scratch.path() / "blobs"), pool(1)
    {
        metadata.addAccount(number, "", sha256(token), now);
        account = metadata.findAccount(sha256(token))->id;
    }
    ~World() { pool.join(); }

    ShareRecord makeShare()
    {
        NewShare share;
        share.account = account;
        share.files = {{"photo.jpg", "image/jpeg", announced}, {"empty", "", 0}};
        share.recipients = {{number, "49"}};
        share.now = now;
        share.deadline = now + limits.unfinishedLifetime;
        share.dailyLimit = limits.dailyBytes;
        return metadata.createShare(share).share;
    }

    std::uint64_t bytesOf(const std::string &blob, std::uint64_t most)
    {
        const auto reader = blobs.openForReading(blob);
        std::array<char, 4096> buffer;
        std::uint64_t count = 0;
        while (reader && count <= most) {
            const std::size_t got = reader->read(count, buffer);
            if (got == 0)
                break;
            count += got;
        }
        return count;
    }

    void empty()
    {
        for (const ShareRecord &share : metadata.listShares(account, now))
            (void)metadata.withdrawShare(account, share.key, now);
        metadata.forgetEnded(now, now);
        for (auto doomed = metadata.doomedBlobs(); !doomed.empty(); doomed = metadata.doomedBlobs())
            for (const std::string &blob : doomed) {
                blobs.remove(blob);
                metadata.forgetBlob(blob);
            }
    }

private:
    pelliko::fuzz::Scratch m_scratch;

public:
    SqliteMetadata metadata;
    DirectoryBlobs blobs;
    StoragePool pool;
    const Limits limits = generousLimits();
    std::int64_t account = 0;
};

World &world()
{
    static World one;
    return one;
}

std::string answersTo(std::string_view bytes)
{
    std::array<int, 2> ends{};
    promise(socketpair(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0, ends.data()) == 0,
            "there are sockets");
    Client client(ends[1]);
    asio::io_context io{1};
    NoPeers peers;
    ActiveWrites writes(peers);
    PushHub pushes(io.get_executor(), world().limits, !peers.tellsOfTokens());
    Context context{world().metadata,   world().blobs, peers,  world().pool,
                    world().pool,       writes,        pushes, world().limits,
                    [] { return now; }, "https://host"};
    Peers::Ears ears;
    ears.pushes = [&](const auto &accounts) { pushes.announce(accounts); };
    peers.listen(ears);
    asio::ip::tcp::socket socket(io);
    socket.assign(asio::ip::tcp::v4(), ends[0]);
    const auto connection = Connection::make(
        std::move(socket), Timeouts(), world().pool,
        [&](Exchange &exchange) { return handleRequest(exchange, context); }, refuseHead);
    asio::co_spawn(io, connection->run(), asio::detached);
    client.send(bytes);
    while (!io.stopped()) {
        if (io.run_one_for(quiet) == 0 && !io.stopped()) {
            pushes.stop();
            promise(io.run_one_for(patience) > 0 || io.stopped(), "a connection comes to its end");
        }
        client.readAnswers();
    }
    return std::move(client.answers);
}

void promiseFile(const FileRecord &file)
{
    pelliko::fuzz::promiseFileName(file.name);
    promise(file.offset <= file.size, "no offset lies behind the end of its file");
    if (file.blob.empty())
        return;
    const std::uint64_t stored = world().bytesOf(file.blob, file.size);
    promise(stored >= file.offset, "what an offset counts is stored");
    promise(stored <= file.size, "nothing is stored behind the end of a file");
}

void promiseShare(const ShareRecord &share)
{
    const Limits &limits = world().limits;
    std::uint64_t bytes = 0;
    for (const FileRecord &file : share.files) {
        promiseFile(file);
        bytes += file.size;
        promise(bytes <= limits.shareBytes, "no share is larger than the limit");
        promise(share.state != ShareState::finished || file.complete(),
                "a finished share has all its bytes");
    }
    promise(share.files.size() <= limits.filesPerShare, "no share has more files");
    for (const Recipient &recipient : share.recipients)
        promise(isPhoneNumber(recipient.number), "recipients are phone numbers");
}

std::string replaced(std::string text, const std::string &name, const std::string &value)
{
    for (auto at = text.find(name); at != std::string::npos;
         at = text.find(name, at + value.size()))
        text.replace(at, name.size(), value);
    return text;
}

std::string filledIn(std::string text, const ShareRecord &share)
{
    text = replaced(std::move(text), "{share}", share.key);
    text = replaced(std::move(text), "{upload}", share.files[0].upload);
    return replaced(std::move(text), "{empty}", share.files[1].upload);
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t *data, size_t size)
{
    // More than a socket holds would wait for a reader, and is as good as this much.
    constexpr std::size_t most = 64 * 1024;
    const std::string text(pelliko::fuzz::textOf(data, std::min(size, most)));
    const ShareRecord share = world().makeShare();
    const std::string answers = answersTo(filledIn(text, share));
    promise(answers.find("\"error\":\"internal\"") == std::string::npos, "nothing fails inside");
    for (const ShareRecord &found : world().metadata.listShares(world().account, now))
        promiseShare(found);
    promise(world().metadata.usedBytes(world().account, now - world().limits.dailyWindow) <=
                world().limits.dailyBytes,
            "nobody announces more than a day's bytes");
    world().empty();
    return 0;
}
