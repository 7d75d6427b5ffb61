#include "support/MainLoop.h"

#include <Ecore.h>
#include <Elementary.h>
#include <GlibPump.h>

namespace pelliko::test
{

namespace
{

struct Wait {
    const std::function<bool()> &condition;
    bool holds = false;
    bool late = false;
};

// Before the loop sleeps: everything that had happened is handled.
Eina_Bool _lookCb(void *data)
{
    auto &wait = *static_cast<Wait *>(data);
    wait.holds = wait.condition();
    if (wait.holds)
        ecore_main_loop_quit();
    return ECORE_CALLBACK_RENEW;
}

Eina_Bool _lateCb(void *data)
{
    static_cast<Wait *>(data)->late = true;
    ecore_main_loop_quit();
    return ECORE_CALLBACK_RENEW;
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
    Wait wait{condition};
    Ecore_Idle_Enterer *look = ecore_idle_enterer_add(_lookCb, &wait);
    Ecore_Timer *timer = ecore_timer_add(seconds, _lateCb, &wait);
    // The application's own wish to leave ends one round, not the wait.
    while (!wait.holds && !wait.late)
        ecore_main_loop_begin();
    ecore_timer_del(timer);
    ecore_idle_enterer_del(look);
    return wait.holds;
}

void MainLoop::settle()
{
    bool reached = false;
    ecore_job_add(_reachedCb, &reached);
    runUntil([&reached] { return reached; });
}

} // namespace pelliko::test
