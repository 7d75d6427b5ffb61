#pragma once

#include <cstddef>
#include <cstdint>
#include <notification.h>

// The list of uploads that were requested and have not ended, in the order of the requests.
// Main loop only.

namespace pelliko
{

constexpr size_t notiPrivIdSize = 20;      ///< bytes, with the terminator
constexpr size_t recipientListSize = 1024; ///< bytes of a node's recipient_list
constexpr size_t recipientIndexSize = 256; ///< bytes of a node's recipient_index_list

struct UploadNotiData {
    int32_t request_id = 0; ///< given by the upload service; the key of the list
    char noti_priv_id[notiPrivIdSize] =
        {};                         ///< the request id as decimal text: the notification's tag
    notification_h notif = nullptr; ///< what is shown now; owned by the notification rooms
    int32_t total_files = 0;
    int32_t upload_status = 0; ///< last status of the service; 6: shown as paused
    char **file_list =
        nullptr;            ///< null-terminated array of paths, owned with its texts (g_strfreev)
    int32_t total_size = 0; ///< bytes
    float progress_percent = 0; ///< 0 to 100
    char *recipient_list =
        nullptr; ///< recipientListSize bytes from g_malloc0, or null: "Ann?Bob+SMS?"
    char *recipient_index_list =
        nullptr;                 ///< recipientIndexSize bytes from g_malloc0, or null: "31?7?"
    uint8_t completion_flag = 0; ///< 1: the SMS of this share is done
    UploadNotiData *next = nullptr;
};

/// First node of the list, null when it is empty.
extern UploadNotiData *g_upload_noti_data_list;

/// The node being acted on. Set it before calling what acts on it. Null until it is set for the
/// first time; after a node was removed it points to an empty node that stands outside the list, so
/// that it can be read and compared safely and never equals a live node.
extern UploadNotiData *g_current_node;

enum RemoveMode : int32_t {
    REMOVE_NOTIFICATION = 0, ///< forget the node's notification handle (it is not freed)
    REMOVE_PRIV_ID = 1,      ///< clear the node's noti_priv_id
    REMOVE_NODE = 2          ///< unlink the node and free it with all that it owns
};

/// A new zeroed node, already at the end of the list, which owns it; null after logging
/// "Memory allocation failed".
UploadNotiData *addUploadNotiDataNode();

/// The first node of that id, or null. A hit is logged.
UploadNotiData *getUploadNotiDataNode(int32_t request_id);

/// Acts on g_current_node (null: nothing happens); `mode` is a RemoveMode, another value is logged
/// and ignored.
void removeUploadNotiDataNode(int32_t mode);

/// Writes the fields of every node to the log.
void _uploadListPrintUploadNotiDataList();

} // namespace pelliko
