#include "PellikoNotificationManager/NotificationBuilder.h"

#include "AppLog/AppLog.h"
#include "PellikoApp/TextFormat.h"
#include "PellikoNotificationManager/NotificationPrimitives.h"

#include <app_control.h>
#include <pelliko_operations.h>
#include <tizen_error.h>

namespace pelliko
{

namespace
{

int _setImage(notification_h notification, notification_image_type_e type, const char *path)
{
    const int err = notification_set_image(notification, type, path);
    if (err != NOTIFICATION_ERROR_NONE)
        LOG_ERROR("notification_set_image failed [%d]", err);
    return err;
}

int _loggedText(int err)
{
    if (err != NOTIFICATION_ERROR_NONE)
        LOG_ERROR("notification_set_text failed [%d]", err);
    return err;
}

bool _failed(int err, const char *text)
{
    if (err == NOTIFICATION_ERROR_NONE)
        return false;
    LOG_ERROR("%s[%d]", text, err);
    return true;
}

bool _buildAndPostTicker(notification_h ticker, notification_ly_type_e layout, const char *shown,
                         const char *id)
{
    if (_failed(notification_set_display_applist(ticker, NOTIFICATION_DISPLAY_APP_TICKER),
                "fail to set notification display applist ") ||
        _failed(notification_set_layout(ticker, layout), "fail to set notification layout ") ||
        _failed(notification_set_image(ticker, NOTIFICATION_IMAGE_TYPE_ICON_FOR_INDICATOR,
                                       indicatorIcon),
                "fail to set notification box icon for indicator") ||
        _failed(notification_set_text(ticker, NOTIFICATION_TEXT_TYPE_TITLE, shown, id,
                                      NOTIFICATION_VARIABLE_TYPE_NONE),
                "fail to set notification text"))
        return false;
    if (notification_set_tag(ticker, "TICKER") != NOTIFICATION_ERROR_NONE) {
        LOG_ERROR("notification_set_tag failed...");
        return false;
    }
    return !_failed(notification_post(ticker), "fail to insert notification text");
}

} // namespace

int setLayout(notification_h notification, notification_ly_type_e layout)
{
    const int err = notification_set_layout(notification, layout);
    if (err != NOTIFICATION_ERROR_NONE)
        LOG_ERROR("notification_set_layout failed [%d]", err);
    return err;
}

int setImages(notification_h notification, const char *panel, const char *indicator)
{
    const int err = _setImage(notification, NOTIFICATION_IMAGE_TYPE_ICON, panel);
    if (err != NOTIFICATION_ERROR_NONE)
        return err;
    return _setImage(notification, NOTIFICATION_IMAGE_TYPE_ICON_FOR_INDICATOR, indicator);
}

int setDisplay(notification_h notification, int display_list)
{
    const int err = notification_set_display_applist(notification, display_list);
    if (err != NOTIFICATION_ERROR_NONE)
        LOG_ERROR("notification_set_display_applist failed [%d]", err);
    return err;
}

int setText(notification_h notification, notification_text_type_e type, const char *id)
{
    return _loggedText(notification_set_text(notification, type, translated(id), id,
                                             NOTIFICATION_VARIABLE_TYPE_NONE));
}

int setCountText(notification_h notification, notification_text_type_e type, const char *shown,
                 const char *id, int count)
{
    return _loggedText(notification_set_text(notification, type, shown, id,
                                             NOTIFICATION_VARIABLE_TYPE_INT, count,
                                             NOTIFICATION_VARIABLE_TYPE_NONE));
}

bool attachLaunchRequest(notification_h notification, int state_code, OldFigures old_figures,
                         WithoutRequest without_request, const char *failure_text)
{
    app_control_h request = nullptr;
    if (app_control_create(&request) != APP_CONTROL_ERROR_NONE) {
        LOG_ERROR("%s", failure_text);
        if (without_request == WithoutRequest::give_up)
            return false;
        request = nullptr;
    }
    app_control_set_app_id(request, applicationId);
    app_control_set_operation(request, APP_CONTROL_OPERATION_UPLOADING_NOTI_PRESSED);
    if (old_figures == OldFigures::remove)
        _removeExtraData(request);
    _addExtraData(request, state_code);
    const int err = notification_set_launch_option(notification,
                                                   NOTIFICATION_LAUNCH_OPTION_APP_CONTROL, request);
    if (err != NOTIFICATION_ERROR_NONE)
        LOG_ERROR("notification_set_launch_option failed [%d]", err);
    if (request)
        app_control_destroy(request);
    return true;
}

bool postTicker(notification_ly_type_e layout, const char *shown, const char *id)
{
    notification_h ticker = notification_create(NOTIFICATION_TYPE_NOTI);
    if (!ticker) {
        LOG_ERROR("notification_create failed");
        return false;
    }
    const bool posted = _buildAndPostTicker(ticker, layout, shown, id);
    notification_free(ticker);
    return posted;
}

bool readTitle(notification_h notification, std::string &title)
{
    char *text = nullptr; // borrowed: gone when the notification is deleted
    const int err = notification_get_text(notification, NOTIFICATION_TEXT_TYPE_TITLE, &text);
    if (err != NOTIFICATION_ERROR_NONE) {
        LOG_ERROR("notification get text error = %s", get_error_message(err));
        return false;
    }
    title = text ? text : "";
    return true;
}

bool titleIs(const std::string &title, const char *id)
{
    return title.starts_with(translated(id));
}

} // namespace pelliko
