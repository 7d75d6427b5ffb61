#include "PellikoApp/ServiceSwitch.h"

#include "AppLog/AppLog.h"
#include "PellikoApp/PushReceiver.h"
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

bool switchServiceOn(PellikoAppData *ad)
{
    if (announceKeptShares(ad))
        return true;
    elm_exit();
    return false;
}

void switchServiceOff(PellikoAppData *ad)
{
    abandonPushes();
    backupNotiInfo(ad);
    _deleteAllNotifications();
    elm_exit();
}

void forgetAccount()
{
    abandonPushes();
    _deleteAllNotifications();
    deleteUploadInfoDb();
    deleteAllThumbnails();
    elm_exit();
}

} // namespace pelliko
