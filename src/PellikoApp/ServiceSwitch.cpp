#include "PellikoApp/ServiceSwitch.h"

#include "AppLog/AppLog.h"
#include "PellikoDatabaseManager/UploadInfoDatabase.h"
#include "PellikoNotificationManager/NotificationBackup.h"

#include <Elementary.h>
#include <notification.h>

namespace pelliko
{

namespace
{

void _deleteAllNotifications()
{
    if (notification_delete_all(NOTIFICATION_TYPE_NOTI) != NOTIFICATION_ERROR_NONE)
        LOG_ERROR("delete all NOTIFICATION_TYPE_NOTI failed!");
    if (notification_delete_all(NOTIFICATION_TYPE_ONGOING) != NOTIFICATION_ERROR_NONE)
        LOG_ERROR("deleted all NOTIFICATION_TYPE_ONGOING failed!");
}

} // namespace

void switchServiceOff(PellikoAppData *ad)
{
    backupNotiInfo(ad);
    _deleteAllNotifications();
    elm_exit();
}

void forgetAccount()
{
    _deleteAllNotifications();
    deleteUploadInfoDb();
    deleteAllThumbnails();
    elm_exit();
}

} // namespace pelliko
