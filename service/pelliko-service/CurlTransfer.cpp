#include "CurlTransfer.h"

#include <algorithm>
#include <cctype>
#include <cstdio>
#include <cstdlib>
#include <utility>

namespace pelliko::service
{
namespace
{
constexpr long connectSeconds = 20;
constexpr long bufferBytes = 512L * 1024;
constexpr long smallestBufferBytes = 16L * 1024; // libcurl's own lower bound
constexpr int64_t limitedBuffersPerSecond = 20;  // a limited transfer moves in small steps
constexpr size_t longestAnswer = 1024UL * 1024;
constexpr std::chrono::milliseconds reportInterval{100};

std::string failureName(CURLcode result)
{
    switch (result) {
    case CURLE_OPERATION_TIMEDOUT:
        return "timeout";
    case CURLE_COULDNT_RESOLVE_HOST:
    case CURLE_COULDNT_RESOLVE_PROXY:
    case CURLE_COULDNT_CONNECT:
        return "unreachable";
    case CURLE_SSL_CONNECT_ERROR:
    case CURLE_PEER_FAILED_VERIFICATION:
    case CURLE_WEIRD_SERVER_REPLY:
        return "unexpected_answer";
    default:
        return "connection_lost";
    }
}

long bufferSize(int64_t sendRate)
{
    if (sendRate <= 0) {
        return bufferBytes;
    }
    return std::clamp(static_cast<long>(sendRate / limitedBuffersPerSecond), smallestBufferBytes,
                      bufferBytes);
}

std::string trimmed(const std::string &text)
{
    const auto first = text.find_first_not_of(" \t\r\n");
    const auto last = text.find_last_not_of(" \t\r\n");
    return first == std::string::npos ? std::string() : text.substr(first, last - first + 1);
}
} // namespace

CurlTransfer::CurlTransfer(uint64_t number, HttpRequest request, Progress progress,
                           TransferLimits limits)
    : number_(number), request_(std::move(request)), progress_(std::move(progress)),
      limits_(limits), easy_(curl_easy_init())
{
    setOptions();
    setBody();
    if (request_.sink && !request_.endless) {
        setProgress();
    }
    curl_easy_setopt(easy_, CURLOPT_HTTPHEADER, headers_);
}

CurlTransfer::~CurlTransfer()
{
    curl_easy_cleanup(easy_);
    curl_slist_free_all(headers_);
}

void CurlTransfer::setOptions()
{
    curl_easy_setopt(easy_, CURLOPT_PRIVATE, this);
    curl_easy_setopt(easy_, CURLOPT_URL, request_.url.c_str());
    curl_easy_setopt(easy_, CURLOPT_PROTOCOLS_STR, "http,https");
    curl_easy_setopt(easy_, CURLOPT_FOLLOWLOCATION, 0L);
    curl_easy_setopt(easy_, CURLOPT_NOSIGNAL, 1L);
    curl_easy_setopt(easy_, CURLOPT_USERAGENT, "pelliko-service");
    curl_easy_setopt(easy_, CURLOPT_CONNECTTIMEOUT, connectSeconds);
    if (!request_.endless) {
        curl_easy_setopt(easy_, CURLOPT_LOW_SPEED_LIMIT, 1L);
        curl_easy_setopt(easy_, CURLOPT_LOW_SPEED_TIME, static_cast<long>(limits_.stallSeconds));
    }
    curl_easy_setopt(easy_, CURLOPT_WRITEFUNCTION, onWrite);
    curl_easy_setopt(easy_, CURLOPT_WRITEDATA, this);
    curl_easy_setopt(easy_, CURLOPT_HEADERFUNCTION, onHeader);
    curl_easy_setopt(easy_, CURLOPT_HEADERDATA, this);
    // Whoever runs an own server may have made its certificate; the sign-in trusts the same file.
    if (const char *certificates = std::getenv("SSL_CERT_FILE"); certificates && *certificates) {
        curl_easy_setopt(easy_, CURLOPT_CAINFO, certificates);
    }
    for (const std::string &header : request_.headers) {
        headers_ = curl_slist_append(headers_, header.c_str());
    }
    // Waiting for "100 Continue" costs a round trip and gains nothing: bodies are short or can be
    // resumed.
    headers_ = curl_slist_append(headers_, "Expect:");
}

void CurlTransfer::setBody()
{
    if (request_.range.file) {
        curl_easy_setopt(easy_, CURLOPT_UPLOAD, 1L);
        curl_easy_setopt(easy_, CURLOPT_INFILESIZE_LARGE,
                         static_cast<curl_off_t>(request_.range.length));
        curl_easy_setopt(easy_, CURLOPT_UPLOAD_BUFFERSIZE, bufferSize(limits_.sendRate));
        curl_easy_setopt(easy_, CURLOPT_MAX_SEND_SPEED_LARGE,
                         static_cast<curl_off_t>(limits_.sendRate));
        curl_easy_setopt(easy_, CURLOPT_READFUNCTION, onRead);
        curl_easy_setopt(easy_, CURLOPT_READDATA, this);
        curl_easy_setopt(easy_, CURLOPT_SEEKFUNCTION, onSeek);
        curl_easy_setopt(easy_, CURLOPT_SEEKDATA, this);
        setProgress();
    } else if (request_.method == "HEAD") {
        curl_easy_setopt(easy_, CURLOPT_NOBODY, 1L);
    } else if (request_.method == "POST") {
        curl_easy_setopt(easy_, CURLOPT_POST, 1L);
        curl_easy_setopt(easy_, CURLOPT_POSTFIELDS, request_.body.data());
        curl_easy_setopt(easy_, CURLOPT_POSTFIELDSIZE_LARGE,
                         static_cast<curl_off_t>(request_.body.size()));
    }
    curl_easy_setopt(easy_, CURLOPT_CUSTOMREQUEST, request_.method.c_str());
}

void CurlTransfer::setProgress()
{
    curl_easy_setopt(easy_, CURLOPT_XFERINFOFUNCTION, onProgress);
    curl_easy_setopt(easy_, CURLOPT_XFERINFODATA, this);
    curl_easy_setopt(easy_, CURLOPT_NOPROGRESS, 0L);
}

bool CurlTransfer::goodAnswer() const
{
    long status = 0;
    curl_easy_getinfo(easy_, CURLINFO_RESPONSE_CODE, &status);
    return status >= 200 && status < 300;
}

bool CurlTransfer::hasMark() const
{
    const AnswerMark &mark = request_.mark;
    return mark.lowerName.empty() || answer_.header(mark.lowerName).starts_with(mark.start);
}

bool CurlTransfer::beginSink()
{
    if (!hasMark()) {
        localFailure_ = "unexpected_answer";
        return false;
    }
    long status = 0;
    curl_easy_getinfo(easy_, CURLINFO_RESPONSE_CODE, &status);
    sinkBegun_ = true;
    return request_.sink->begin(status);
}

bool CurlTransfer::takesPiece(std::string_view piece)
{
    const bool taken = (sinkBegun_ || beginSink()) && request_.sink->take(piece);
    if (!taken && localFailure_.empty()) {
        localFailure_ = request_.sink->fault();
    }
    return taken;
}

// An empty body brings no piece.
void CurlTransfer::endSink()
{
    if (takesPiece({}) && !request_.sink->end()) {
        localFailure_ = request_.sink->fault();
    }
}

// It may come as a date.
void CurlTransfer::noteRetryAfter()
{
    curl_off_t seconds = 0;
    const auto found = answer_.headers.find("retry-after");
    if (found != answer_.headers.end() &&
        curl_easy_getinfo(easy_, CURLINFO_RETRY_AFTER, &seconds) == CURLE_OK) {
        found->second = std::to_string(seconds);
    }
}

HttpAnswer CurlTransfer::answer(CURLcode result)
{
    curl_easy_getinfo(easy_, CURLINFO_RESPONSE_CODE, &answer_.status);
    noteRetryAfter();
    if (request_.sink && result == CURLE_OK && goodAnswer()) {
        endSink();
    }
    if (!localFailure_.empty()) {
        answer_.failure = localFailure_;
    } else if (result != CURLE_OK && answer_.status < 400) {
        // A refusal that came before the whole body was sent is an answer all the same.
        answer_.failure = failureName(result);
    }
    return answer_;
}

size_t CurlTransfer::onRead(char *buffer, size_t size, size_t count, void *self)
{
    auto &transfer = *static_cast<CurlTransfer *>(self);
    const FileRange &range = transfer.request_.range;
    const int64_t room = static_cast<int64_t>(size * count);
    const int64_t wanted = std::min(room, range.length - transfer.position_);
    const int64_t got = range.file->read(buffer, wanted, range.offset + transfer.position_);
    if (got < 0 || (got == 0 && wanted > 0)) {
        transfer.localFailure_ = got < 0 ? "file_unreadable" : "file_changed";
        return CURL_READFUNC_ABORT;
    }
    transfer.position_ += got;
    return static_cast<size_t>(got);
}

int CurlTransfer::onSeek(void *self, curl_off_t offset, int origin)
{
    if (origin != SEEK_SET) {
        return CURL_SEEKFUNC_CANTSEEK;
    }
    static_cast<CurlTransfer *>(self)->position_ = offset;
    return CURL_SEEKFUNC_OK;
}

size_t CurlTransfer::onWrite(char *data, size_t size, size_t count, void *self)
{
    auto &transfer = *static_cast<CurlTransfer *>(self);
    const size_t length = size * count;
    if (transfer.request_.sink && transfer.goodAnswer()) {
        return transfer.takesPiece({data, length}) ? length : CURL_WRITEFUNC_ERROR;
    }
    std::string &body = transfer.answer_.body;
    body.append(data, std::min(length, longestAnswer - body.size()));
    return length;
}

size_t CurlTransfer::onHeader(char *data, size_t size, size_t count, void *self)
{
    const size_t length = size * count;
    const std::string line(data, length);
    const auto colon = line.find(':');
    if (colon != std::string::npos) {
        std::string name = line.substr(0, colon);
        std::transform(name.begin(), name.end(), name.begin(),
                       [](unsigned char c) { return static_cast<char>(std::tolower(c)); });
        static_cast<CurlTransfer *>(self)->answer_.headers[name] = trimmed(line.substr(colon + 1));
    }
    return length;
}

int CurlTransfer::onProgress(void *self, curl_off_t, curl_off_t received, curl_off_t,
                             curl_off_t sent)
{
    auto &transfer = *static_cast<CurlTransfer *>(self);
    const bool receives = transfer.request_.sink != nullptr;
    if (receives && !transfer.goodAnswer()) {
        return 0;
    }
    const curl_off_t bytes = receives ? received : sent;
    const auto now = std::chrono::steady_clock::now();
    if (bytes != transfer.reported_ && now - transfer.lastReport_ >= reportInterval) {
        transfer.reported_ = bytes;
        transfer.lastReport_ = now;
        transfer.progress_(bytes);
    }
    return 0;
}

} // namespace pelliko::service
