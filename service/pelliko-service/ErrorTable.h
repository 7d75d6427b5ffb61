#pragma once

#include <string_view>

namespace pelliko::service
{

constexpr int errorDevice = -5;      ///< the share's files or recipients are at fault
constexpr int errorUnreachable = -7; ///< the server could not be reached for a long time
constexpr int errorRefused = -16;    ///< the server, or the service itself, refuses the request

/** What to do about a failure, and what the client is told when it is final. */
struct Failure {
    std::string_view name;
    bool retry;
    int code;
};

/** The entry of a name: the server's refusals and the service's own; unknown names read as
 * "unexpected_answer". */
const Failure &failureNamed(std::string_view name);

/** The entry for an answer without a known name in its body. */
const Failure &failureOfStatus(long httpStatus);

/** Whether the table has an entry of that name. */
bool isFailureName(std::string_view name);

} // namespace pelliko::service
