#include "LoopTask.h"

#include <glib.h>

#include <memory>
#include <utility>

namespace pelliko::service
{
namespace
{
gboolean runTask(gpointer data)
{
    (*static_cast<LoopTask *>(data))();
    return G_SOURCE_REMOVE;
}

void deleteTask(gpointer data)
{
    std::unique_ptr<LoopTask>(static_cast<LoopTask *>(data));
}
} // namespace

// An own source, for g_main_context_invoke() might run the task right here when the loop stands
// still.
void onMainLoop(LoopTask task)
{
    GSource *source = g_idle_source_new();
    g_source_set_priority(source, G_PRIORITY_DEFAULT);
    g_source_set_callback(source, runTask, new LoopTask(std::move(task)), deleteTask);
    g_source_attach(source, nullptr);
    g_source_unref(source);
}

} // namespace pelliko::service
