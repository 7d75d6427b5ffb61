#include "s3/Client.h"

#include "store/StorageFailure.h"

#include <algorithm>
#include <array>
#include <chrono>
#include <cstdlib>
#include <random>
#include <thread>
#include <utility>

namespace pelliko::server::s3
{
namespace
{

using Clock = std::chrono::steady_clock;

constexpr int mostTries = 7;
/// A connection that was kept may have died unnoticed: one try more, however long the first took.
constexpr int leastTries = 2;
/// After which no further try begins.
constexpr std::chrono::seconds tryingTime{10};
constexpr std::chrono::milliseconds firstPause{50};
/// Stores refuse what was signed a quarter of an hour before or after their own time.
constexpr std::time_t toleratedSeconds = 600;
/// A store counts as away only when a call has tried for some seconds.
constexpr std::chrono::seconds firstDistance{1};

/// An empty body's, which most calls have.
const std::string &emptyHash()
{
    static const std::string hash = hexSha256({});
    return hash;
}

/// Twice as long each time, and somewhat apart from what others wait.
std::chrono::milliseconds pauseAfter(int tries)
{
    thread_local std::minstd_rand random{std::random_device{}()};
    const auto longest = firstPause * (1 << tries);
    return longest / 2 + std::chrono::milliseconds(random() % (longest.count() / 2 + 1));
}

/// Another try may succeed.
bool mayPass(const Client::Answer &answer)
{
    static const std::array<std::string_view, 6> passing{
        "InternalError", "SlowDown",       "ServiceUnavailable",
        "BadDigest",     "RequestTimeout", "XAmzContentSHA256Mismatch"};
    if (answer.wasMistimed)
        return true;
    const int status = answer.wire.status;
    return status >= 500 ? status != 501 && status != 507
                         : status == 429 || std::find(passing.begin(), passing.end(),
                                                      answer.errorCode) != passing.end();
}

StorageFailure::Kind kindOf(const Client::Answer &answer)
{
    if (answer.wire.status == 507 || answer.errorCode == "QuotaExceeded" ||
        answer.errorCode == "EntityTooLarge")
        return StorageFailure::Kind::full;
    if (answer.errorCode == "NoSuchUpload" || answer.errorCode == "InvalidPart")
        return StorageFailure::Kind::lost;
    return mayPass(answer) ? StorageFailure::Kind::unavailable : StorageFailure::Kind::broken;
}

std::string rangeOf(std::uint64_t offset, std::uint64_t length)
{
    return "bytes=" + std::to_string(offset) + "-" +
           (length == 0 ? "" : std::to_string(offset + length - 1));
}

/// "bytes 0-9/100", or the length of an answer with everything.
std::uint64_t wholeSize(const WireAnswer &answer)
{
    const std::string range = answer.header("content-range");
    const auto slash = range.rfind('/');
    const std::string text =
        slash == std::string::npos ? answer.header("content-length") : range.substr(slash + 1);
    return std::strtoull(text.c_str(), nullptr, 10);
}

} // namespace

Client::Client(Address address, Now now)
    : m_address(std::move(address)), m_now(now), m_credentials(readCredentials(m_address)),
      m_wires(std::make_shared<Wires>(m_address.caFile)), m_backOff(firstDistance)
{
}

Signable Client::signable(const Call &call) const
{
    const std::string host =
        m_address.virtualHost ? m_address.bucket + "." + m_address.host : m_address.host;
    std::string path = m_address.virtualHost ? "/" : "/" + m_address.bucket;
    if (!call.ofBucket)
        path += (m_address.virtualHost ? "" : "/") + encodedPath(m_address.prefix + call.name);
    Signable request{call.method, std::move(path), call.query, call.headers};
    request.headers.emplace_back("host", host);
    return request;
}

WireRequest Client::prepare(const Call &call, const std::string &payloadHash) const
{
    Signable request = signable(call);
    const std::string host = request.headers.back().second;
    sign(request, payloadHash, {m_credentials, m_address.region, storesTime()});
    std::string url = (m_address.tls ? "https://" : "http://") + host + request.path;
    if (!request.query.empty())
        url += "?" + encodedQuery(request.query);
    return {call.method, std::move(url), std::move(request.headers), call.body};
}

Client::Answer Client::askOnce(const Call &call, const std::string &payloadHash, Wire &wire)
{
    const WireRequest request = prepare(call, payloadHash);
    const std::time_t signedAhead = m_ahead;
    Answer answer;
    answer.wire = call.streamed ? wire.begin(request) : wire.run(request);
    m_backOff.reached();
    if (const auto time = answer.wire.time())
        m_ahead = *time - m_now();
    // Not every refusal has a body that says why.
    answer.wasMistimed =
        answer.wire.status == 403 && std::abs(m_ahead - signedAhead) >= toleratedSeconds;
    // Also an answer that began well may end in an error.
    if (answer.wire.body.find("<Error>") != std::string::npos)
        answer.errorCode = errorCode(answer.wire.body);
    return answer;
}

Client::Answer Client::ask(const Call &call, std::shared_ptr<Wire> wire)
{
    if (!m_backOff.mayTry())
        throw StorageFailure(StorageFailure::Kind::unavailable,
                             "the store " + m_address.host + " could not be reached a moment ago");
    const std::string payloadHash = call.body.empty() ? emptyHash() : hexSha256(call.body);
    if (!wire)
        wire = m_wires->take();
    const auto end = Clock::now() + tryingTime;
    const auto isLast = [end](int tries) {
        return tries >= mostTries || (tries >= leastTries && Clock::now() >= end);
    };
    for (int tries = 1;; ++tries) {
        try {
            Answer answer = askOnce(call, payloadHash, *wire);
            if (!mayPass(answer) || isLast(tries))
                return answer;
        } catch (const TransportFailure &failure) {
            if (isLast(tries)) {
                m_backOff.missed();
                throw StorageFailure(StorageFailure::Kind::unavailable,
                                     "the store " + m_address.host +
                                         " cannot be reached: " + failure.what());
            }
        }
        std::this_thread::sleep_for(pauseAfter(tries));
    }
}

Client::Answer Client::need(const Call &call)
{
    Answer answer = ask(call);
    if (!answer.good())
        throw StorageFailure(kindOf(answer),
                             "the store refused " + call.method + " " + m_address.bucket + "/" +
                                 m_address.prefix + call.name + " with " +
                                 std::to_string(answer.wire.status) + " " + answer.errorCode);
    return answer;
}

void Client::put(const std::string &name, std::string_view bytes)
{
    Call call{"PUT", name};
    call.body = bytes;
    need(call);
}

std::optional<std::uint64_t> Client::sizeOf(const std::string &name)
{
    const Answer answer = ask({"HEAD", name});
    if (answer.wire.status == 404)
        return std::nullopt;
    if (!answer.good())
        throw StorageFailure(kindOf(answer), "the store refused a look at " + name + " with " +
                                                 std::to_string(answer.wire.status));
    return wholeSize(answer.wire);
}

std::optional<Client::Stream> Client::read(const std::string &name, std::uint64_t offset,
                                           std::uint64_t most, const std::string &etag)
{
    Call call{"GET", name};
    call.headers.emplace_back("range", rangeOf(offset, most));
    if (!etag.empty())
        call.headers.emplace_back("if-match", etag);
    call.streamed = true;
    Stream stream{m_wires->take()};
    const Answer answer = ask(call, stream.wire);
    const int status = answer.wire.status;
    if (status == 404 || status == 412)
        return std::nullopt;
    // There is no first byte of something empty.
    if (status == 416)
        return Stream{};
    if (!answer.good() || (status == 200 && offset > 0))
        throw StorageFailure(kindOf(answer), "the store refused to read " + name + " with " +
                                                 std::to_string(status) + " " + answer.errorCode);
    stream.size = wholeSize(answer.wire);
    stream.etag = answer.wire.header("etag");
    return stream;
}

std::string Client::get(const std::string &name, std::uint64_t offset, std::uint64_t length)
{
    Call call{"GET", name};
    call.headers.emplace_back("range", rangeOf(offset, length));
    Answer answer = need(call);
    if (answer.wire.body.size() != length)
        throw StorageFailure(StorageFailure::Kind::lost, "the store's " + name + " is too short");
    return std::move(answer.wire.body);
}

void Client::remove(const std::string &name)
{
    const Answer answer = ask({"DELETE", name});
    if (!answer.good() && answer.wire.status != 404)
        throw StorageFailure(kindOf(answer), "the store refused to delete " + name + " with " +
                                                 std::to_string(answer.wire.status) + " " +
                                                 answer.errorCode);
}

std::vector<Object> Client::objects(const std::string &namesBeginWith)
{
    Call call{"GET"};
    call.ofBucket = true;
    std::vector<Object> found;
    for (Page<Object> page{{}, true, {}, {}}; page.more;) {
        call.query = {{"list-type", "2"}, {"prefix", m_address.prefix + namesBeginWith}};
        if (!page.next.empty())
            call.query.emplace_back("continuation-token", page.next);
        page = objectsIn(need(call).wire.body);
        for (Object &object : page.entries)
            found.push_back({object.name.substr(m_address.prefix.size()), object.size});
    }
    return found;
}

Page<Object> Client::objectsAfter(const std::string &name, std::size_t most)
{
    Call call{"GET"};
    call.ofBucket = true;
    call.query = {
        {"list-type", "2"}, {"prefix", m_address.prefix}, {"max-keys", std::to_string(most)}};
    if (!name.empty())
        call.query.emplace_back("start-after", m_address.prefix + name);
    Page<Object> page = objectsIn(need(call).wire.body);
    for (Object &object : page.entries)
        object.name.erase(0, m_address.prefix.size());
    return page;
}

std::string Client::presigned(const std::string &name, long seconds, const std::string &disposition,
                              const std::string &type) const
{
    Call call{"GET", name};
    call.query = {{"response-content-disposition", disposition}, {"response-content-type", type}};
    Signable request = signable(call);
    const std::string host = request.headers.back().second;
    const std::string path = request.path;
    return (m_address.tls ? "https://" : "http://") + host + path + "?" +
           presignedQuery(std::move(request), seconds,
                          {m_credentials, m_address.region, storesTime()});
}

} // namespace pelliko::server::s3
