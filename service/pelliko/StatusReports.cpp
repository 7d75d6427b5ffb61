#include "StatusReports.h"

#include "ServiceProxy.h"

#include <algorithm>
#include <map>

namespace pelliko::client
{
namespace
{
constexpr unsigned firstDelayMs = 1000;
constexpr unsigned longestDelayMs = 60000;

struct Receiver {
    pelliko_upload_status_cb callback;
    void *userData;
    bool lost; // the service that knew of us is gone
};

std::map<int32_t, Receiver> &receivers()
{
    static std::map<int32_t, Receiver> table;
    return table;
}

unsigned &delayMs()
{
    static unsigned delay = firstDelayMs;
    return delay;
}

bool isEnd(const Report &report)
{
    return report.error != 0 || report.status == PELLIKO_UPLOAD_STATUS_CANCELLED ||
           report.status == PELLIKO_UPLOAD_STATUS_SHARE_FINISHED;
}

void confirmEnd(int32_t id)
{
    PellikoService1 *proxy = serviceProxy();
    if (!proxy) {
        return;
    }
    pelliko_service1_call_confirm_end(proxy, id, nullptr, nullptr, nullptr);
    // The program may end right after its last report; the confirmation must not end with it.
    g_dbus_connection_flush_sync(g_dbus_proxy_get_connection(G_DBUS_PROXY(proxy)), nullptr,
                                 nullptr);
}

void askAgainLater();

gboolean onAskAgain(gpointer)
{
    serviceVanished();
    return G_SOURCE_REMOVE;
}

void askAgainLater()
{
    static guint timer = 0;
    if (timer != 0 && g_main_context_find_source_by_id(nullptr, timer)) {
        return;
    }
    timer = g_timeout_add(delayMs(), onAskAgain, nullptr);
    delayMs() = std::min(delayMs() * 2, longestDelayMs);
}

void onResumed(GObject *source, GAsyncResult *result, gpointer data)
{
    const int32_t id = GPOINTER_TO_INT(data);
    gint code = 0;
    g_autoptr(GError) error = nullptr;
    if (!pelliko_service1_call_resume_finish(PELLIKO_SERVICE1(source), &code, result, &error)) {
        askAgainLater();
        return;
    }
    delayMs() = firstDelayMs;
    auto found = receivers().find(id);
    if (found == receivers().end()) {
        return;
    }
    found->second.lost = false;
    if (code != 0) {
        deliverReport({id, PELLIKO_UPLOAD_STATUS_FAILED, nullptr, 0, 0, code});
    }
}

void askForReports(PellikoService1 *proxy)
{
    for (const auto &[id, receiver] : receivers()) {
        if (receiver.lost) {
            pelliko_service1_call_resume(proxy, id, nullptr, onResumed, GINT_TO_POINTER(id));
        }
    }
}
} // namespace

void subscribe(int32_t id, pelliko_upload_status_cb callback, void *userData)
{
    receivers()[id] = {callback, userData, false};
}

void deliverReport(const Report &report)
{
    auto found = receivers().find(report.id);
    if (found == receivers().end()) {
        return;
    }
    const Receiver receiver = found->second;
    if (isEnd(report)) {
        receivers().erase(found);
    }
    const char *input = report.input && *report.input ? report.input : nullptr;
    receiver.callback(report.status, input, report.percent, report.expired, 0, report.error,
                      report.id, receiver.userData);
    if (isEnd(report)) {
        confirmEnd(report.id);
    }
}

void serviceVanished()
{
    if (receivers().empty()) {
        return;
    }
    for (auto &[id, receiver] : receivers()) {
        receiver.lost = true;
    }
    if (PellikoService1 *proxy = serviceProxy()) {
        askForReports(proxy);
    }
}

} // namespace pelliko::client
