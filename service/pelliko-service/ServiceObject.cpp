#include "ServiceObject.h"

#include "RequestList.h"

#include <algorithm>
#include <utility>

namespace pelliko::service
{
namespace
{
using Invocation = GDBusMethodInvocation;

constexpr const char *interfaceName = "com.velmora.pelliko.Service1";
// A usual start is over long before; a caller on its main loop is not held longer.
constexpr guint longestHoldMs = 2'000;

std::vector<Recipient> recipientsOf(GVariant *variant)
{
    std::vector<Recipient> recipients;
    GVariantIter iter;
    g_variant_iter_init(&iter, variant);
    const char *ccc = nullptr;
    const char *number = nullptr;
    gint id = 0;
    while (g_variant_iter_next(&iter, "(&s&si)", &ccc, &number, &id)) {
        recipients.push_back({ccc, number, id});
    }
    return recipients;
}

std::string callerOf(GDBusMethodInvocation *call)
{
    return g_dbus_method_invocation_get_sender(call);
}

std::vector<std::string> textsOf(const char *const *texts)
{
    std::vector<std::string> result;
    for (; *texts; ++texts) {
        result.emplace_back(*texts);
    }
    return result;
}
} // namespace

ServiceObject::ServiceObject(GDBusConnection *bus)
    : bus_(bus), skeleton_(pelliko_service1_skeleton_new())
{
    connectRequests();
    connectReports();
    exportOnBus(G_DBUS_INTERFACE_SKELETON(skeleton_), bus, "the service");
}

ServiceObject::~ServiceObject()
{
    refuseHeld();
    for (const auto &[client, watch] : watches_) {
        g_bus_unwatch_name(watch);
    }
    g_dbus_interface_skeleton_unexport(G_DBUS_INTERFACE_SKELETON(skeleton_));
    g_signal_handlers_disconnect_by_data(skeleton_, this);
    g_object_unref(skeleton_);
}

void ServiceObject::on(const char *signal, GCallback handler)
{
    g_signal_connect(skeleton_, signal, handler, this);
}

void ServiceObject::connectRequests()
{
    on("handle-request-upload",
       G_CALLBACK(+[](PellikoService1 *, Invocation *call, GVariant *, GVariant *recipients,
                      const char *const *paths, gboolean wifiOnly, ServiceObject *self) {
           return self->hold(call, [=, list = textsOf(paths)] {
               self->requestUpload(call, recipients, list, wifiOnly != FALSE);
           });
       }));
    on("handle-request-reshare",
       G_CALLBACK(+[](PellikoService1 *, Invocation *call, GVariant *, GVariant *recipients,
                      gint earlier, gboolean wifiOnly, ServiceObject *self) {
           return self->hold(
               call, [=] { self->requestReshare(call, recipients, earlier, wifiOnly != FALSE); });
       }));
    on("handle-cancel",
       G_CALLBACK(+[](PellikoService1 *, Invocation *call, gint id, ServiceObject *self) {
           return self->hold(call, [=] {
               pelliko_service1_complete_cancel(self->skeleton_, call, self->uploads_->cancel(id));
           });
       }));
}

void ServiceObject::connectReports()
{
    on("handle-resume",
       G_CALLBACK(+[](PellikoService1 *, Invocation *call, gint id, ServiceObject *self) {
           return self->hold(call, [=] { self->resume(call, id); });
       }));
    on("handle-confirm-end",
       G_CALLBACK(+[](PellikoService1 *, Invocation *call, gint id, ServiceObject *self) {
           return self->hold(call, [=] {
               self->uploads_->confirmEnd(callerOf(call), id);
               pelliko_service1_complete_confirm_end(self->skeleton_, call);
           });
       }));
    on("handle-get-upload-info",
       G_CALLBACK(+[](PellikoService1 *, Invocation *call, gint id, ServiceObject *self) {
           return self->hold(call, [=] { self->uploadInfo(call, id); });
       }));
    on("handle-list-requests",
       G_CALLBACK(+[](PellikoService1 *, Invocation *call, ServiceObject *self) {
           return self->hold(call, [=] { self->listRequests(call); });
       }));
}

// The parameters of a call live as long as its invocation, which is answered by the call.
gboolean ServiceObject::hold(GDBusMethodInvocation *invocation, BusCall call)
{
    if (!uploads_) {
        held_.add(invocation, std::move(call));
        if (holdTimer_ == 0) {
            holdTimer_ = g_timeout_add(
                longestHoldMs,
                [](gpointer self) -> gboolean {
                    static_cast<ServiceObject *>(self)->holdTimer_ = 0;
                    static_cast<ServiceObject *>(self)->refuseHeld();
                    return G_SOURCE_REMOVE;
                },
                this);
        }
        return TRUE;
    }
    answerCall(invocation, call);
    return TRUE;
}

void ServiceObject::refuseHeld()
{
    if (holdTimer_ != 0) {
        g_source_remove(std::exchange(holdTimer_, 0));
    }
    held_.refuse("the queue is still being loaded");
}

void ServiceObject::open(RequestContext &context, Uploads &uploads, ResumeLauncher &resume)
{
    context_ = &context;
    uploads_ = &uploads;
    resume_ = &resume;
    held_.answer();
    refuseHeld(); // stops the timer
}

void ServiceObject::emit(const std::string &listener, int32_t id, const RequestReport &report)
{
    g_autoptr(GError) error = nullptr;
    GVariant *values =
        g_variant_new("(ii^ayixi)", id, static_cast<gint>(report.status), report.input.c_str(),
                      report.percent, static_cast<gint64>(report.expires), report.error);
    if (!g_dbus_connection_emit_signal(bus_, listener.c_str(), busObjectPath, interfaceName,
                                       "UploadStatus", values, &error)) {
        g_warning("request %d: a report was not sent: %s", id, error->message);
    }
}

void ServiceObject::watch(const std::string &client)
{
    if (watches_.count(client) == 0) {
        watches_[client] =
            g_bus_watch_name_on_connection(bus_, client.c_str(), G_BUS_NAME_WATCHER_FLAGS_NONE,
                                           nullptr, onClientVanished, this, nullptr);
    }
}

void ServiceObject::onClientVanished(GDBusConnection *, const char *name, gpointer self)
{
    auto &service = *static_cast<ServiceObject *>(self);
    const std::string client = name;
    const auto found = service.watches_.find(client);
    if (found != service.watches_.end()) {
        g_bus_unwatch_name(found->second);
        service.watches_.erase(found);
    }
    service.uploads_->listenerGone(client);
}

void ServiceObject::requestUpload(GDBusMethodInvocation *call, GVariant *recipients,
                                  const std::vector<std::string> &paths, bool wifiOnly)
{
    const std::string caller = callerOf(call);
    int32_t id = 0;
    const int error =
        uploads_->requestUpload(caller, paths, recipientsOf(recipients), wifiOnly, id);
    pelliko_service1_complete_request_upload(skeleton_, call, error, id);
    watch(caller);
}

void ServiceObject::requestReshare(GDBusMethodInvocation *call, GVariant *recipients,
                                   int32_t earlier, bool wifiOnly)
{
    const std::string caller = callerOf(call);
    int32_t id = 0;
    const int error =
        uploads_->requestReshare(caller, earlier, recipientsOf(recipients), wifiOnly, id);
    pelliko_service1_complete_request_reshare(skeleton_, call, error, id);
    watch(caller);
}

void ServiceObject::resume(GDBusMethodInvocation *call, int32_t id)
{
    const std::string caller = callerOf(call);
    const int error = uploads_->resume(caller, id);
    if (error == 0) {
        resume_->claimed(id);
    }
    pelliko_service1_complete_resume(skeleton_, call, error);
    watch(caller);
}

void ServiceObject::uploadInfo(GDBusMethodInvocation *call, int32_t id)
{
    const auto record = context_->queue.find(id);
    std::vector<const char *> files;
    int64_t total = 0;
    if (record) {
        for (const QueuedFile &file : record->files) {
            files.push_back(file.path.c_str());
            total += std::max<int64_t>(file.stamp.size, 0);
        }
    }
    files.push_back(nullptr);
    pelliko_service1_complete_get_upload_info(skeleton_, call, record ? 0 : errorRefused,
                                              files.data(), total);
}

void ServiceObject::listRequests(GDBusMethodInvocation *call)
{
    pelliko_service1_complete_list_requests(skeleton_, call,
                                            requestList(context_->queue, *uploads_));
}

} // namespace pelliko::service
