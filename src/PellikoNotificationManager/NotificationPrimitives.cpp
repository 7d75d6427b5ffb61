#include "PellikoNotificationManager/NotificationPrimitives.h"

#include "AppLog/AppLog.h"
#include "PellikoApp/AppData.h"
#include "PellikoUploadDataManager/RecipientTexts.h"

#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <cstring>

namespace pelliko
{

namespace
{

constexpr size_t numberSize = 32;

// What the launch request of a notification tells about its upload.
struct Figures {
    int recipients = 0;
    int total_files = 0;
    uint32_t request_id = 0;
    long total_size = 0;
};

bool _isNodeSource(const PellikoAppData *ad, int state_code)
{
    return state_code != 0 || (ad->is_resume_by_reboot == 1 && ad->has_upload_resume == 1);
}

// The node that a notification in this state belongs to, or null when it is not in the list.
UploadNotiData *_nodeOf(const PellikoAppData *ad, int state_code)
{
    if (_isNodeSource(ad, state_code)) {
        LOG_DEBUG("Populating tag from current node...");
        if (!g_current_node) {
            LOG_ERROR("Some fatal error occurred. g_current_node is null.");
            abort();
        }
        return getUploadNotiDataNode(g_current_node->request_id);
    }
    LOG_DEBUG("Populating tag from ad_upload_item...");
    if (!ad->upload_item) {
        LOG_ERROR("Some fatal error occurred.  ad->upload_item is null.");
        abort();
    }
    return getUploadNotiDataNode(ad->action_type == ACTION_RESHARE_UPLOAD
                                     ? ad->reshared_request_id
                                     : ad->upload_item->request_id);
}

// Goes by the current node's tag: the handle in the slot may be older than what is shown.
int _notificationDeleteByPrivId()
{
    const char *tag = g_current_node ? g_current_node->noti_priv_id : nullptr;
    notification_h posted = notification_load_by_tag(tag);
    const int err = notification_delete(posted);
    if (err != NOTIFICATION_ERROR_NONE)
        LOG_ERROR("notification_delete failed...");
    if (posted)
        notification_free(posted);
    return err;
}

Figures _figuresOfNode(const UploadNotiData &node)
{
    Figures figures;
    const char *list = node.recipient_list ? node.recipient_list : "";
    figures.recipients = static_cast<int>(std::count(list, list + strlen(list), '?'));
    setRecipientTexts(list, node.recipient_index_list);
    figures.total_files = node.total_files;
    figures.request_id = static_cast<uint32_t>(node.request_id);
    figures.total_size = node.total_size;
    return figures;
}

Figures _figuresOfItem(const UploadItem &item)
{
    Figures figures;
    figures.recipients = static_cast<int>(eina_list_count(item.recipient_list));
    figures.total_files = static_cast<int>(eina_list_count(item.files));
    figures.request_id = static_cast<uint32_t>(item.request_id);
    figures.total_size = item.files_size;
    return figures;
}

Figures _figures(const PellikoAppData *ad, int state_code)
{
    if (_isNodeSource(ad, state_code)) {
        if (g_current_node) {
            LOG_DEBUG("Populating extra data from current node...");
            return _figuresOfNode(*g_current_node);
        }
        LOG_ERROR("Some fatal error occurred. Current node is null.");
        return {};
    }
    LOG_DEBUG("Populating extra data from ad_upload_item...");
    if (ad->upload_item)
        return _figuresOfItem(*ad->upload_item);
    LOG_ERROR("Some fatal error occurred. ad_upload_data is null.");
    return {};
}

void _add(app_control_h app_control, const char *key, const char *value)
{
    if (app_control_add_extra_data(app_control, key, value) != APP_CONTROL_ERROR_NONE)
        LOG_ERROR("app control error recieved.");
}

} // namespace

void deleteAllNotificationsOfType(notification_type_e type)
{
    const int err = notification_delete_all(type);
    if (err != NOTIFICATION_ERROR_NONE)
        LOG_ERROR("notification_delete_all error [%d]", err);
}

int _notificationInsert(notification_h notification, int state_code)
{
    const PellikoAppData *ad = getAppData();
    UploadNotiData *node = _nodeOf(ad, state_code);
    if (!node) {
        LOG_ERROR("no upload is in the list for this notification");
        return NOTIFICATION_ERROR_INVALID_PARAMETER;
    }
    snprintf(node->noti_priv_id, sizeof(node->noti_priv_id), "%d", node->request_id);
    LOG_DEBUG("node->noti_priv_id = %s", node->noti_priv_id);
    int err = notification_set_tag(notification, node->noti_priv_id);
    if (err != NOTIFICATION_ERROR_NONE) {
        LOG_ERROR("notification_set_tag failed...");
        return err;
    }
    err = notification_post(notification);
    if (err != NOTIFICATION_ERROR_NONE)
        LOG_ERROR("notification_post failed...");
    return err;
}

int deleteNotificationById(notification_h *notification_ref, const char *noti_id)
{
    LOG_DEBUG("noti_id = %s", textOrNull(noti_id));
    if (!noti_id || !notification_ref || !*notification_ref) {
        LOG_DEBUG("Notification is null, returning");
        return 0;
    }
    LOG_DEBUG("************* Removing Noti = %s*******************", noti_id);
    notification_type_e type = NOTIFICATION_TYPE_NONE;
    int err = notification_get_type(*notification_ref, &type);
    if (err != NOTIFICATION_ERROR_NONE) {
        LOG_ERROR("notification_get_type error [%d]", err);
        return 0;
    }
    err = _notificationDeleteByPrivId();
    if (err != NOTIFICATION_ERROR_NONE) {
        LOG_ERROR("notification_delete_by_priv_id error [%d]", err);
        return 0;
    }
    replaceNotificationHandle(notification_ref, nullptr);
    removeUploadNotiDataNode(REMOVE_NOTIFICATION);
    removeUploadNotiDataNode(REMOVE_PRIV_ID);
    return 1;
}

void replaceNotificationHandle(notification_h *slot, notification_h handle)
{
    notification_h old = *slot;
    *slot = handle;
    if (old && old != handle)
        notification_free(old);
}

void _addExtraData(app_control_h app_control, int state_code)
{
    const PellikoAppData *ad = getAppData();
    RETURN_IF_NULL(ad, "ad is NULL");
    const Figures figures = _figures(ad, state_code);
    char number[numberSize];

    snprintf(number, sizeof(number), "%d", figures.recipients);
    LOG_DEBUG("Adding total recipients = %d", figures.recipients);
    _add(app_control, "recipient_count", number);

    LOG_DEBUG("Adding recipient index list to extra data. list = %s", getRecipientIndexListText());
    _add(app_control, "recipient_index_list", getRecipientIndexListText());

    LOG_DEBUG("Adding recipient list to extra data. list = %s", getRecipientListText());
    _add(app_control, "recipient_list", getRecipientListText());

    snprintf(number, sizeof(number), "%d", figures.total_files);
    LOG_DEBUG("Adding total files = %d", figures.total_files);
    _add(app_control, "total_files", number);

    snprintf(number, sizeof(number), "%d", state_code);
    LOG_DEBUG("Adding status = %s", number);
    _add(app_control, "upload_status", number);

    snprintf(number, sizeof(number), "%u", figures.request_id);
    LOG_DEBUG("Adding request id = %u", figures.request_id);
    _add(app_control, "upload_request_id", number);

    snprintf(number, sizeof(number), "%ld", figures.total_size);
    LOG_DEBUG("Adding total size = %ld", figures.total_size);
    _add(app_control, "total_size", number);
}

void _removeExtraData(app_control_h app_control)
{
    static constexpr const char *keys[] = {"recipient_count", "recipient_index_list",
                                           "recipient_list",  "total_files",
                                           "upload_status",   "upload_request_id"};
    for (const char *key : keys) {
        const int err = app_control_remove_extra_data(app_control, key);
        if (err != APP_CONTROL_ERROR_NONE)
            LOG_ERROR("app control error recieved = %d", err);
    }
}

} // namespace pelliko
