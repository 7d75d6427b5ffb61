#include "Uploads.h"

#include <glib.h>

#include <utility>

namespace pelliko::service
{
namespace
{
constexpr int invalidParameter = -22;
constexpr int errorUnknown = -2;
constexpr int64_t historySeconds = 30LL * 24 * 3600;

RequestReport endOf(const QueuedRequest &record)
{
    return {static_cast<Status>(record.endStatus), {}, 0, record.expires, record.error};
}
} // namespace

Uploads::Uploads(RequestContext &context, Emit emit, std::function<void()> orphaned,
                 std::function<void()> changed)
    : context_(context), emit_(std::move(emit)), orphaned_(std::move(orphaned)),
      changed_(std::move(changed)), withdrawals_(context, changed_)
{
}

void Uploads::load()
{
    context_.queue.forgetBefore(context_.timers.epochSeconds() - historySeconds);
    for (const int32_t id : context_.queue.openIds()) {
        auto record = context_.queue.find(id);
        if (record->delivered) {
            abandoned_.insert(id);
        }
        if (record->state == RequestState::ended) {
            undelivered_[id] = endOf(*record);
        } else {
            run(std::move(*record), true);
        }
    }
    withdrawals_.kick();
}

void Uploads::run(QueuedRequest record, bool fromEarlierRun)
{
    const int32_t id = record.id;
    requests_[id] = std::make_unique<Request>(
        context_, std::move(record), fromEarlierRun,
        [this, id](const RequestReport &report) { onReport(id, report); });
    // From the loop, so that the id is answered before the first report.
    context_.timers.after(0, [this, id] {
        const auto found = requests_.find(id);
        if (found != requests_.end()) {
            found->second->start();
        }
    });
}

int Uploads::accept(const std::string &listener, const NewRequest &request, int32_t &id)
{
    if (!context_.account()) {
        return errorRefused;
    }
    try {
        const int32_t added = context_.queue.add(request);
        auto record = context_.queue.find(added);
        listeners_[added] = listener;
        run(std::move(*record), false);
        id = added;
    } catch (const std::exception &fault) {
        g_warning("a request cannot be kept: %s", fault.what());
        return errorDevice;
    }
    g_message("request %d: %zu files, %zu recipients", id, request.files.size(),
              request.recipients.size());
    changed_();
    return 0;
}

int Uploads::requestUpload(const std::string &listener, const std::vector<std::string> &paths,
                           std::vector<Recipient> recipients, bool wifiOnly, int32_t &id)
{
    if (paths.empty() || recipients.empty()) {
        return invalidParameter;
    }
    NewRequest request;
    for (const std::string &path : paths) {
        QueuedFile file{path, {}};
        if (!stampOf(path, file.stamp)) {
            file.stamp.size = -1; // accepted all the same; the end tells
        }
        request.files.push_back(std::move(file));
    }
    request.recipients = std::move(recipients);
    request.wifiOnly = wifiOnly;
    request.createdAt = context_.timers.epochSeconds();
    return accept(listener, request, id);
}

int Uploads::requestReshare(const std::string &listener, int32_t earlierId,
                            std::vector<Recipient> recipients, bool wifiOnly, int32_t &id)
{
    if (recipients.empty()) {
        return invalidParameter;
    }
    const auto earlier = context_.queue.find(earlierId);
    if (!earlier || earlier->share.empty() ||
        earlier->endStatus != static_cast<int>(Status::shareFinished)) {
        g_warning("a reshare names request %d, which has no finished share", earlierId);
        return errorRefused;
    }
    NewRequest request;
    request.files = earlier->files;
    request.recipients = std::move(recipients);
    request.wifiOnly = wifiOnly;
    request.reshareOf = earlier->share;
    request.createdAt = context_.timers.epochSeconds();
    return accept(listener, request, id);
}

int Uploads::cancel(int32_t id)
{
    const auto found = requests_.find(id);
    if (found == requests_.end()) {
        return errorRefused;
    }
    found->second->cancel();
    return 0;
}

int Uploads::withdraw(int32_t id)
{
    if (cancel(id) == 0) {
        return 0;
    }
    const auto record = context_.queue.find(id);
    if (!record || record->forgotten ||
        record->endStatus != static_cast<int>(Status::shareFinished)) {
        return errorUnknown;
    }
    context_.queue.setWithdrawn(id);
    changed_();
    withdrawals_.kick();
    return 0;
}

int Uploads::forget(int32_t id)
{
    const auto record = context_.queue.find(id);
    if (!record || record->forgotten) {
        return errorUnknown;
    }
    if (record->state != RequestState::ended) {
        return errorRefused;
    }
    context_.queue.forget(id);
    changed_();
    return 0;
}

int Uploads::resume(const std::string &listener, int32_t id)
{
    if (requests_.count(id) == 0 && undelivered_.count(id) == 0) {
        return errorRefused;
    }
    listeners_[id] = listener;
    context_.timers.after(0, [this, id] { tellPresent(id); });
    return 0;
}

void Uploads::tellPresent(int32_t id)
{
    const auto listener = listeners_.find(id);
    if (listener == listeners_.end()) {
        return;
    }
    if (const auto end = undelivered_.find(id); end != undelivered_.end()) {
        emit_(listener->second, id, end->second);
    } else if (const Request *request = running(id)) {
        for (const RequestReport &report : request->present()) {
            emit_(listener->second, id, report);
        }
    }
}

void Uploads::confirmEnd(const std::string &listener, int32_t id)
{
    const auto found = listeners_.find(id);
    // A confirmation may come after a restart that forgot who listened: who confirms has heard.
    const bool fromAnother = found != listeners_.end() && found->second != listener;
    if (!fromAnother && undelivered_.count(id) != 0) {
        setDelivered(id);
    }
}

void Uploads::setDelivered(int32_t id)
{
    try {
        context_.queue.setDelivered(id);
    } catch (const std::exception &fault) {
        g_warning("request %d: the queue cannot be written: %s", id, fault.what());
    }
    undelivered_.erase(id);
    listeners_.erase(id);
    abandoned_.erase(id);
}

void Uploads::listenerGone(const std::string &listener)
{
    const auto lost = std::erase_if(
        listeners_, [&listener](const auto &entry) { return entry.second == listener; });
    if (lost != 0) {
        orphaned_();
    }
}

void Uploads::networkChanged()
{
    for (const auto &[id, request] : requests_) {
        request->networkChanged();
    }
    withdrawals_.kick();
}

void Uploads::onReport(int32_t id, const RequestReport &report)
{
    if (report.isEnd()) {
        undelivered_[id] = report;
        g_message("request %d: ended with status %d, error %d", id, static_cast<int>(report.status),
                  report.error);
        // Not from inside the request's own function.
        context_.timers.after(0, [this, id] { onEnd(id); });
    }
    changed_();
    if (const auto listener = listeners_.find(id); listener != listeners_.end()) {
        emit_(listener->second, id, report);
    }
}

void Uploads::onEnd(int32_t id)
{
    requests_.erase(id);
    withdrawals_.kick();
    if (abandoned_.count(id) != 0) {
        setDelivered(id);
    } else if (isOrphan(id)) {
        orphaned_();
    }
}

bool Uploads::isOrphan(int32_t id) const
{
    const bool open = requests_.count(id) != 0 || undelivered_.count(id) != 0;
    return open && listeners_.count(id) == 0 && abandoned_.count(id) == 0;
}

std::vector<int32_t> Uploads::orphans() const
{
    std::set<int32_t> open;
    for (const auto &[id, request] : requests_) {
        open.insert(id);
    }
    for (const auto &[id, report] : undelivered_) {
        open.insert(id);
    }
    std::erase_if(open, [this](int32_t id) { return !isOrphan(id); });
    return {open.begin(), open.end()};
}

void Uploads::abandon(int32_t id)
{
    g_message("request %d: the application does not claim it", id);
    abandoned_.insert(id);
    const auto found = requests_.find(id);
    if (found == requests_.end()) {
        setDelivered(id);
        return;
    }
    try {
        context_.queue.setDelivered(id);
    } catch (const std::exception &fault) {
        g_warning("request %d: the queue cannot be written: %s", id, fault.what());
    }
    // What is finished on the server goes on to its recipients.
    if (found->second->record().state == RequestState::uploading) {
        found->second->cancel();
    }
}

const Request *Uploads::running(int32_t id) const
{
    const auto found = requests_.find(id);
    return found != requests_.end() ? found->second.get() : nullptr;
}

} // namespace pelliko::service
