#pragma once

#include "http/Message.h"

#include <exception>
#include <string>
#include <vector>

namespace pelliko::server
{

/// Every reason for which the server refuses a request.
enum class Error {
    badRequest,
    unauthorized,
    notFound,
    methodNotAllowed,
    conflict,
    /// The share has ended, whichever way.
    gone,
    /// The same over the wire; pages tell them apart.
    expired,
    withdrawn,
    /// Of a share that goes on otherwise.
    fileLost,
    /// All of several files, of a share that has not ended.
    filesLost,
    unsupportedTusVersion,
    tooManyFiles,
    shareTooLarge,
    tooLarge,
    unsupportedMediaType,
    rangeNotSatisfiable,
    dailyLimit,
    numbersLimit,
    headerTooLarge,
    internal,
    noSpace,
    busy,
    unavailable,
    numberInvalid,
    numberTaken,
    codeUnknown,
    codeExpired,
    codeUsedUp,
    codeForOther,
    tooManyAttempts,
};

/// One row of the table of refusals: what goes over the wire.
struct ErrorEntry {
    Error error;
    const char *name;
    int status;
    /// Used when the place that refuses has nothing more exact to say.
    const char *sentence;
};

[[nodiscard]] const ErrorEntry &errorEntry(Error error);

/// Thrown by whatever handles a request, caught once by the router, which answers with it.
class Refusal : public std::exception
{
public:
    explicit Refusal(Error error, std::string message = {}, std::vector<Header> headers = {});

    [[nodiscard]] const char *what() const noexcept override { return m_message.c_str(); }
    [[nodiscard]] const ErrorEntry &entry() const { return errorEntry(m_error); }
    [[nodiscard]] const std::vector<Header> &headers() const { return m_headers; }

private:
    Error m_error;
    std::string m_message;
    std::vector<Header> m_headers;
};

/// The refusal as `{"error": NAME, "message": SENTENCE}`.
[[nodiscard]] Response errorResponse(const Refusal &refusal);

} // namespace pelliko::server
