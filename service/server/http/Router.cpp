#include "http/Router.h"

#include "accounts/Accounts.h"
#include "accounts/Invitations.h"
#include "accounts/Joined.h"
#include "http/Errors.h"
#include "monitoring/Monitoring.h"
#include "pages/Download.h"
#include "pages/ErrorPage.h"
#include "pages/HomePage.h"
#include "pages/LandingPage.h"
#include "push/EventStream.h"
#include "push/ReceivedEndpoints.h"
#include "shares/ShareEndpoints.h"
#include "store/StorageFailure.h"
#include "tus/TusEndpoints.h"
#include "tus/TusHeaders.h"

#include <chrono>
#include <cstdio>
#include <optional>
#include <string_view>
#include <utility>
#include <vector>

namespace pelliko::server
{
namespace
{

using Parts = std::vector<std::string>;

/// A database that is restarted is there again by then.
constexpr const char *secondsUntilRetry = "5";

Parts splitPath(std::string_view path)
{
    Parts parts;
    while (!path.empty()) {
        path.remove_prefix(1);
        const auto slash = path.find('/');
        parts.emplace_back(path.substr(0, slash));
        path = slash == std::string_view::npos ? std::string_view() : path.substr(slash);
    }
    return parts;
}

[[noreturn]] void refuseMethod(const char *allowed)
{
    throw Refusal(Error::methodNotAllowed, {}, {{"Allow", allowed}});
}

void requireGet(const Request &request)
{
    if (request.method != "GET" && request.method != "HEAD")
        refuseMethod("GET, HEAD");
}

Task<void> routeShares(Exchange &exchange, Context &context, Parts parts)
{
    const std::string &method = exchange.request().method;
    const bool isGet = method == "GET" || method == "HEAD";
    if (parts.empty()) {
        if (!isGet && method != "POST")
            refuseMethod("GET, HEAD, POST");
        if (isGet)
            co_await listShares(exchange, context);
        else
            co_await createShare(exchange, context);
    } else if (parts.size() == 1) {
        if (!isGet && method != "DELETE")
            refuseMethod("GET, HEAD, DELETE");
        if (isGet)
            co_await showShare(exchange, context, parts[0]);
        else
            co_await withdrawShare(exchange, context, parts[0]);
    } else if (parts.size() == 2 && parts[1] == "finish") {
        if (method != "POST")
            refuseMethod("POST");
        co_await finishShare(exchange, context, parts[0]);
    } else {
        throw Refusal(Error::notFound);
    }
}

Task<void> routePush(Exchange &exchange, Context &context, Parts parts)
{
    if (parts.empty()) {
        requireGet(exchange.request());
        co_await streamPushes(exchange, context);
    } else if (parts.size() == 1 && parts[0] == "ack") {
        if (exchange.request().method != "POST")
            refuseMethod("POST");
        co_await acknowledgePushes(exchange, context);
    } else {
        throw Refusal(Error::notFound);
    }
}

Task<void> routeReceived(Exchange &exchange, Context &context, Parts parts)
{
    const std::string &method = exchange.request().method;
    if (parts.empty()) {
        requireGet(exchange.request());
        co_await listReceived(exchange, context);
    } else if (parts.size() == 1 && method == "DELETE") {
        co_await forgetReceived(exchange, context, parts[0]);
    } else if (parts.size() == 1) {
        if (method != "GET" && method != "HEAD")
            refuseMethod("GET, HEAD, DELETE");
        co_await showReceived(exchange, context, parts[0]);
    } else if (parts.size() == 3 && parts[1] == "files") {
        requireGet(exchange.request());
        co_await downloadReceived(exchange, context, parts[0], parts[2]);
    } else {
        throw Refusal(Error::notFound);
    }
}

Task<void> routeLinks(Exchange &exchange, Context &context, Parts parts)
{
    requireGet(exchange.request());
    if (parts.size() == 1) {
        co_await showLandingPage(exchange, context, parts[0]);
    } else if (parts.size() == 2 && parts[1] == "all.zip") {
        co_await downloadAll(exchange, context, parts[0]);
    } else if (const auto index = parts.size() == 2 ? parseNumber(parts[1]) : std::nullopt) {
        co_await downloadFile(exchange, context, parts[0], static_cast<std::size_t>(*index));
    } else {
        throw Refusal(Error::notFound);
    }
}

Task<void> routeApi(Exchange &exchange, Context &context, Parts parts)
{
    const std::string room = parts.empty() ? std::string() : parts[0];
    if (!parts.empty())
        parts.erase(parts.begin());
    if (room == "shares") {
        co_await routeShares(exchange, context, std::move(parts));
    } else if (room == "uploads" && parts.empty()) {
        co_await tusCollection(exchange, context);
    } else if (room == "uploads" && parts.size() == 1) {
        co_await tusUpload(exchange, context, parts[0]);
    } else if (room == "accounts" && parts.empty()) {
        if (exchange.request().method != "POST")
            refuseMethod("POST");
        co_await registerAccount(exchange, context);
    } else if (room == "account" && parts.empty()) {
        requireGet(exchange.request());
        co_await showAccount(exchange, context);
    } else if (room == "push") {
        co_await routePush(exchange, context, std::move(parts));
    } else if (room == "received") {
        co_await routeReceived(exchange, context, std::move(parts));
    } else if (room == "joined" && parts.empty()) {
        if (exchange.request().method != "POST")
            refuseMethod("POST");
        co_await showJoined(exchange, context);
    } else {
        throw Refusal(Error::notFound);
    }
}

Task<void> showHome(Exchange &exchange)
{
    requireGet(exchange.request());
    Response page = homePage(languageOf(exchange.request()));
    co_await exchange.respond(std::move(page));
}

/// Where people come to, who are answered with pages.
bool isForPeople(const Request &request)
{
    return request.path == "/" || request.path.rfind("/s/", 0) == 0;
}

Task<void> route(Exchange &exchange, Context &context)
{
    Parts parts = splitPath(exchange.request().path);
    if (parts.size() >= 2 && parts[0] == "api" && parts[1] == "v1")
        co_await routeApi(exchange, context, Parts(parts.begin() + 2, parts.end()));
    else if (parts.size() >= 2 && parts[0] == "s")
        co_await routeLinks(exchange, context, Parts(parts.begin() + 1, parts.end()));
    else if (parts.size() == 1 && parts[0] == "healthz")
        co_await showHealth(exchange, context);
    else if (parts.size() == 1 && parts[0] == "readyz")
        co_await showReadiness(exchange, context);
    else if (exchange.request().path == "/")
        co_await showHome(exchange);
    else
        throw Refusal(Error::notFound);
}

Refusal refusalOf(StorageFailure::Kind kind)
{
    switch (kind) {
    case StorageFailure::Kind::full:
        return Refusal(Error::noSpace);
    case StorageFailure::Kind::unavailable:
        return Refusal(Error::unavailable, {}, {{"Retry-After", secondsUntilRetry}});
    case StorageFailure::Kind::broken:
    case StorageFailure::Kind::lost:
        break;
    }
    return Refusal(Error::internal);
}

Refusal refusalOf(const std::exception_ptr &failure, Metrics &metrics)
{
    try {
        std::rethrow_exception(failure);
    } catch (const Refusal &refusal) {
        return refusal;
    } catch (const Disconnected &) {
        throw;
    } catch (const StorageFailure &error) {
        std::fprintf(stderr, "pelliko-server: %s\n", error.what());
        metrics.storageFailed(error.kind());
        return refusalOf(error.kind());
    } catch (const std::exception &error) {
        std::fprintf(stderr, "pelliko-server: %s\n", error.what());
        return Refusal(Error::internal);
    }
}

Task<void> answer(Exchange &exchange, Context &context)
{
    std::exception_ptr failure;
    try {
        co_await route(exchange, context);
    } catch (...) {
        failure = std::current_exception();
    }
    if (!failure)
        co_return;
    const Refusal refusal = refusalOf(failure, context.metrics);
    // Half of a body went out: only a cut tells the receiver that it is not whole.
    if (exchange.answered())
        throw Disconnected();
    Response response = isForPeople(exchange.request())
                            ? errorPage(refusal, languageOf(exchange.request()))
                            : errorResponse(refusal);
    if (exchange.request().path.rfind("/api/v1/uploads", 0) == 0)
        response.headers.push_back({"Tus-Resumable", tusVersion});
    co_await exchange.respond(std::move(response));
}

/// Counts a request however it ends.
class Counted
{
public:
    Counted(const Exchange &exchange, Metrics &metrics)
        : m_exchange(exchange), m_metrics(metrics), m_endpoint(endpointOf(exchange.request().path))
    {
    }
    ~Counted()
    {
        const Traffic traffic = m_exchange.traffic();
        m_metrics.requestEnded(m_endpoint, traffic.status,
                               std::chrono::steady_clock::now() - m_start);
        m_metrics.transferred(traffic.received, traffic.sent);
    }
    Counted(const Counted &) = delete;
    Counted &operator=(const Counted &) = delete;

private:
    const Exchange &m_exchange;
    Metrics &m_metrics;
    Endpoint m_endpoint;
    std::chrono::steady_clock::time_point m_start = std::chrono::steady_clock::now();
};

} // namespace

Task<void> handleRequest(Exchange &exchange, Context &context)
{
    const Counted counted(exchange, context.metrics);
    co_await answer(exchange, context);
}

Response refuseHead(bool tooLarge)
{
    return errorResponse(Refusal(tooLarge ? Error::headerTooLarge : Error::badRequest));
}

} // namespace pelliko::server
