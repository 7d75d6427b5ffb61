#include "PushChannel.h"

#include "LoopTask.h"
#include "ReceivedApi.h"
#include "ShareApi.h"

#include <glib.h>

#include <algorithm>
#include <utility>

namespace pelliko::service
{
namespace
{
/** Hands the stream's pieces to the main loop. */
class StreamSink : public BodySink
{
public:
    explicit StreamSink(std::function<void(const std::string &)> take) : take_(std::move(take)) {}

    bool begin(long) override { return true; }
    bool take(std::string_view piece) override
    {
        if (!piece.empty()) {
            onMainLoop([take = take_, bytes = std::string(piece)] { take(bytes); });
        }
        return true;
    }
    bool end() override { return true; }
    std::string fault() const override { return {}; }

private:
    std::function<void(const std::string &)> take_;
};

bool sameAccount(const std::optional<Account> &one, const std::optional<Account> &other)
{
    if (!one || !other) {
        return !one && !other;
    }
    return one->server == other->server && one->number == other->number &&
           one->token == other->token;
}

} // namespace

PushChannel::PushChannel(RequestContext &context, ReceivedJournal &journal,
                         std::function<void()> arrived)
    : context_(context), journal_(journal), arrived_(std::move(arrived)),
      backoff_(context.settings.firstRetryMs, context.settings.longestRetryMs, context.random),
      ackBackoff_(context.settings.firstRetryMs, context.settings.longestRetryMs, context.random),
      self_(std::make_shared<PushChannel *>(this))
{
}

PushChannel::~PushChannel()
{
    close();
    context_.http.cancel(ack_);
    context_.timers.cancel(ackTimer_);
}

void PushChannel::accountChanged()
{
    const auto account = context_.account();
    if (sameAccount(account_, account)) {
        return;
    }
    close();
    context_.http.cancel(std::exchange(ack_, 0));
    context_.timers.cancel(std::exchange(ackTimer_, 0));
    account_ = account;
    backoff_.reset();
    connect();
}

void PushChannel::networkChanged()
{
    if (!account_) {
        return;
    }
    const bool open = context_.gate.open(account_->server, false);
    if (!open) {
        close();
    } else if (stream_ == 0) {
        backoff_.reset();
        connect();
    }
}

void PushChannel::close()
{
    context_.http.cancel(std::exchange(stream_, 0));
    context_.timers.cancel(std::exchange(reconnectTimer_, 0));
    context_.timers.cancel(std::exchange(silenceTimer_, 0));
    // Pieces of the old stream may be on their way.
    self_ = std::make_shared<PushChannel *>(this);
}

void PushChannel::connect()
{
    close();
    if (!account_ || !context_.gate.open(account_->server, false)) {
        return; // networkChanged() or accountChanged() comes
    }
    if (const int64_t rest = rest_.left(account_->server, context_.timers.steadyMs())) {
        reconnectAfter(rest);
        return;
    }
    int64_t from = 0;
    try {
        from = journal_.position(*account_).stored;
    } catch (const std::exception &fault) {
        g_warning("push: the journal cannot be read: %s", fault.what());
        reconnectLater();
        return;
    }
    events_ = std::make_unique<ServerEvents>([this](const ServerEvent &event) { onEvent(event); });
    HttpRequest request = ReceivedApi::pushStream(*account_, from);
    request.sink = std::make_shared<StreamSink>(
        [weak = std::weak_ptr<PushChannel *>(self_)](const std::string &bytes) {
            if (const auto self = weak.lock()) {
                (*self)->onBytes(bytes);
            }
        });
    stream_ = context_.http.send(std::move(request), nullptr,
                                 [this](const HttpAnswer &answer) { onEnd(answer); });
    watchSilence();
    acknowledge();
}

void PushChannel::watchSilence()
{
    context_.timers.cancel(silenceTimer_);
    silenceTimer_ = context_.timers.after(context_.settings.pushSilenceMs, [this] {
        silenceTimer_ = 0;
        g_message("push: the stream is silent, it is opened anew");
        reconnectLater();
    });
}

void PushChannel::reconnectLater(int64_t atLeastMs)
{
    close();
    reconnectAfter(std::max(backoff_.next(), atLeastMs));
}

void PushChannel::reconnectAfter(int64_t milliseconds)
{
    reconnectTimer_ = context_.timers.after(milliseconds, [this] {
        reconnectTimer_ = 0;
        connect();
    });
}

void PushChannel::onBytes(const std::string &bytes)
{
    watchSilence();
    // A copy: an event may close this stream.
    const std::weak_ptr<PushChannel *> alive = self_;
    if (!events_->take(bytes) && !alive.expired()) {
        g_warning("push: the server sends lines without an end");
        reconnectLater();
        return;
    }
    if (!alive.expired()) {
        backoff_.reset();
    }
}

void PushChannel::onEvent(const ServerEvent &event)
{
    const int64_t id = g_ascii_strtoll(event.id.c_str(), nullptr, 10);
    if (event.type != "share" || id <= 0 || stream_ == 0) {
        return;
    }
    const std::string token = ReceivedApi::readPush(event.data);
    if (token.empty()) {
        g_warning("push %" G_GINT64_FORMAT ": no content token", id);
        return;
    }
    try {
        journal_.announce(*account_, id, token, context_.timers.epochSeconds());
    } catch (const std::exception &fault) {
        // It is not acknowledged, so the server sends it again.
        g_warning("push %" G_GINT64_FORMAT ": the journal cannot be written: %s", id, fault.what());
        context_.http.cancel(std::exchange(stream_, 0));
        context_.timers.after(0, [weak = std::weak_ptr<PushChannel *>(self_)] {
            if (const auto self = weak.lock()) {
                (*self)->reconnectLater();
            }
        });
        return;
    }
    acknowledge();
    arrived_();
}

void PushChannel::onEnd(const HttpAnswer &answer)
{
    stream_ = 0;
    if (!answer.failure.empty()) {
        g_message("push: %s", answer.failure.c_str());
    } else if (answer.status != 200) {
        const std::string name(ShareApi::failureOf(answer).name);
        g_message("push: the server refuses: %s", name.c_str());
    }
    const bool refused = answer.failure.empty() && answer.status >= 400 && answer.status < 500;
    const int64_t rest = askedRest(answer);
    rest_.begin(rest, context_.timers.steadyMs());
    reconnectLater(std::max(refused ? context_.settings.longestRetryMs : 0, rest));
}

// One at a time; what arrives meanwhile goes with the next.
void PushChannel::acknowledge()
{
    if (ack_ != 0 || ackTimer_ != 0 || !account_) {
        return;
    }
    PushPosition position;
    try {
        position = journal_.position(*account_);
    } catch (const std::exception &fault) {
        g_warning("push: the journal cannot be read: %s", fault.what());
        return;
    }
    if (position.stored <= position.acknowledged) {
        return;
    }
    ack_ = context_.http.send(ReceivedApi::acknowledge(*account_, position.stored), nullptr,
                              [this, upTo = position.stored](const HttpAnswer &answer) {
                                  ack_ = 0;
                                  onAcknowledged(upTo, answer);
                              });
}

void PushChannel::onAcknowledged(int64_t upTo, const HttpAnswer &answer)
{
    try {
        if (answer.failure.empty() && answer.status == 204) {
            journal_.setAcknowledged(*account_, upTo);
            ackBackoff_.reset();
            acknowledge();
            return;
        }
        if (answer.failure.empty() && answer.status == 409) {
            // The server's own state was put back: what waits there is told from the beginning.
            g_message("push: the server does not know the position");
            journal_.forgetPosition(*account_);
            reconnectLater();
            return;
        }
    } catch (const std::exception &fault) {
        g_warning("push: the journal cannot be written: %s", fault.what());
    }
    ackTimer_ = context_.timers.after(std::max(ackBackoff_.next(), askedRest(answer)), [this] {
        ackTimer_ = 0;
        acknowledge();
    });
}

} // namespace pelliko::service
