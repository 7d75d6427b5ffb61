// Operations that only this product's programs exchange; they live beside the platform's own.
#pragma once

/// What an operation's or key's path ("appcontrol/...") is preceded by.
#define APP_CONTROL_NAMESPACE_PREFIX "http://tizen.org/"

/// The user tapped an upload notification.
#define APP_CONTROL_OPERATION_UPLOADING_NOTI_PRESSED                                               \
    "http://tizen.org/appcontrol/operation/uploading_noti_pressed"
/// The account is gone.
#define APP_CONTROL_OPERATION_DEREGISTERED "http://tizen.org/appcontrol/operation/deregistered"
/// The service was switched on or off.
#define APP_CONTROL_OPERATION_SERVICE_ON "http://tizen.org/appcontrol/operation/service_on"
#define APP_CONTROL_OPERATION_SERVICE_OFF "http://tizen.org/appcontrol/operation/service_off"
/// To the history application: a share, or a share of an earlier upload, is finished.
#define APP_CONTROL_OPERATION_SHARED "http://tizen.org/appcontrol/operation/shared"
#define APP_CONTROL_OPERATION_RESHARED "http://tizen.org/appcontrol/operation/reshared"
/// To the viewer application: open one received share.
#define APP_CONTROL_OPERATION_LAUNCH_VIEWER "http://tizen.org/appcontrol/operation/launch_viewer"
