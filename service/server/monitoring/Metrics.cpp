#include "monitoring/Metrics.h"

#include <prometheus/counter.h>
#include <prometheus/gauge.h>
#include <prometheus/histogram.h>
#include <prometheus/registry.h>
#include <prometheus/text_serializer.h>

#include <array>
#include <map>
#include <string_view>

namespace pelliko::server
{
namespace
{

constexpr std::array names{"api", "upload", "push", "page", "download", "other"};

/// Seconds. Uploads, downloads and push streams last as long as their peers want.
const prometheus::Histogram::BucketBoundaries bounds{0.001, 0.005, 0.025, 0.1, 0.5,
                                                     2.5,   10,    60,    600};

std::string statusClass(int status)
{
    return status == 0 ? "gone" : std::to_string(status / 100) + "xx";
}

template <class Builder>
auto &familyIn(prometheus::Registry &registry, Builder builder, const char *name, const char *help)
{
    return builder.Name(name).Help(help).Register(registry);
}

bool startsWith(const std::string &path, std::string_view start)
{
    return path.rfind(start, 0) == 0;
}

} // namespace

Endpoint endpointOf(const std::string &path)
{
    if (startsWith(path, "/api/v1/uploads"))
        return Endpoint::upload;
    if (path == "/api/v1/push")
        return Endpoint::push;
    if (startsWith(path, "/api/v1/received/") && path.find("/files/") != std::string::npos)
        return Endpoint::download;
    if (startsWith(path, "/api/v1/"))
        return Endpoint::api;
    if (startsWith(path, "/s/"))
        return path.find('/', 3) == std::string::npos ? Endpoint::page : Endpoint::download;
    return Endpoint::other;
}

struct Metrics::Families {
    prometheus::Gauge &gauge(const char *name, const char *help)
    {
        return familyIn(registry, prometheus::BuildGauge(), name, help).Add({});
    }
    prometheus::Counter &counter(const char *name, const char *help)
    {
        return familyIn(registry, prometheus::BuildCounter(), name, help).Add({});
    }

    prometheus::Registry registry;
    prometheus::Family<prometheus::Counter> &requests =
        familyIn(registry, prometheus::BuildCounter(), "pelliko_requests_total",
                 "Requests that ended, by what they were about and by the class of their status.");
    prometheus::Family<prometheus::Histogram> &durations =
        familyIn(registry, prometheus::BuildHistogram(), "pelliko_request_seconds",
                 "How long requests took, from their head to the end of their answer.");
    prometheus::Counter &received =
        counter("pelliko_received_bytes_total", "Bytes of bodies that came from clients.");
    prometheus::Counter &sent =
        counter("pelliko_sent_bytes_total", "Bytes of bodies that went to clients.");
    prometheus::Family<prometheus::Counter> &failures =
        familyIn(registry, prometheus::BuildCounter(), "pelliko_storage_failures_total",
                 "Requests refused because a store was full or failed.");
    // Each is there from the start, so that its first failure is a rise.
    std::map<StorageFailure::Kind, prometheus::Counter &> failuresByKind{
        {StorageFailure::Kind::full, failures.Add({{"kind", "full"}})},
        {StorageFailure::Kind::unavailable, failures.Add({{"kind", "unavailable"}})},
        {StorageFailure::Kind::broken, failures.Add({{"kind", "broken"}})}};
    prometheus::Counter &removed =
        counter("pelliko_removed_blobs_total", "Blobs that the sweeper removed.");
    prometheus::Gauge &connections = gauge("pelliko_connections", "Open client connections.");
    prometheus::Gauge &streams = gauge("pelliko_push_streams", "Open push streams.");
    prometheus::Gauge &uploads = gauge("pelliko_uploads", "Blobs that are being written.");
    prometheus::Gauge &storageCalls =
        gauge("pelliko_storage_calls", "Calls to the stores that wait or run.");
    prometheus::Gauge &draining = gauge("pelliko_draining", "1 once the server was asked to end.");
};

Metrics::Metrics() : m_families(std::make_unique<Families>()) {}

Metrics::~Metrics() = default;

void Metrics::requestEnded(Endpoint endpoint, int status, std::chrono::duration<double> took)
{
    const std::string name = names.at(static_cast<std::size_t>(endpoint));
    m_families->requests.Add({{"endpoint", name}, {"status", statusClass(status)}}).Increment();
    m_families->durations.Add({{"endpoint", name}}, bounds).Observe(took.count());
}

void Metrics::transferred(std::uint64_t received, std::uint64_t sent)
{
    m_families->received.Increment(static_cast<double>(received));
    m_families->sent.Increment(static_cast<double>(sent));
}

void Metrics::storageFailed(StorageFailure::Kind kind)
{
    m_families->failuresByKind.at(kind).Increment();
}

void Metrics::blobsRemoved(std::size_t count)
{
    m_families->removed.Increment(static_cast<double>(count));
}

std::string Metrics::text(const Levels &now)
{
    m_families->connections.Set(static_cast<double>(now.connections));
    m_families->streams.Set(static_cast<double>(now.pushStreams));
    m_families->uploads.Set(static_cast<double>(now.uploads));
    m_families->storageCalls.Set(static_cast<double>(now.storageCalls));
    m_families->draining.Set(now.draining ? 1 : 0);
    return prometheus::TextSerializer().Serialize(m_families->registry.Collect());
}

} // namespace pelliko::server
