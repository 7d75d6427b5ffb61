#include "PellikoApp/Workers.h"

#include "AppLog/AppLog.h"

#include <condition_variable>
#include <memory>
#include <mutex>
#include <pthread.h>
#include <utility>

namespace pelliko
{

namespace
{

struct Running {
    std::mutex mutex;
    std::condition_variable changed;
    int count = 0;
};

// Never destroyed: the last worker may leave after the process has begun to take down its statics.
Running &_running()
{
    static auto *const running = new Running;
    return *running;
}

void _count(int difference)
{
    Running &running = _running();
    const std::lock_guard lock(running.mutex);
    running.count += difference;
    running.changed.notify_all();
}

using Work = std::function<void()>;

void *_run(void *data)
{
    {
        const std::unique_ptr<Work> work(static_cast<Work *>(data));
        (*work)();
    }
    _count(-1);
    return nullptr;
}

bool _create(const pthread_attr_t &attributes, Work work)
{
    auto handed_over = std::make_unique<Work>(std::move(work));
    _count(1);
    pthread_t thread;
    if (pthread_create(&thread, &attributes, _run, handed_over.get()) != 0) {
        LOG_ERROR("error in pthread_create");
        _count(-1);
        return false;
    }
    (void)handed_over.release();
    return true;
}

} // namespace

bool startDetachedWorker(Work work)
{
    pthread_attr_t attributes;
    if (pthread_attr_init(&attributes) != 0) {
        LOG_ERROR("error in pthread_attr_init");
        return false;
    }
    bool started = false;
    if (pthread_attr_setdetachstate(&attributes, PTHREAD_CREATE_DETACHED) != 0)
        LOG_ERROR("error in pthread_attr_setdetachstate");
    else
        started = _create(attributes, std::move(work));
    if (pthread_attr_destroy(&attributes) != 0)
        LOG_ERROR("error in pthread_attr_destroy");
    return started;
}

WorkerScope::WorkerScope()
{
    _count(1);
}

WorkerScope::~WorkerScope()
{
    _count(-1);
}

bool waitForWorkers(std::chrono::milliseconds bound)
{
    Running &running = _running();
    std::unique_lock lock(running.mutex);
    return running.changed.wait_for(lock, bound, [&running] { return running.count == 0; });
}

} // namespace pelliko
