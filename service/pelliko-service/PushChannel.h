// The connection over which the server tells what was shared
#pragma once

#include "Backoff.h"
#include "ReceivedJournal.h"
#include "RequestContext.h"
#include "ServerEvents.h"
#include "ServerRest.h"

namespace pelliko::service
{

/**
 * The one connection over which the server tells what was shared with this user; open while there
 * is an account and a network. A push is in the journal before the server is told that it arrived.
 */
class PushChannel
{
public:
    /** @param arrived called when the journal has a new push; not from inside the functions here */
    PushChannel(RequestContext &context, ReceivedJournal &journal, std::function<void()> arrived);
    ~PushChannel();
    PushChannel(const PushChannel &) = delete;
    PushChannel &operator=(const PushChannel &) = delete;

    /** There may be an account, another account, or none any more. */
    void accountChanged();
    void networkChanged();

private:
    void connect();
    void close();
    void reconnectLater(int64_t atLeastMs = 0);
    void reconnectAfter(int64_t milliseconds);
    void onBytes(const std::string &bytes);
    void onEvent(const ServerEvent &event);
    void onEnd(const HttpAnswer &answer);
    void watchSilence();
    void acknowledge();
    void onAcknowledged(int64_t upTo, const HttpAnswer &answer);

    RequestContext &context_;
    ReceivedJournal &journal_;
    std::function<void()> arrived_;
    Backoff backoff_;
    ServerRest rest_;
    Backoff ackBackoff_;
    std::optional<Account> account_;
    std::unique_ptr<ServerEvents> events_;
    uint64_t stream_ = 0;
    uint64_t ack_ = 0;
    uint64_t reconnectTimer_ = 0;
    uint64_t silenceTimer_ = 0;
    uint64_t ackTimer_ = 0;
    std::shared_ptr<PushChannel *> self_; ///< emptied when this ends, for what is on its way
};

} // namespace pelliko::service
