#include "s3/Wire.h"

#include <curl/curl.h>

#include <algorithm>
#include <cstdlib>
#include <cstring>
#include <utility>

namespace pelliko::server::s3
{
namespace
{

constexpr long connectSeconds = 5;
/// A store that sends and takes nothing for so long is as good as gone.
constexpr long silentSeconds = 15;
constexpr long bufferBytes = 512L * 1024;
/// Of a streamed body; the rest waits in the network.
constexpr std::size_t mostWaiting = 512UL * 1024;
constexpr std::size_t longestHeaders = 64UL * 1024;
constexpr std::size_t longestBody = 16UL * 1024 * 1024;
/// Only a bound for libcurl's own timers: what happens on the network ends the wait.
constexpr int pollMilliseconds = 1000;
constexpr std::size_t mostIdle = 64;

void startCurl()
{
    static const CURLcode started = curl_global_init(CURL_GLOBAL_DEFAULT);
    if (started != CURLE_OK)
        throw std::runtime_error("cannot start the HTTP library");
}

std::string smallLetters(std::string text)
{
    std::transform(text.begin(), text.end(), text.begin(), [](char c) {
        return c >= 'A' && c <= 'Z' ? static_cast<char>(c - 'A' + 'a') : c;
    });
    return text;
}

} // namespace

std::string WireAnswer::header(std::string_view name) const
{
    const auto found = std::find_if(headers.begin(), headers.end(),
                                    [&](const auto &pair) { return pair.first == name; });
    return found == headers.end() ? std::string() : found->second;
}

std::optional<std::time_t> WireAnswer::time() const
{
    const std::string date = header("date");
    const std::time_t sent = date.empty() ? -1 : curl_getdate(date.c_str(), nullptr);
    return sent < 0 ? std::nullopt : std::optional(sent);
}

struct Wire::State {
    explicit State(std::string ca) : caFile(std::move(ca))
    {
        startCurl();
        easy = curl_easy_init();
        multi = curl_multi_init();
        if (easy == nullptr || multi == nullptr)
            throw std::runtime_error("cannot start the HTTP library");
    }
    ~State()
    {
        end();
        curl_multi_cleanup(multi);
        curl_easy_cleanup(easy);
    }
    State(const State &) = delete;
    State &operator=(const State &) = delete;

    void start(const WireRequest &request, bool asStream);
    void end();
    void setBody(const WireRequest &request);
    void turn();
    void wait();
    std::size_t takeBody(std::string_view bytes);
    void takeHeader(std::string_view line);

    static std::size_t onBody(char *bytes, std::size_t one, std::size_t count, void *state);
    static std::size_t onHeader(char *bytes, std::size_t one, std::size_t count, void *state);

