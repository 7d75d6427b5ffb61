#pragma once

#include "BusObject.h"
#include "ResumeLauncher.h"
#include "Uploads.h"

#include "com.velmora.pelliko.Service1.h"

namespace pelliko::service
{

/** The service on the bus: calls in, status signals out, and who of the clients is still there. */
class ServiceObject
{
public:
    explicit ServiceObject(GDBusConnection *bus);
    ~ServiceObject();
    ServiceObject(const ServiceObject &) = delete;
    ServiceObject &operator=(const ServiceObject &) = delete;

    /**
     * Calls are answered from now on; those that came before were held, or refused when they waited
     * for long. The three outlive this.
     */
    void open(RequestContext &context, Uploads &uploads, ResumeLauncher &resume);

    /** Sends a status signal to one client. */
    void emit(const std::string &listener, int32_t id, const RequestReport &report);

private:
    void on(const char *signal, GCallback handler);
    void connectRequests();
    void connectReports();
    gboolean hold(GDBusMethodInvocation *invocation, BusCall call);
    void refuseHeld();
    void watch(const std::string &client);
    static void onClientVanished(GDBusConnection *, const char *name, gpointer self);

    void requestUpload(GDBusMethodInvocation *call, GVariant *recipients,
                       const std::vector<std::string> &paths, bool wifiOnly);
    void requestReshare(GDBusMethodInvocation *call, GVariant *recipients, int32_t earlier,
                        bool wifiOnly);
    void resume(GDBusMethodInvocation *call, int32_t id);
    void uploadInfo(GDBusMethodInvocation *call, int32_t id);
    void listRequests(GDBusMethodInvocation *call);

    GDBusConnection *bus_;
    PellikoService1 *skeleton_;
    RequestContext *context_ = nullptr;
    Uploads *uploads_ = nullptr;
    ResumeLauncher *resume_ = nullptr;
    HeldCalls held_;
    guint holdTimer_ = 0;
    std::map<std::string, guint> watches_;
};

} // namespace pelliko::service
