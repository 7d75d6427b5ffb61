// An end for calls that would wait longer than their caller can.
#pragma once

#include <chrono>
#include <condition_variable>
#include <mutex>
#include <thread>

#include <gio/gio.h>

namespace pelliko::modem
{

/// Cancels its cancellable when `limit` is over. Blocking calls have limits of their own, but per
/// call; this one holds for all of them together, on threads that run no loop. Any thread.
class Deadline
{
public:
    explicit Deadline(std::chrono::milliseconds limit);
    ~Deadline();
    Deadline(const Deadline &) = delete;
    Deadline &operator=(const Deadline &) = delete;

    GCancellable *cancellable() const { return cancellable_; }

private:
    GCancellable *cancellable_;
    std::mutex mutex_;
    std::condition_variable_any stopped_;
    std::jthread clock_; // last: it uses the others
};

} // namespace pelliko::modem
