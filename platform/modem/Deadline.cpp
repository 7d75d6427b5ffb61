#include "Deadline.h"

namespace pelliko::modem
{

Deadline::Deadline(std::chrono::milliseconds limit)
    : cancellable_(g_cancellable_new()), clock_([this, limit](const std::stop_token &stop) {
          std::unique_lock lock(mutex_);
          stopped_.wait_for(lock, stop, limit, [] { return false; });
          if (!stop.stop_requested())
              g_cancellable_cancel(cancellable_);
      })
{
}

Deadline::~Deadline()
{
    clock_ = {};
    g_object_unref(cancellable_);
}

} // namespace pelliko::modem
