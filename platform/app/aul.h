// Is an application running?
#pragma once

#ifdef __cplusplus
extern "C" {
#endif

/// 1 when an application of that id is running, 0 when not, when `appid` is null or no valid id, or
/// when there is no session bus. Synchronous; any thread; never starts anything.
int aul_app_is_running(const char *appid);

#ifdef __cplusplus
}
#endif
