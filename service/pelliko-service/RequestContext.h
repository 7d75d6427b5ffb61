#pragma once

#include "Account.h"
#include "Http.h"
#include "Launcher.h"
#include "NetworkGate.h"
#include "Settings.h"
#include "Timers.h"
#include "UploadQueue.h"

namespace pelliko::service
{

/** What the requests work with; everything outlives them. */
struct RequestContext {
    UploadQueue &queue;
    HttpSender &http;
    Timers &timers;
    NetworkGate &gate;
    Launcher &launcher;
    const Settings &settings;
    std::function<std::optional<Account>()> account;
    std::function<double()> random;
};

/** Status values of pelliko_client.h, as the service reports them. */
enum class Status {
    started = 1,
    progressing = 2,
    finished = 3,
    failed = 4,
    cancelled = 5,
    paused = 6,
    shareFinished = 7
};

/** One status report of a request. */
struct RequestReport {
    Status status = Status::started;
    std::string input;
    int percent = 0;
    int64_t expires = 0;
    int error = 0;

    bool isEnd() const
    {
        return error != 0 || status == Status::cancelled || status == Status::shareFinished;
    }
};

} // namespace pelliko::service
