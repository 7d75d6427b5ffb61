#include "http/Errors.h"

#include <nlohmann/json.hpp>

#include <algorithm>
#include <iterator>
#include <utility>

namespace pelliko::server
{
namespace
{

constexpr ErrorEntry table[] = {
    {Error::badRequest, "bad_request", 400, "The request cannot be understood."},
    {Error::unauthorized, "unauthorized", 401, "A valid account token is needed."},
    {Error::notFound, "not_found", 404, "There is nothing at this address."},
    {Error::methodNotAllowed, "method_not_allowed", 405, "This address has no such method."},
    {Error::conflict, "conflict", 409, "The request does not fit the present state."},
    {Error::gone, "gone", 410, "The share has expired or was withdrawn."},
    {Error::expired, "gone", 410, "The share has expired."},
    {Error::withdrawn, "gone", 410, "The share was withdrawn."},
    {Error::fileLost, "gone", 410, "The server does not have this file any more."},
    {Error::filesLost, "gone", 410, "The server does not have these files any more."},
    {Error::unsupportedTusVersion, "unsupported_tus_version", 412,
     "Tus-Resumable has to be 1.0.0."},
    {Error::tooManyFiles, "too_many_files", 413, "A share holds at most 100 files."},
    {Error::shareTooLarge, "share_too_large", 413, "A share holds at most 1 GiB."},
    {Error::tooLarge, "too_large", 413, "The body is larger than allowed."},
    {Error::unsupportedMediaType, "unsupported_media_type", 415,
     "Content-Type has to be application/offset+octet-stream."},
    {Error::rangeNotSatisfiable, "range_not_satisfiable", 416,
     "The file does not have the wanted bytes."},
    {Error::dailyLimit, "daily_limit", 429, "The account's limit for 24 hours is used up."},
    {Error::numbersLimit, "numbers_limit", 429,
     "The account has asked for too many numbers within 24 hours."},
    {Error::headerTooLarge, "header_too_large", 431, "The request's head is over 16 KiB."},
    {Error::internal, "internal", 500, "The server failed."},
    {Error::noSpace, "no_space", 507, "The store is full."},
    {Error::busy, "busy", 503, "The server has as many push streams as it can carry."},
    {Error::unavailable, "unavailable", 503, "The server's store cannot be reached at the moment."},
    {Error::numberInvalid, "number_invalid", 400,
     "The number has to be in international form, like +4915112345678."},
    {Error::numberTaken, "number_taken", 409, "The number has an account already."},
    {Error::codeUnknown, "code_unknown", 403, "There is no such invitation code."},
    {Error::codeExpired, "code_expired", 403, "The invitation code has expired."},
    {Error::codeUsedUp, "code_used_up", 403, "The invitation code has been used up."},
    {Error::codeForOther, "code_for_other_number", 403, "The code is for another number."},
    {Error::tooManyAttempts, "too_many_attempts", 429, "There were too many attempts."},
};

} // namespace

const ErrorEntry &errorEntry(Error error)
{
    const auto *found = std::find_if(std::begin(table), std::end(table),
                                     [&](const ErrorEntry &e) { return e.error == error; });
    return found == std::end(table) ? errorEntry(Error::internal) : *found;
}

Refusal::Refusal(Error error, std::string message, std::vector<Header> headers)
    : m_error(error), m_message(message.empty() ? errorEntry(error).sentence : std::move(message)),
      m_headers(std::move(headers))
{
}

Response errorResponse(const Refusal &refusal)
{
    nlohmann::json body{{"error", refusal.entry().name}, {"message", refusal.what()}};
    Response response{refusal.entry().status, refusal.headers(), body.dump() + "\n"};
    response.headers.push_back({"Content-Type", "application/json"});
    response.headers.push_back({"Cache-Control", "no-store"});
    return response;
}

} // namespace pelliko::server
