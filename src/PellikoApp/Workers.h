#pragma once

#include <chrono>
#include <functional>

namespace pelliko
{

/// Runs `work` on a detached thread; false when the thread could not be started (logged).
/// `work` owns what it needs: it may still run when the caller's objects are gone.
bool startDetachedWorker(std::function<void()> work);

/// While it lives, the thread that made it counts as a worker: for callbacks on a library's thread.
class WorkerScope
{
public:
    WorkerScope();
    ~WorkerScope();
    WorkerScope(const WorkerScope &) = delete;
    WorkerScope &operator=(const WorkerScope &) = delete;
};

/// Waits until no worker runs, at most `bound`; true when none is left. Called when the main loop
/// has ended, so that no worker meets objects that the end of the process destroys.
bool waitForWorkers(std::chrono::milliseconds bound);

} // namespace pelliko
