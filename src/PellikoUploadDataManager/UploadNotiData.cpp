#include "PellikoUploadDataManager/UploadNotiData.h"

#include "AppLog/AppLog.h"

#include <cstdint>
#include <cstring>
#include <glib.h>
#include <new>

namespace pelliko
{

UploadNotiData *g_upload_noti_data_list = nullptr;
UploadNotiData *g_current_node = nullptr;

namespace
{

// Where g_current_node points after its node was freed: it is never in the list, so a second
// removal finds nothing, and a new node at the freed address is never mistaken for the removed one.
UploadNotiData g_removed_node;

void _freeNode(UploadNotiData *node)
{
    g_strfreev(node->file_list);
    g_free(node->recipient_list);
    g_free(node->recipient_index_list);
    delete node;
}

// The link (head or a node's next) that holds `node`; null when it is not in the list.
UploadNotiData **_linkTo(const UploadNotiData *node)
{
    UploadNotiData **link = &g_upload_noti_data_list;
    while (*link && *link != node)
        link = &(*link)->next;
    return *link ? link : nullptr;
}

void _uploadListDeleteNode()
{
    if (!g_current_node || !g_upload_noti_data_list)
        return;
    UploadNotiData **link = _linkTo(g_current_node);
    if (!link) {
        LOG_DEBUG("Given node is not present in Linked List");
        return;
    }
    *link = g_current_node->next;
    _freeNode(g_current_node);
    g_removed_node = UploadNotiData();
    g_current_node = &g_removed_node;
}

int _handleForLog(const void *handle)
{
    return static_cast<int>(reinterpret_cast<intptr_t>(handle));
}

void _printNode(const UploadNotiData &node)
{
    LOG_DEBUG("node->request_id = %d", node.request_id);
    LOG_DEBUG("node->noti_priv_id = %d", _handleForLog(node.noti_priv_id));
    LOG_DEBUG("node->notif = %d", _handleForLog(node.notif));
    LOG_DEBUG("node->upload_status = %d", node.upload_status);
    LOG_DEBUG("node->total_files = %d", node.total_files);
    if (node.file_list)
        LOG_DEBUG("node->file_list = %p", static_cast<const void *>(node.file_list));
    LOG_DEBUG("node->total_size = %ld", static_cast<long>(node.total_size));
    LOG_DEBUG("node->progress_percent = %f", static_cast<double>(node.progress_percent));
    if (node.recipient_list)
        LOG_DEBUG("node->recipient_list = %p", static_cast<const void *>(node.recipient_list));
    if (node.recipient_index_list)
        LOG_DEBUG("node->recipient_index_list = %p",
                  static_cast<const void *>(node.recipient_index_list));
}

} // namespace

UploadNotiData *addUploadNotiDataNode()
{
    auto *node = new (std::nothrow) UploadNotiData;
    if (!node) {
        LOG_ERROR("Memory allocation failed");
        return nullptr;
    }
    UploadNotiData **end = &g_upload_noti_data_list;
    while (*end)
        end = &(*end)->next;
    *end = node;
    return node;
}

UploadNotiData *getUploadNotiDataNode(int32_t request_id)
{
    UploadNotiData *node = g_upload_noti_data_list;
    while (node && node->request_id != request_id)
        node = node->next;
    if (node)
        LOG_DEBUG("Request id found = %d", request_id);
    return node;
}

void removeUploadNotiDataNode(int32_t mode)
{
    switch (mode) {
    case REMOVE_NOTIFICATION:
        if (g_current_node)
            g_current_node->notif = nullptr;
        break;
    case REMOVE_PRIV_ID:
        if (g_current_node)
            memset(g_current_node->noti_priv_id, 0, sizeof(g_current_node->noti_priv_id));
        break;
    case REMOVE_NODE:
        _uploadListDeleteNode();
        break;
    default:
        LOG_DEBUG("Wrong parameter = %d", mode);
    }
}

void _uploadListPrintUploadNotiDataList()
{
    if (!g_upload_noti_data_list) {
        LOG_DEBUG("No data found. returning...");
        return;
    }
    for (const UploadNotiData *node = g_upload_noti_data_list; node; node = node->next)
        _printNode(*node);
}

} // namespace pelliko
