#include "ServerRest.h"

#include <glib.h>

#include <algorithm>

namespace pelliko::service
{
namespace
{
constexpr gint64 longestSeconds = 24LL * 3600;
}

int64_t askedRest(const HttpAnswer &answer)
{
    const gint64 seconds = g_ascii_strtoll(answer.header("retry-after").c_str(), nullptr, 10);
    return std::clamp<gint64>(seconds, 0, longestSeconds) * 1000;
}

int64_t ServerRest::left(const std::string &server, int64_t nowMs)
{
    if (server_ != server) {
        server_ = server;
        until_ = 0;
    }
    return std::max<int64_t>(until_ - nowMs, 0);
}

void ServerRest::begin(int64_t restMs, int64_t nowMs)
{
    until_ = std::max(until_, nowMs + restMs);
}

} // namespace pelliko::service
