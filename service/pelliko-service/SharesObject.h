// The lists of shares and the downloads on the bus
#pragma once

#include "BusObject.h"
#include "Downloads.h"
#include "ReceivedShares.h"
#include "Uploads.h"

#include "com.velmora.pelliko.Shares1.h"

namespace pelliko::service
{

/** The lists of shares on the bus, beside the uploads. */
class SharesObject
{
public:
    /** What the calls need, once the queue is loaded. */
    struct Parts {
        RequestContext &context;
        Uploads &uploads;
        ReceivedShares &received;
        Downloads &downloads;
    };

    explicit SharesObject(GDBusConnection *bus);
    ~SharesObject();
    SharesObject(const SharesObject &) = delete;
    SharesObject &operator=(const SharesObject &) = delete;

    /** Calls are answered from now on; those that came before were held. The parts outlive this, or
     * the call to close(). */
    void open(const Parts &parts);
    void close();

    /** A list is different. Many changes at once are told once. */
    void changed();
    /** Tells the one who downloads how far it is. */
    void emitProgress(const DownloadKey &key, const DownloadProgress &progress);

private:
    void on(const char *signal, GCallback handler);
    void connectLists();
    void connectChanges();
    void connectDownloads();
    gboolean hold(GDBusMethodInvocation *invocation, BusCall call);
    void getReceived(GDBusMethodInvocation *call, const std::string &token, bool fresh);
    void download(GDBusMethodInvocation *call, guint number, const DownloadWish &wish);
    void watch(const std::string &caller);
    void unwatchIdle(const std::string &caller);

    GDBusConnection *bus_;
    PellikoShares1 *skeleton_;
    std::optional<Parts> parts_;
    HeldCalls held_;
    std::map<std::string, guint> watches_;
    guint changedTimer_ = 0;
};

} // namespace pelliko::service
