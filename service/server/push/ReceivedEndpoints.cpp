#include "push/ReceivedEndpoints.h"

#include "accounts/Accounts.h"
#include "http/Errors.h"
#include "pages/Download.h"
#include "shares/ShareRules.h"
#include "text/Secrets.h"
#include "tus/TusHeaders.h"

#include <nlohmann/json.hpp>

#include <cstddef>
#include <cstdint>
#include <limits>
#include <utility>

namespace pelliko::server
{
namespace
{

using nlohmann::json;

/// An id has at most 19 digits, a token always 22 characters.
ReceivedKey keyOf(const std::string &text)
{
    if (looksLikeToken(text))
        return {0, sha256(text)};
    const auto push = parseNumber(text);
    if (!push || *push == 0 || *push > std::numeric_limits<std::int64_t>::max())
        throw Refusal(Error::notFound);
    return {static_cast<std::int64_t>(*push), {}};
}

/// The names are those of the interface: who receives a share cares whether it can be had.
const char *stateName(ShareState state)
{
    switch (state) {
    case ShareState::uploading:
    case ShareState::finished:
        return "available";
    case ShareState::withdrawn:
        return "withdrawn";
    case ShareState::expired:
        break;
    }
    return "expired";
}

/// Without the other recipients, who are none of this one's business.
json recordOf(const ReceivedRecord &received)
{
    json files = json::array();
    for (std::size_t index = 0; index < received.share.files.size(); ++index) {
        const FileRecord &file = received.share.files[index];
        files.push_back(
            {{"index", index}, {"name", file.name}, {"size", file.size}, {"type", file.type}});
        if (received.share.lost(file))
            files.back()["lost"] = true;
    }
    return {{"id", received.push},
            {"sender", received.senderNumber},
            {"created", received.share.created},
            {"expires", received.share.deadline},
            {"state", stateName(received.share.state)},
            {"files", std::move(files)}};
}

Task<ReceivedRecord> find(Exchange &exchange, Context &context, std::string text)
{
    const Account account = co_await authenticate(exchange, context);
    const ReceivedKey key = keyOf(text);
    const Seconds now = context.now();
    auto received = co_await context.pool.run(
        [&] { return context.metadata.findReceived(account.id, key, now); });
    if (!received)
        throw Refusal(Error::notFound);
    co_return std::move(*received);
}

} // namespace

Task<void> listReceived(Exchange &exchange, Context &context)
{
    const Account account = co_await authenticate(exchange, context);
    const Seconds now = context.now();
    const auto received =
        co_await context.pool.run([&] { return context.metadata.listReceived(account.id, now); });
    json records = json::array();
    for (const ReceivedRecord &record : received)
        records.push_back(recordOf(record));
    const json body{{"received", std::move(records)}};
    co_await exchange.respond(jsonResponse(Status::ok, body.dump()));
}

Task<void> showReceived(Exchange &exchange, Context &context, std::string key)
{
    const ReceivedRecord received = co_await find(exchange, context, std::move(key));
    co_await exchange.respond(jsonResponse(Status::ok, recordOf(received).dump()));
}

Task<void> forgetReceived(Exchange &exchange, Context &context, std::string text)
{
    const Account account = co_await authenticate(exchange, context);
    const ReceivedKey key = keyOf(text);
    const bool known =
        co_await context.pool.run([&] { return context.metadata.forgetReceived(account.id, key); });
    if (!known)
        throw Refusal(Error::notFound);
    co_await exchange.respond(makeResponse(Status::noContent));
}

Task<void> downloadReceived(Exchange &exchange, Context &context, std::string key,
                            std::string index)
{
    const ReceivedRecord received = co_await find(exchange, context, std::move(key));
    const auto position = parseNumber(index);
    if (!position || *position >= received.share.files.size())
        throw Refusal(Error::notFound);
    checkLive(received.share.state);
    co_await sendShareFile(exchange, context, received.share.files[*position]);
}

} // namespace pelliko::server