    std::string caFile;
    CURL *easy = nullptr;
    CURLM *multi = nullptr;
    curl_slist *headers = nullptr;
    bool running = false;
    bool streaming = false;
    bool paused = false;
    CURLcode result = CURLE_OK;
    WireAnswer answer;
    bool headComplete = false;
    std::size_t headerBytes = 0;
    /// Bytes of a stream that nobody has read yet.
    std::string waiting;
    std::size_t waitingBegin = 0;
    /// Where a reader waits for bytes: they need no other stop on their way.
    std::span<char> target;
    std::size_t targetFilled = 0;
};

void Wire::State::setBody(const WireRequest &request)
{
    if (request.method == "GET") {
        curl_easy_setopt(easy, CURLOPT_HTTPGET, 1L);
        return;
    }
    if (request.method == "HEAD") {
        curl_easy_setopt(easy, CURLOPT_NOBODY, 1L);
        return;
    }
    if (request.method == "PUT" || request.method == "POST") {
        curl_easy_setopt(easy, CURLOPT_POSTFIELDSIZE_LARGE,
                         static_cast<curl_off_t>(request.body.size()));
        curl_easy_setopt(easy, CURLOPT_POSTFIELDS, request.body.empty() ? "" : request.body.data());
    }
    curl_easy_setopt(easy, CURLOPT_CUSTOMREQUEST, request.method.c_str());
}

void Wire::State::start(const WireRequest &request, bool asStream)
{
    end();
    curl_easy_reset(easy);
    answer = {};
    waiting.clear();
    waitingBegin = 0;
    headComplete = paused = false;
    headerBytes = 0;
    result = CURLE_OK;
    streaming = asStream;
    std::string line;
    for (const auto &[name, value] : request.headers) {
        line.assign(name).append(": ").append(value);
        headers = curl_slist_append(headers, line.c_str());
    }
    // The whole body is at hand: asking first costs more than it saves.
    headers = curl_slist_append(headers, "Expect:");
    headers = curl_slist_append(headers, "Content-Type:");
    curl_easy_setopt(easy, CURLOPT_URL, request.url.c_str());
    curl_easy_setopt(easy, CURLOPT_HTTPHEADER, headers);
    curl_easy_setopt(easy, CURLOPT_PROTOCOLS_STR, "http,https");
    curl_easy_setopt(easy, CURLOPT_PROXY, "");
    curl_easy_setopt(easy, CURLOPT_NOSIGNAL, 1L);
    curl_easy_setopt(easy, CURLOPT_HTTP_VERSION, static_cast<long>(CURL_HTTP_VERSION_1_1));
    curl_easy_setopt(easy, CURLOPT_CONNECTTIMEOUT, connectSeconds);
    curl_easy_setopt(easy, CURLOPT_LOW_SPEED_LIMIT, 1L);
    curl_easy_setopt(easy, CURLOPT_LOW_SPEED_TIME, silentSeconds);
    curl_easy_setopt(easy, CURLOPT_TCP_KEEPALIVE, 1L);
    curl_easy_setopt(easy, CURLOPT_BUFFERSIZE, bufferBytes);
    curl_easy_setopt(easy, CURLOPT_UPLOAD_BUFFERSIZE, bufferBytes);
    if (!caFile.empty())
        curl_easy_setopt(easy, CURLOPT_CAINFO, caFile.c_str());
    curl_easy_setopt(easy, CURLOPT_WRITEFUNCTION, &State::onBody);
    curl_easy_setopt(easy, CURLOPT_WRITEDATA, this);
    curl_easy_setopt(easy, CURLOPT_HEADERFUNCTION, &State::onHeader);
    curl_easy_setopt(easy, CURLOPT_HEADERDATA, this);
    setBody(request);
    curl_multi_add_handle(multi, easy);
    running = true;
}

void Wire::State::end()
{
    if (running)
        curl_multi_remove_handle(multi, easy);
    running = false;
    curl_slist_free_all(headers);
    headers = nullptr;
}

/// Does what can be done without waiting.
void Wire::State::turn()
{
    int still = 0;
    if (curl_multi_perform(multi, &still) != CURLM_OK)
        throw TransportFailure("the HTTP library failed");
    int left = 0;
    while (const CURLMsg *message = curl_multi_info_read(multi, &left)) {
        if (message->msg != CURLMSG_DONE)
            continue;
        result = message->data.result;
        end();
        if (result != CURLE_OK)
            throw TransportFailure(curl_easy_strerror(result));
        headComplete = true;
        return;
    }
}

void Wire::State::wait()
{
    if (running && curl_multi_poll(multi, nullptr, 0, pollMilliseconds, nullptr) != CURLM_OK)
        throw TransportFailure("the HTTP library failed");
}

std::size_t Wire::State::takeBody(std::string_view bytes)
{
    headComplete = true;
    const std::size_t all = bytes.size();
    if (!streaming || answer.status >= 300) {
        if (answer.body.size() + all > longestBody)
            return 0;
        answer.body.append(bytes);
        return all;
    }
    if (waiting.size() >= mostWaiting) {
        paused = true;
        return CURL_WRITEFUNC_PAUSE;
    }
    const std::size_t direct = std::min(all, target.size() - targetFilled);
    if (direct > 0) {
        std::memcpy(target.data() + targetFilled, bytes.data(), direct);
        targetFilled += direct;
    }
    waiting.append(bytes.substr(direct));
    return all;
}

void Wire::State::takeHeader(std::string_view line)
{
    if (line.rfind("HTTP/", 0) == 0) {
        // An answer that only announces another is followed by that one.
        answer = {};
        const auto space = line.find(' ');
        answer.status = space == std::string_view::npos
                            ? 0
                            : std::atoi(std::string(line.substr(space + 1, 3)).c_str());
        return;
    }
    const auto colon = line.find(':');
    if (colon == std::string_view::npos)
        return;
    const auto first = line.find_first_not_of(" \t\r\n", colon + 1);
    const auto last = line.find_last_not_of(" \t\r\n");
    answer.headers.emplace_back(smallLetters(std::string(line.substr(0, colon))),
                                first == std::string_view::npos
                                    ? std::string()
                                    : std::string(line.substr(first, last - first + 1)));
}

std::size_t Wire::State::onBody(char *bytes, std::size_t, std::size_t count, void *state)
{
    try {
        return static_cast<State *>(state)->takeBody({bytes, count});
    } catch (...) {
        return 0; // the library gives the transfer up
    }
}

std::size_t Wire::State::onHeader(char *bytes, std::size_t, std::size_t count, void *state)
{
    auto *self = static_cast<State *>(state);
    self->headerBytes += count;
    if (self->headerBytes > longestHeaders)
        return 0;
    try {
        self->takeHeader({bytes, count});
        return count;
    } catch (...) {
        return 0;
    }
}

Wire::Wire(const std::string &caFile) : m_state(std::make_unique<State>(caFile)) {}

Wire::~Wire() = default;

WireAnswer Wire::run(const WireRequest &request)
{
    State &state = *m_state;
    state.start(request, false);
    while (true) {
        state.turn();
        if (!state.running)
            return std::move(state.answer);
        state.wait();
    }
}

WireAnswer Wire::begin(const WireRequest &request)
{
    State &state = *m_state;
    state.start(request, true);
    while (true) {
        state.turn();
        const bool refused = state.answer.status >= 300;
        if (!state.running || (state.headComplete && !refused))
            return state.answer;
        state.wait();
    }
}

std::size_t Wire::read(std::span<char> into)
{
    State &state = *m_state;
    if (!state.waiting.empty()) {
        const std::size_t count = std::min(into.size(), state.waiting.size() - state.waitingBegin);
        std::memcpy(into.data(), state.waiting.data() + state.waitingBegin, count);
        state.waitingBegin += count;
        if (state.waitingBegin == state.waiting.size()) {
            state.waiting.clear();
            state.waitingBegin = 0;
        }
        return count;
    }
    state.target = into;
    state.targetFilled = 0;
    try {
        while (state.running && state.targetFilled == 0) {
            if (std::exchange(state.paused, false))
                curl_easy_pause(state.easy, CURLPAUSE_CONT);
            state.turn();
            if (state.targetFilled == 0)
                state.wait();
        }
    } catch (...) {
        state.target = {};
        throw;
    }
    state.target = {};
    return std::exchange(state.targetFilled, 0);
}

void Wire::stop()
{
    m_state->end();
    m_state->waiting = {};
}

std::shared_ptr<Wire> Wires::take()
{
    std::unique_ptr<Wire> wire;
    {
        const std::lock_guard lock(m_mutex);
        if (!m_idle.empty()) {
            wire = std::move(m_idle.back());
            m_idle.pop_back();
        }
    }
    if (!wire)
        wire = std::make_unique<Wire>(m_caFile);
    Wire *raw = wire.release();
    return {raw,
            [wires = shared_from_this()](Wire *used) { wires->give(std::unique_ptr<Wire>(used)); }};
}

void Wires::give(std::unique_ptr<Wire> wire)
{
    wire->stop();
    const std::lock_guard lock(m_mutex);
    if (m_idle.size() < mostIdle)
        m_idle.push_back(std::move(wire));
}

} // namespace pelliko::server::s3
