#pragma once

#include "Http.h"

#include <curl/curl.h>

#include <chrono>

namespace pelliko::service
{

/** One request on its way through libcurl; lives on the transfer thread. */
class CurlTransfer
{
public:
    using Progress = std::function<void(int64_t bytes)>;

    CurlTransfer(uint64_t number, HttpRequest request, Progress progress, TransferLimits limits);
    ~CurlTransfer();
    CurlTransfer(const CurlTransfer &) = delete;
    CurlTransfer &operator=(const CurlTransfer &) = delete;

    uint64_t number() const { return number_; }
    CURL *handle() const { return easy_; }

    /** The answer after libcurl said that the transfer is over. */
    HttpAnswer answer(CURLcode result);

private:
    void setOptions();
    void setBody();
    void setProgress();
    bool goodAnswer() const;
    bool hasMark() const;
    bool beginSink();
    bool takesPiece(std::string_view piece);
    void endSink();
    void noteRetryAfter();
    static size_t onRead(char *buffer, size_t size, size_t count, void *self);
    static int onSeek(void *self, curl_off_t offset, int origin);
    static size_t onWrite(char *data, size_t size, size_t count, void *self);
    static size_t onHeader(char *data, size_t size, size_t count, void *self);
    static int onProgress(void *self, curl_off_t, curl_off_t received, curl_off_t, curl_off_t sent);

    uint64_t number_;
    HttpRequest request_;
    Progress progress_;
    TransferLimits limits_;
    CURL *easy_;
    curl_slist *headers_ = nullptr;
    int64_t position_ = 0; // within the range
    int64_t reported_ = 0;
    std::chrono::steady_clock::time_point lastReport_;
    std::string localFailure_; // what went wrong on this side of the connection
    bool sinkBegun_ = false;
    HttpAnswer answer_;
};

} // namespace pelliko::service
