#include "app_common.h"

#include "ApplicationId.h"
#include "Guard.h"

using pelliko::platform::applicationId;
using pelliko::platform::guarded;
using pelliko::platform::mallocedCopy;

namespace
{

char *pathBelowApplication(const char *folder)
{
    char *path = nullptr;
    const int result = guarded([&] {
        path = mallocedCopy("/opt/usr/apps/" + applicationId() + folder);
        return TIZEN_ERROR_NONE;
    });
    set_last_result(result);
    return path;
}

} // namespace

char *app_get_resource_path(void)
{
    return pathBelowApplication("/res/");
}

char *app_get_shared_resource_path(void)
{
    return pathBelowApplication("/shared/res/");
}

char *app_get_data_path(void)
{
    return pathBelowApplication("/data/");
}

char *app_get_shared_data_path(void)
{
    return pathBelowApplication("/shared/data/");
}

int app_get_id(char **id)
{
    if (!id)
        return TIZEN_ERROR_INVALID_PARAMETER;
    return guarded([=] {
        *id = mallocedCopy(applicationId());
        return TIZEN_ERROR_NONE;
    });
}
