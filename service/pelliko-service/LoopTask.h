// Runs a task on the main loop, from any thread
#pragma once

#include <functional>

namespace pelliko::service
{

using LoopTask = std::function<void()>;

/** Runs a task on the main loop, after what is waiting there already; never from inside. Any
 * thread. */
void onMainLoop(LoopTask task);

} // namespace pelliko::service
