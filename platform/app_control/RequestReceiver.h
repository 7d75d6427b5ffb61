// Receives the launch requests of one application: owns its bus name, keeps the requests in order.
#pragma once

#include "app_control.h"

#include <functional>
#include <memory>
#include <string>
#include <vector>

namespace pelliko::platform
{

/// Main thread only; works from GLib's default main context.
class RequestReceiver
{
public:
    enum class Claim { Owned, TakenByAnother, NoBus };
    /// The request is the receiver's and valid during the call.
    using Handler = std::function<void(app_control_h request)>;

    explicit RequestReceiver(std::string applicationId);
    /// Closes.
    ~RequestReceiver();
    RequestReceiver(const RequestReceiver &) = delete;
    RequestReceiver &operator=(const RequestReceiver &) = delete;

    /// Takes the application's name on the session bus. From here on requests are kept.
    Claim claim(std::string *error);

    /// After claim(): looks at what has come so far. True when this start was only for requests
    /// that were passed on to another application, which have arrived there: nothing is left to do.
    bool onlyPassedOn();

    /// From the next turns of the main context on, hands out what is kept and what comes, one after
    /// the other and in order of arrival; a request that comes while the handler runs waits.
    /// `start` is the request that this start itself is: with `always` it comes first, else it is
    /// handed out only when no request was waiting for this start. Takes ownership of `start`.
    void deliver(Handler handler, app_control_h start, bool always);

    /// Gives the name up, so that the next request starts a new instance, and gives back what was
    /// not handed out: senders then ask that new instance.
    void close();

private:
    struct Impl;
    std::unique_ptr<Impl> impl_;
};

/// The request for these local files, for app_control_destroy: share for one, multi share for
/// several, the default operation for none.
app_control_h requestForFiles(const std::vector<std::string> &paths);

} // namespace pelliko::platform
