#pragma once

#include "Request.h"
#include "Withdrawals.h"

#include <map>
#include <set>

namespace pelliko::service
{

/** All requests of the service, and who listens to which. A listener is a client's unique bus name.
 */
class Uploads
{
public:
    using Emit =
        std::function<void(const std::string &listener, int32_t id, const RequestReport &)>;

    /**
     * @param emit     hands a report to its listener
     * @param orphaned called when a request may have lost, or never had, a listener
     * @param changed  called when a list of requests would be different
     */
    Uploads(RequestContext &context, Emit emit, std::function<void()> orphaned,
            std::function<void()> changed);

    /** Goes on with everything that the queue holds. */
    void load();

    /** Accepts a new share. @param id receives the request's id @return 0 or an error code */
    int requestUpload(const std::string &listener, const std::vector<std::string> &paths,
                      std::vector<Recipient> recipients, bool wifiOnly, int32_t &id);
    int requestReshare(const std::string &listener, int32_t earlierId,
                       std::vector<Recipient> recipients, bool wifiOnly, int32_t &id);
    int cancel(int32_t id);
    int resume(const std::string &listener, int32_t id);
    void confirmEnd(const std::string &listener, int32_t id);

    /** Takes a share back, whether it is complete or not. @return 0 or an error code */
    int withdraw(int32_t id);
    /** Takes an ended request off the lists. @return 0 or an error code */
    int forget(int32_t id);

    /** A client has gone: it listens no more. */
    void listenerGone(const std::string &listener);
    void networkChanged();

    /** Requests with something to report and nobody to report it to. */
    std::vector<int32_t> orphans() const;
    bool isOrphan(int32_t id) const;
    /** The application does not know the request any more: what is unfinished is cancelled, no end
     * is reported. */
    void abandon(int32_t id);

    /** The request's own present state, null when it has ended. */
    const Request *running(int32_t id) const;

private:
    int accept(const std::string &listener, const NewRequest &request, int32_t &id);
    void run(QueuedRequest record, bool fromEarlierRun);
    void onReport(int32_t id, const RequestReport &report);
    void onEnd(int32_t id);
    void setDelivered(int32_t id);
    void tellPresent(int32_t id);

    RequestContext &context_;
    Emit emit_;
    std::function<void()> orphaned_;
    std::function<void()> changed_;
    Withdrawals withdrawals_;
    std::map<int32_t, std::unique_ptr<Request>> requests_;
    std::map<int32_t, RequestReport> undelivered_; ///< ends that no client has confirmed
    std::map<int32_t, std::string> listeners_;
    std::set<int32_t> abandoned_;
};

} // namespace pelliko::service
