#include "aul.h"

#include "LaunchBus.h"

int aul_app_is_running(const char *appid)
{
    using namespace pelliko::platform;
    return isApplicationId(appid) && nameHasOwner(appid) ? 1 : 0;
}
