#include "support/AppWorld.h"

#include "PellikoDatabaseManager/UploadInfoDatabase.h"
#include "PellikoNotificationManager/NotificationBackup.h"
#include "PellikoNotificationManager/SenderNames.h"
#include "PellikoUploadDataManager/RecipientTexts.h"
#include "PellikoUploadDataManager/Recipients.h"
#include "PellikoUploadManager/UsagePreferences.h"
#include "PellikoUploadingDataManager/PressedNotification.h"

#include <app_control.h>
#include <app_preference.h>
#include <cstring>
#include <glib.h>
#include <sqlite3.h>
#include <sys/stat.h>

namespace pelliko::test
{

namespace
{

constexpr const char *databasePath = "/opt/usr/apps/com.velmora.pelliko/data/.pelliko.db";

std::string _textOf(const char *text)
{
    return text ? text : "";
}

std::string _takeText(char *text)
{
    std::string copy = _textOf(text);
    free(text);
    return copy;
}

std::string _notificationText(notification_h notification, notification_text_type_e type)
{
    char *text = nullptr;
    notification_get_text(notification, type, &text);
    return _textOf(text);
}

std::string _notificationImage(notification_h notification, notification_image_type_e type)
{
    char *path = nullptr;
    notification_get_image(notification, type, &path);
    return _textOf(path);
}

void _readLaunchRequest(notification_h notification, Posted &result)
{
    app_control_h request = nullptr;
    notification_get_launch_option(notification, NOTIFICATION_LAUNCH_OPTION_APP_CONTROL, &request);
    if (!request)
        return;
    char *text = nullptr;
    if (app_control_get_app_id(request, &text) == APP_CONTROL_ERROR_NONE)
        result.app_id = _takeText(text);
    text = nullptr;
    if (app_control_get_operation(request, &text) == APP_CONTROL_ERROR_NONE)
        result.operation = _takeText(text);
    for (const char *key : {"recipient_count", "recipient_index_list", "recipient_list",
                            "total_files", "upload_status", "upload_request_id", "total_size",
                            "contents_token", "share_type", "view_type", "remoteShare"}) {
        text = nullptr;
        if (app_control_get_extra_data(request, key, &text) == APP_CONTROL_ERROR_NONE)
            result.extras[key] = _takeText(text);
    }
    app_control_destroy(request);
}

void _emptyList()
{
    while (g_upload_noti_data_list) {
        g_current_node = g_upload_noti_data_list;
        if (g_current_node->notif)
            notification_free(g_current_node->notif);
        removeUploadNotiDataNode(REMOVE_NODE);
    }
}

void _execute(const char *statement)
{
    sqlite3 *database = nullptr;
    if (sqlite3_open(databasePath, &database) == SQLITE_OK)
        sqlite3_exec(database, statement, nullptr, nullptr, nullptr);
    sqlite3_close(database);
}

int _rowCb(void *data, int, char **values, char **)
{
    static_cast<std::vector<int> *>(data)->push_back(atoi(values[0]));
    return 0;
}

void _resetPush(PellikoAppData *ad)
{
    replaceContentsTokens(ad, nullptr, 0);
    ad->sender_name_fallback = nullptr;
    ad->thumbnails_count = 0;
    for (char **text : {&ad->sender_msisdn, &ad->sender_name, &ad->sender_image_path}) {
        g_free(*text);
        *text = nullptr;
    }
    for (char *&slot : g_sender_info) {
        g_free(slot);
        slot = nullptr;
    }
}

// The record lives as long as the process: what a test may have set is set back.
void _resetRecord(PellikoAppData *ad)
{
    freeUploadData(ad->upload_item);
    ad->upload_item = nullptr;
    ad->is_resume_by_reboot = 0;
    ad->has_upload_resume = 0;
    ad->req_id_to_reshare = 0;
    ad->reshared_request_id = 0;
    ad->action_type = ACTION_UPLOAD;
    ad->operation_type = OPERATION_DEFAULT;
    ad->popup = nullptr;
    ad->wifi_check = 0;
    ad->sim_index = 0;
    ad->file_count = 0;
    for (char **text :
         {&ad->sender_ccc, &ad->url, &ad->from_msisdn, &ad->expired_time, &ad->req_id}) {
        g_free(*text);
        *text = nullptr;
    }
    g_has_sms_receiver = 0;
    popup_update_enabled = 0;
    g_cancel_in_progress = 0;
    g_noti_press_data = {};
    setRecipientTexts(nullptr, nullptr);
    _resetPush(ad);
}

} // namespace

std::optional<Posted> posted(const std::string &tag)
{
    notification_h notification = notification_load_by_tag(tag.c_str());
    if (!notification)
        return std::nullopt;
    Posted result;
    notification_get_type(notification, &result.type);
    notification_get_layout(notification, &result.layout);
    notification_get_display_applist(notification, &result.display);
    notification_get_progress(notification, &result.progress);
    result.title = _notificationText(notification, NOTIFICATION_TEXT_TYPE_TITLE);
    result.content = _notificationText(notification, NOTIFICATION_TEXT_TYPE_CONTENT);
    result.icon = _notificationImage(notification, NOTIFICATION_IMAGE_TYPE_ICON);
    result.indicator_icon =
        _notificationImage(notification, NOTIFICATION_IMAGE_TYPE_ICON_FOR_INDICATOR);
    _readLaunchRequest(notification, result);
    notification_free(notification);
    return result;
}

AppWorld::AppWorld() : loop(MainLoop::instance()), ad(getAppData())
{
    // What the test before left behind must not reach this one.
    preference_unset_changed_cb(shareSmsDoneKey);
    preference_unset_changed_cb(updatePopupDataKey);
    loop.settle();
    _resetRecord(ad);
    _emptyList();
    g_current_node = nullptr;
    createTableUploadInfoDb();
    _execute("DELETE FROM UPLOAD_INFO;");
    notification_delete_all(NOTIFICATION_TYPE_NONE);
    preference_remove_all();
    log.restart();
}

AppWorld::~AppWorld()
{
    _emptyList();
    _resetRecord(ad);
}

UploadNotiData *AppWorld::addNode(int32_t request_id, const std::vector<std::string> &files,
                                  int32_t total_size, const std::string &recipients,
                                  const std::string &ids)
{
    UploadNotiData *node = addUploadNotiDataNode();
    node->request_id = request_id;
    snprintf(node->noti_priv_id, sizeof(node->noti_priv_id), "%d", request_id);
    node->total_files = static_cast<int32_t>(files.size());
    node->total_size = total_size;
    node->file_list = g_new0(char *, files.size() + 1);
    for (size_t i = 0; i < files.size(); ++i)
        node->file_list[i] = g_strdup(files[i].c_str());
    node->recipient_list = static_cast<char *>(g_malloc0(recipientListSize));
    g_strlcpy(node->recipient_list, recipients.c_str(), recipientListSize);
    node->recipient_index_list = static_cast<char *>(g_malloc0(recipientIndexSize));
    g_strlcpy(node->recipient_index_list, ids.c_str(), recipientIndexSize);
    return node;
}

void AppWorld::shareInHand(const std::vector<std::string> &files, int recipients)
{
    static constexpr const char *names[] = {"Ann", "Bob", "Eve"};
    freeUploadData(ad->upload_item);
    ad->upload_item = createUploadData();
    for (const std::string &path : files) {
        struct stat info = {};
        appendUploadFile(*ad->upload_item, path.c_str(),
                         stat(path.c_str(), &info) == 0 ? info.st_size : 0);
    }
    ad->upload_item->files_count = static_cast<int32_t>(files.size());
    for (int i = 0; i < recipients; ++i) {
        auto *recipient = new UploadRecipient;
        recipient->number_id = 31 + i;
        recipient->name = g_strdup(names[i % 3]);
        recipient->number = g_strdup_printf("+4479460009%02d", i);
        recipient->is_sms = i % 2;
        ad->upload_item->recipient_list =
            eina_list_append(ad->upload_item->recipient_list, recipient);
    }
    _populateExtraData(ad);
}

std::vector<int> AppWorld::rows() const
{
    std::vector<int> ids;
    sqlite3 *database = nullptr;
    if (sqlite3_open(databasePath, &database) == SQLITE_OK)
        sqlite3_exec(database, "SELECT req_id FROM UPLOAD_INFO ORDER BY req_id;", _rowCb, &ids,
                     nullptr);
    sqlite3_close(database);
    return ids;
}

} // namespace pelliko::test
