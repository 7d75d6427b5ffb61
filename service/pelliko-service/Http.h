#pragma once

#include "SourceFile.h"

#include <cstdint>
#include <functional>
#include <map>
#include <memory>
#include <string>
#include <string_view>
#include <vector>

namespace pelliko::service
{

/** A part of a file as the body of a request. */
struct FileRange {
    std::shared_ptr<SourceFile> file;
    int64_t offset = 0;
    int64_t length = 0;
};

/** Takes the body of a good answer piece by piece. All calls come from the transfer thread. */
class BodySink
{
public:
    virtual ~BodySink() = default;

    /** Before the first piece, and before end() when there is none. @return whether to go on */
    virtual bool begin(long status) = 0;
    /** @return whether to go on */
    virtual bool take(std::string_view piece) = 0;
    /** The whole body was taken. @return whether that is well */
    virtual bool end() = 0;
    /** Why it does not go on: a name of the error table. */
    virtual std::string fault() const = 0;
};

/** A header that every good answer of the server has, and nobody else's page. */
struct AnswerMark {
    std::string lowerName; ///< empty: none is asked for
    std::string start;     ///< how its value begins
};

struct HttpRequest {
    std::string method;
    std::string url;
    std::vector<std::string> headers; ///< "Name: value"
    std::string body;                 ///< used when there is no range
    FileRange range;
    std::shared_ptr<BodySink> sink{}; ///< takes the body of an answer below 300, when there is one
    AnswerMark mark{};    ///< without it an answer for the sink is an "unexpected_answer"
    bool endless = false; ///< an answer that may be silent for long: the sender watches it itself
};

struct HttpAnswer {
    std::string failure; ///< a name of the error table when there was no answer, else empty
    long status = 0;
    std::string body;                           ///< its first MiB
    std::map<std::string, std::string> headers; ///< names in lower case; Retry-After in seconds

    /** The value of a header, empty when absent. */
    std::string header(const std::string &lowerName) const
    {
        const auto found = headers.find(lowerName);
        return found != headers.end() ? found->second : std::string();
    }
};

/** What every transfer keeps to. */
struct TransferLimits {
    int64_t sendRate = 0;      ///< most bytes a second of a body, 0 for no limit
    int64_t stallSeconds = 60; ///< so long without a byte in either direction ends it
};

/** Sends requests. Belongs to the main loop; its callbacks come from there. */
class HttpSender
{
public:
    /** Bytes sent, or of a request with a sink those that it took. */
    using Progress = std::function<void(int64_t bytes)>;
    using Done = std::function<void(const HttpAnswer &)>;

    virtual ~HttpSender() = default;

    /** @return a number for cancel(), not 0. The callbacks never come from inside this call. */
    virtual uint64_t send(HttpRequest request, Progress progress, Done done) = 0;

    /** Stops a request; none of its callbacks comes any more. Unknown numbers are ignored. */
    virtual void cancel(uint64_t transfer) = 0;
};

} // namespace pelliko::service
