// The right to answer one received request, shared by all handles of that request.
#pragma once

#include <glib.h>

#include <atomic>
#include <functional>

namespace pelliko::platform
{

class ReplyToken
{
public:
    /// Sends the answer; `extras` is a floating a{sv}. Called at most once, on the thread that
    /// answers or that lets go of the last handle.
    using Answer = std::function<void(int result, GVariant *extras)>;

    explicit ReplyToken(Answer answer);
    /// Nobody can answer any more: the sender learns that the request was cancelled.
    ~ReplyToken();
    ReplyToken(const ReplyToken &) = delete;
    ReplyToken &operator=(const ReplyToken &) = delete;

    /// False when the request was answered before. Consumes a floating `extras` in any case.
    bool answer(int result, GVariant *extras);

    /// The sender was told in another way: nothing will be sent any more.
    void disarm() { answered_ = true; }

private:
    Answer answer_;
    std::atomic<bool> answered_{false};
};

} // namespace pelliko::platform
