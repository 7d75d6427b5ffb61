#include "support/MainLoop.h"

#include <Ecore.h>
#include <Elementary.h>
#include <GlibPump.h>

namespace pelliko::test
{

namespace
{

Eina_Bool _timeoutCb(void *data)
{
    *static_cast<bool *>(data) = true;
    return ECORE_CALLBACK_CANCEL;
}

void _reachedCb(void *data)
{
    *static_cast<bool *>(data) = true;
}

} // namespace

MainLoop::MainLoop()
{
    elm_init(0, nullptr);
    platform::installGlibPump();
}

MainLoop &MainLoop::instance()
{
    static MainLoop loop;
    return loop;
}

bool MainLoop::runUntil(const std::function<bool()> &condition, double seconds)
{
    bool late = false;
    Ecore_Timer *timer = ecore_timer_add(seconds, _timeoutCb, &late);
    bool holds = condition();
    while (!holds && !late) {
        ecore_main_loop_iterate_may_block(1);
        holds = condition();
    }
    if (!late)
        ecore_timer_del(timer);
    return holds;
}

void MainLoop::settle()
{
    bool reached = false;
    ecore_job_add(_reachedCb, &reached);
    runUntil([&reached] { return reached; });
}

} // namespace pelliko::test
