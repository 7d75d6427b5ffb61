#include "PellikoUploadManager/HistoryNotice.h"

#include "AppLog/AppLog.h"

#include <app_control.h>
#include <aul.h>
#include <cstdio>
#include <pelliko_operations.h>

namespace pelliko
{

namespace
{

constexpr const char *historyId = "com.velmora.pelliko-history";
constexpr size_t requestIdSize = 20;

// A step that fails is logged and the rest still runs: a notice with less is better than none.
void _fillAndSend(app_control_h notice, const char *operation, const char *request_id)
{
    if (app_control_set_app_id(notice, historyId) != APP_CONTROL_ERROR_NONE)
        LOG_ERROR("app_control_set_app_id fail");
    if (app_control_set_operation(notice, operation) != APP_CONTROL_ERROR_NONE)
        LOG_ERROR("app_control_set_operation fail");
    if (app_control_add_extra_data(notice, "request_id", request_id) != APP_CONTROL_ERROR_NONE)
        LOG_ERROR("request_id set fail");
    const int ret = app_control_send_launch_request(notice, nullptr, nullptr);
    if (ret != APP_CONTROL_ERROR_NONE)
        LOG_ERROR("app_control_send_launch_request is failed ret = %d", ret);
}

void _notify(const char *operation, int32_t request_id)
{
    char text[requestIdSize];
    snprintf(text, sizeof(text), "%d", request_id);
    LOG_DEBUG("request_id = %d, req_id = %s", request_id, text);
    if (aul_app_is_running(historyId) <= 0) {
        LOG_DEBUG("History app is NOT running");
        return;
    }
    app_control_h notice = nullptr;
    if (app_control_create(&notice) != APP_CONTROL_ERROR_NONE) {
        LOG_ERROR("app_control_create() is failed !!");
        return;
    }
    _fillAndSend(notice, operation, text);
    app_control_destroy(notice);
}

} // namespace

void _sendSharedNotification(int32_t request_id)
{
    _notify(APP_CONTROL_OPERATION_SHARED, request_id);
}

void _sendResharedNotification(int32_t request_id)
{
    _notify(APP_CONTROL_OPERATION_RESHARED, request_id);
}

} // namespace pelliko
