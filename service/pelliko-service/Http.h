#pragma once

#include "SourceFile.h"

#include <cstdint>
#include <functional>
#include <map>
#include <memory>
#include <string>
#include <vector>

namespace pelliko::service
{

/** A part of a file as the body of a request. */
struct FileRange {
    std::shared_ptr<SourceFile> file;
    int64_t offset = 0;
    int64_t length = 0;
};

struct HttpRequest {
    std::string method;
    std::string url;
    std::vector<std::string> headers; ///< "Name: value"
    std::string body;                 ///< used when there is no range
    FileRange range;
};

struct HttpAnswer {
    std::string failure; ///< a name of the error table when there was no answer, else empty
    long status = 0;
    std::string body;                           ///< its first MiB
    std::map<std::string, std::string> headers; ///< names in lower case

    /** The value of a header, empty when absent. */
    std::string header(const std::string &lowerName) const
    {
        const auto found = headers.find(lowerName);
        return found != headers.end() ? found->second : std::string();
    }
};

/** Sends requests. Belongs to the main loop; its callbacks come from there. */
class HttpSender
{
public:
    using Progress = std::function<void(int64_t bytesSent)>;
    using Done = std::function<void(const HttpAnswer &)>;

    virtual ~HttpSender() = default;

    /** @return a number for cancel(), not 0. The callbacks never come from inside this call. */
    virtual uint64_t send(HttpRequest request, Progress progress, Done done) = 0;

    /** Stops a request; none of its callbacks comes any more. Unknown numbers are ignored. */
    virtual void cancel(uint64_t transfer) = 0;
};

} // namespace pelliko::service
