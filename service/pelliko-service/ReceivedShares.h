// What others shared with this user, for programs that ask
#pragma once

#include "Backoff.h"
#include "ReceivedJournal.h"
#include "RequestContext.h"
#include "ServerRest.h"

#include <set>

namespace pelliko::service
{

/** What others shared with this user, for programs that ask. */
class ReceivedShares
{
public:
    /** @param error a code of pelliko_shares.h. A share may be there beside it, as it was known
     * last
     */
    using Answer = std::function<void(int error, const std::optional<ReceivedShare> &share)>;

    /** @param changed called when the list is different */
    ReceivedShares(RequestContext &context, ReceivedJournal &journal,
                   std::function<void()> changed);
    ~ReceivedShares();
    ReceivedShares(const ReceivedShares &) = delete;
    ReceivedShares &operator=(const ReceivedShares &) = delete;

    /** Newest first. */
    std::vector<ReceivedShare> all();
    /** @param fresh whether the server is asked even for a share that is known
     * @param answer may be called from inside */
    void get(const std::string &token, bool fresh, const Answer &answer);
    /** @return a code of pelliko_shares.h */
    int forget(const std::string &token);

    /** There may be something to tell the server, or a network to do it over. */
    void kick();

private:
    std::optional<ReceivedShare> known(const std::string &token);
    void ask(const Account &account, const std::string &token, const Answer &answer);
    int take(const std::string &token, const HttpAnswer &answer);
    void forgetOnServer();
    void onForgotten(const std::string &token, const HttpAnswer &answer);
    void kickAfter(int64_t milliseconds);

    RequestContext &context_;
    ReceivedJournal &journal_;
    std::function<void()> changed_;
    Backoff backoff_;
    ServerRest rest_;
    std::set<uint64_t> questions_;
    uint64_t transfer_ = 0;
    uint64_t timer_ = 0;
};

} // namespace pelliko::service
