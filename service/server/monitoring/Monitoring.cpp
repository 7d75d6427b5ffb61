#include "monitoring/Monitoring.h"

#include "http/Errors.h"
#include "store/StorageFailure.h"

#include <cstdio>
#include <utility>

namespace pelliko::server
{
namespace
{

void requireGet(const Request &request)
{
    if (request.method != "GET" && request.method != "HEAD")
        throw Refusal(Error::methodNotAllowed, {}, {{"Allow", "GET, HEAD"}});
}

Response plainText(std::string text, const char *type = "text/plain")
{
    return makeResponse(Status::ok, {{"Content-Type", type}, {"Cache-Control", "no-store"}},
                        std::move(text));
}

Response notReady(const char *reason)
{
    Response response = plainText(reason);
    response.status = 503;
    response.headers.push_back({"Retry-After", "1"});
    return response;
}

/// Whether a store answers; a failure is logged, since the answer does not say why.
template <class Store> bool answers(Store &store)
{
    try {
        store.ping();
        return true;
    } catch (const StorageFailure &failure) {
        std::fprintf(stderr, "pelliko-server: not ready: %s\n", failure.what());
        return false;
    }
}

Task<bool> storesAnswer(Context &context)
{
    const bool known = co_await context.pool.run([&] { return answers(context.metadata); });
    // One that could be reached just now is not asked: it counts requests, and its threads may be
    // busy with what is only slow.
    if (!known || context.blobs.wasReached())
        co_return known;
    const bool stored = co_await context.blobPool.run([&] { return answers(context.blobs); });
    co_return stored;
}

Task<void> showMetrics(Exchange &exchange, Context &context)
{
    requireGet(exchange.request());
    Response response = plainText(context.metrics.text(context.levels()),
                                  "text/plain; version=0.0.4; charset=utf-8");
    co_await exchange.respond(std::move(response));
}

Task<void> refuse(Exchange &exchange, const Refusal &refusal)
{
    Response response = errorResponse(refusal);
    co_await exchange.respond(std::move(response));
}

Task<void> route(Exchange &exchange, Context &context)
{
    const std::string &path = exchange.request().path;
    if (path == "/metrics")
        co_await showMetrics(exchange, context);
    else if (path == "/readyz")
        co_await showReadiness(exchange, context);
    else if (path == "/healthz")
        co_await showHealth(exchange, context);
    else
        throw Refusal(Error::notFound);
}

} // namespace

Task<void> showHealth(Exchange &exchange, Context &context)
{
    requireGet(exchange.request());
    co_await context.pool.run([&] { context.metadata.ping(); });
    Response response = plainText("ok\n");
    co_await exchange.respond(std::move(response));
}

Task<void> showReadiness(Exchange &exchange, Context &context)
{
    requireGet(exchange.request());
    if (context.levels().draining) {
        Response response = notReady("draining\n");
        co_await exchange.respond(std::move(response));
        co_return;
    }
    const bool ready = co_await storesAnswer(context);
    Response response = ready ? plainText("ok\n") : notReady("the store does not answer\n");
    co_await exchange.respond(std::move(response));
}

Task<void> handleMonitoring(Exchange &exchange, Context &context)
{
    std::optional<Refusal> refusal;
    try {
        co_await route(exchange, context);
    } catch (const Refusal &thrown) {
        refusal = thrown;
    } catch (const StorageFailure &failure) {
        std::fprintf(stderr, "pelliko-server: %s\n", failure.what());
        refusal = Refusal(Error::internal);
    }
    if (refusal)
        co_await refuse(exchange, *refusal);
}

} // namespace pelliko::server
