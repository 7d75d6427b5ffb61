#include "ErrorTable.h"

#include <algorithm>
#include <array>

namespace pelliko::service
{
namespace
{
constexpr std::array table{
    // the server's refusals
    Failure{"bad_request", false, errorRefused}, Failure{"unauthorized", false, errorRefused},
    Failure{"forbidden", false, errorRefused}, Failure{"not_found", false, errorRefused},
    Failure{"method_not_allowed", false, errorRefused},
    Failure{"conflict", true, errorUnreachable}, // offsets are asked again
    Failure{"gone", false, errorRefused}, Failure{"unsupported_tus_version", false, errorRefused},
    Failure{"too_many_files", false, errorRefused}, Failure{"share_too_large", false, errorRefused},
    Failure{"too_large", false, errorRefused}, Failure{"daily_limit", false, errorRefused},
    Failure{"numbers_limit", true, errorUnreachable},
    Failure{"header_too_large", false, errorRefused}, Failure{"internal", true, errorUnreachable},
    Failure{"no_space", true, errorUnreachable},
    // what happens on the way
    Failure{"unreachable", true, errorUnreachable}, Failure{"timeout", true, errorUnreachable},
    Failure{"connection_lost", true, errorUnreachable}, Failure{"busy", true, errorUnreachable},
    // also the login page of a hotel's network, in place of the server's answer
    Failure{"unexpected_answer", true, errorUnreachable},
    // on this side
    Failure{"no_account", false, errorRefused},
    Failure{"no_recipient", false, errorDevice}, // no number of them is a phone number
    Failure{"file_changed", false, errorDevice}, Failure{"file_vanished", false, errorDevice},
    Failure{"file_unreadable", false, errorDevice}, Failure{"launch_failed", false, errorDevice},
    Failure{"queue_failed", true, errorDevice},
    Failure{"disk_full", false, errorDevice}, // where a download is saved
    Failure{"disk_failed", false, errorDevice},
    Failure{"too_much", true, errorUnreachable}, // more than was announced
};

auto find(std::string_view name)
{
    return std::find_if(table.begin(), table.end(),
                        [name](const Failure &entry) { return entry.name == name; });
}

// Whoever stands between may answer with any status, a hotel's page with 404 or 403 too: only the
// name in the body makes a refusal final. How much may be sent at once, though, those do decide.
std::string_view nameOfStatus(long status)
{
    switch (status) {
    case 408:
        return "timeout";
    case 409:
        return "conflict";
    case 413:
        return "too_large";
    case 429:
        return "busy";
    case 431:
        return "header_too_large";
    case 507:
        return "no_space";
    default:
        return status >= 500 ? "internal" : "unexpected_answer";
    }
}
} // namespace

const Failure &failureNamed(std::string_view name)
{
    const auto found = find(name);
    return found != table.end() ? *found : *find("unexpected_answer");
}

const Failure &failureOfStatus(long httpStatus)
{
    return failureNamed(nameOfStatus(httpStatus));
}

bool isFailureName(std::string_view name)
{
    return find(name) != table.end();
}

} // namespace pelliko::service
