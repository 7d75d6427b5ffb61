#include "Timers.h"

#include <glib.h>

#include <algorithm>
#include <memory>

namespace pelliko::service
{
namespace
{
using Task = std::function<void()>;

gboolean runTask(gpointer data)
{
    // A copy: the task may cancel its own timer.
    const Task task = *static_cast<Task *>(data);
    task();
    return G_SOURCE_REMOVE;
}

void deleteTask(gpointer data)
{
    std::unique_ptr<Task>(static_cast<Task *>(data));
}
} // namespace

uint64_t LoopTimers::after(int64_t milliseconds, Task task)
{
    const auto interval = static_cast<guint>(std::clamp<int64_t>(milliseconds, 0, G_MAXINT));
    return g_timeout_add_full(G_PRIORITY_DEFAULT, interval, runTask, new Task(std::move(task)),
                              deleteTask);
}

void LoopTimers::cancel(uint64_t timer)
{
    if (timer == 0) {
        return;
    }
    if (GSource *source = g_main_context_find_source_by_id(nullptr, static_cast<guint>(timer))) {
        g_source_destroy(source);
    }
}

int64_t LoopTimers::steadyMs() const
{
    return g_get_monotonic_time() / 1000;
}

int64_t LoopTimers::epochSeconds() const
{
    return g_get_real_time() / G_USEC_PER_SEC;
}

} // namespace pelliko::service
