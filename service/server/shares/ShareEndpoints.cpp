#include "shares/ShareEndpoints.h"

#include "accounts/Accounts.h"
#include "http/Errors.h"
#include "shares/ShareJson.h"
#include "shares/ShareRules.h"
#include "text/Secrets.h"

#include <utility>

namespace pelliko::server
{
namespace
{

constexpr std::size_t jsonLimit = 1024 * 1024;

std::string idempotencyKeyOf(const Request &request)
{
    const std::string *header = request.header("Idempotency-Key");
    std::string key = header == nullptr ? std::string() : *header;
    checkIdempotencyKey(key);
    return key;
}

NewShare newShareOf(ShareRequest request, const Account &account, const Context &context)
{
    NewShare share;
    share.account = account.id;
    share.files = std::move(request.files);
    share.reshareOf = std::move(request.reshareOf);
    share.recipients = std::move(request.recipients);
    share.now = context.now();
    share.deadline = share.now + context.limits.unfinishedLifetime;
    share.dailyLimit = context.limits.dailyBytes;
    share.limitWindow = context.limits.dailyWindow;
    return share;
}

} // namespace

Task<void> createShare(Exchange &exchange, Context &context)
{
    const Account account = co_await authenticate(exchange, context);
    std::string key = idempotencyKeyOf(exchange.request());
    const std::string body = co_await readWholeBody(exchange, jsonLimit);
    ShareRequest request = parseShareRequest(body);
    if (!request.reshareOf)
        checkFiles(request.files, context.limits);
    checkRecipients(request.recipients, context.limits);
    NewShare share = newShareOf(std::move(request), account, context);
    share.idempotencyKey = std::move(key);
    const CreateResult result =
        co_await context.pool.run([&] { return context.metadata.createShare(share); });
    checkCreated(result);
    const bool known = result.outcome == CreateResult::Outcome::known;
    co_await exchange.respond(
        jsonResponse(known ? Status::ok : Status::created, shareJson(result.share)));
}

Task<void> listShares(Exchange &exchange, Context &context)
{
    const Account account = co_await authenticate(exchange, context);
    const Seconds now = context.now();
    const auto shares =
        co_await context.pool.run([&] { return context.metadata.listShares(account.id, now); });
    co_await exchange.respond(jsonResponse(Status::ok, shareListJson(shares)));
}

Task<void> showShare(Exchange &exchange, Context &context, std::string key)
{
    const Account account = co_await authenticate(exchange, context);
    const Seconds now = context.now();
    const auto share =
        co_await context.pool.run([&] { return context.metadata.findShare(account.id, key, now); });
    if (!share)
        throw Refusal(Error::notFound);
    co_await exchange.respond(jsonResponse(Status::ok, shareJson(*share)));
}

Task<void> finishShare(Exchange &exchange, Context &context, std::string key)
{
    const std::string sender = tokenHashOf(exchange.request());
    const std::string token = randomToken();
    const std::string hash = sha256(token);
    const Seconds now = context.now();
    const Seconds deadline = now + context.limits.shareLifetime;
    const FinishResult result = co_await context.pool.run([&] {
        const Account account = needAccount(context.metadata, sender);
        return context.metadata.finishShare(account.id, key, hash, now, deadline);
    });
    switch (result.outcome) {
    case FinishResult::Outcome::missing:
        throw Refusal(Error::notFound);
    case FinishResult::Outcome::incomplete:
        throw Refusal(Error::conflict, "The share has files that are not uploaded completely.");
    case FinishResult::Outcome::gone:
        throw Refusal(Error::gone);
    case FinishResult::Outcome::finished:
        break;
    }
    context.peers.announcePushes(result.pushed);
    co_await exchange.respond(
        jsonResponse(Status::ok, finishedJson(result, context.publicUrl + "/s/" + token)));
}

Task<void> withdrawShare(Exchange &exchange, Context &context, std::string key)
{
    const Account account = co_await authenticate(exchange, context);
    const Seconds now = context.now();
    const auto blobs = co_await context.pool.run(
        [&] { return context.metadata.withdrawShare(account.id, key, now); });
    if (!blobs)
        throw Refusal(Error::notFound);
    for (const std::string &blob : *blobs)
        context.writes.stop(blob);
    context.peers.wakeSweeper();
    co_await exchange.respond(makeResponse(Status::noContent));
}

} // namespace pelliko::server
