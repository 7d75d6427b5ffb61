#include "SharesObject.h"

#include "ShareList.h"
#include "pelliko_shares.h"

#include <utility>

namespace pelliko::service
{
namespace
{
using Invocation = GDBusMethodInvocation;

constexpr const char *interfaceName = "com.velmora.pelliko.Shares1";
// Changes come in showers, and whoever hears of one asks for the whole list.
constexpr guint changedDelayMs = 100;

std::vector<const char *> pointersTo(const std::vector<std::string> &texts)
{
    std::vector<const char *> result;
    result.reserve(texts.size() + 1);
    for (const std::string &text : texts) {
        result.push_back(text.c_str());
    }
    result.push_back(nullptr);
    return result;
}
} // namespace

SharesObject::SharesObject(GDBusConnection *bus)
    : bus_(bus), skeleton_(pelliko_shares1_skeleton_new())
{
    connectLists();
    connectChanges();
    connectDownloads();
    exportOnBus(G_DBUS_INTERFACE_SKELETON(skeleton_), bus, "the shares");
}

SharesObject::~SharesObject()
{
    close();
    g_dbus_interface_skeleton_unexport(G_DBUS_INTERFACE_SKELETON(skeleton_));
    g_signal_handlers_disconnect_by_data(skeleton_, this);
    g_object_unref(skeleton_);
}

void SharesObject::open(const Parts &parts)
{
    parts_.emplace(parts);
    held_.answer();
}

void SharesObject::close()
{
    held_.refuse("the service ends");
    for (const auto &[caller, watch] : std::exchange(watches_, {})) {
        g_bus_unwatch_name(watch);
    }
    if (changedTimer_ != 0) {
        g_source_remove(std::exchange(changedTimer_, 0));
    }
    parts_.reset();
}

void SharesObject::on(const char *signal, GCallback handler)
{
    g_signal_connect(skeleton_, signal, handler, this);
}

void SharesObject::connectLists()
{
    on("handle-list-sent", G_CALLBACK(+[](PellikoShares1 *, Invocation *call, SharesObject *self) {
           return self->hold(call, [=] {
               const Parts &parts = *self->parts_;
               pelliko_shares1_complete_list_sent(self->skeleton_, call,
                                                  sentList(parts.context.queue, parts.uploads,
                                                           parts.context.timers.epochSeconds()));
           });
       }));
    on("handle-list-received",
       G_CALLBACK(+[](PellikoShares1 *, Invocation *call, SharesObject *self) {
           return self->hold(call, [=] {
               pelliko_shares1_complete_list_received(self->skeleton_, call,
                                                      receivedList(self->parts_->received.all()));
           });
       }));
    on("handle-get-received", G_CALLBACK(+[](PellikoShares1 *, Invocation *call, const char *token,
                                             gboolean fresh, SharesObject *self) {
           return self->hold(call, [=, token = std::string(token)] {
               self->getReceived(call, token, fresh != FALSE);
           });
       }));
}

void SharesObject::connectChanges()
{
    on("handle-withdraw",
       G_CALLBACK(+[](PellikoShares1 *, Invocation *call, gint id, SharesObject *self) {
           return self->hold(call, [=] {
               pelliko_shares1_complete_withdraw(self->skeleton_, call,
                                                 self->parts_->uploads.withdraw(id));
           });
       }));
    on("handle-forget-sent",
       G_CALLBACK(+[](PellikoShares1 *, Invocation *call, gint id, SharesObject *self) {
           return self->hold(call, [=] {
               pelliko_shares1_complete_forget_sent(self->skeleton_, call,
                                                    self->parts_->uploads.forget(id));
           });
       }));
    on("handle-forget-received",
       G_CALLBACK(+[](PellikoShares1 *, Invocation *call, const char *token, SharesObject *self) {
           return self->hold(call, [=, token = std::string(token)] {
               pelliko_shares1_complete_forget_received(self->skeleton_, call,
                                                        self->parts_->received.forget(token));
           });
       }));
}

void SharesObject::connectDownloads()
{
    on("handle-download",
       G_CALLBACK(+[](PellikoShares1 *, Invocation *call, guint number, const char *token,
                      gint file, const char *directory, SharesObject *self) {
           return self->hold(call,
                             [=, token = std::string(token), folder = std::string(directory)] {
                                 self->download(call, number, {token, file, folder});
                             });
       }));
    on("handle-cancel-download",
       G_CALLBACK(+[](PellikoShares1 *, Invocation *call, guint number, SharesObject *self) {
           return self->hold(call, [=] {
               self->parts_->downloads.cancel({g_dbus_method_invocation_get_sender(call), number});
               pelliko_shares1_complete_cancel_download(self->skeleton_, call);
           });
       }));
}

// A call outlives the emission that brought it, and with it the texts among its parameters: it owns
// copies of those.
gboolean SharesObject::hold(GDBusMethodInvocation *invocation, BusCall call)
{
    if (!parts_) {
        held_.add(invocation, std::move(call));
        return TRUE;
    }
    answerCall(invocation, call);
    return TRUE;
}

void SharesObject::getReceived(GDBusMethodInvocation *call, const std::string &token, bool fresh)
{
    parts_->received.get(
        token, fresh, [this, call](int error, const std::optional<ReceivedShare> &share) {
            pelliko_shares1_complete_get_received(skeleton_, call, error, receivedEntry(share));
        });
}

void SharesObject::download(GDBusMethodInvocation *call, guint number, const DownloadWish &wish)
{
    const std::string caller = g_dbus_method_invocation_get_sender(call);
    watch(caller);
    parts_->downloads.start({caller, number}, wish,
                            [this, call, caller](int error, const std::vector<std::string> &paths) {
                                pelliko_shares1_complete_download(skeleton_, call, error,
                                                                  pointersTo(paths).data());
                                unwatchIdle(caller);
                            });
}

void SharesObject::watch(const std::string &caller)
{
    if (watches_.count(caller) == 0) {
        watches_[caller] = g_bus_watch_name_on_connection(
            bus_, caller.c_str(), G_BUS_NAME_WATCHER_FLAGS_NONE, nullptr,
            [](GDBusConnection *, const char *name, gpointer self) {
                const std::string gone = name;
                auto &object = *static_cast<SharesObject *>(self);
                if (object.parts_) {
                    object.parts_->downloads.callerGone(gone);
                }
            },
            this, nullptr);
    }
}

void SharesObject::unwatchIdle(const std::string &caller)
{
    const auto found = watches_.find(caller);
    if (found != watches_.end() && !parts_->downloads.has(caller)) {
        g_bus_unwatch_name(found->second);
        watches_.erase(found);
    }
}

void SharesObject::changed()
{
    if (changedTimer_ == 0 && parts_) {
        changedTimer_ = g_timeout_add(
            changedDelayMs,
            [](gpointer self) -> gboolean {
                auto &object = *static_cast<SharesObject *>(self);
                object.changedTimer_ = 0;
                pelliko_shares1_emit_changed(object.skeleton_);
                return G_SOURCE_REMOVE;
            },
            this);
    }
}

void SharesObject::emitProgress(const DownloadKey &key, const DownloadProgress &progress)
{
    GVariant *values =
        g_variant_new("(uixx)", key.number, progress.file, static_cast<gint64>(progress.done),
                      static_cast<gint64>(progress.total));
    // A caller that has gone is noticed by its watch.
    g_dbus_connection_emit_signal(bus_, key.caller.c_str(), busObjectPath, interfaceName,
                                  "DownloadProgress", values, nullptr);
}

} // namespace pelliko::service
