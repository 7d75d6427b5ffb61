#include "PellikoUploadManager/UploadStart.h"

#include "AppLog/AppLog.h"
#include "PellikoApp/TextFormat.h"
#include "PellikoDatabaseManager/UploadInfoDatabase.h"
#include "PellikoUploadDataManager/RecipientTexts.h"
#include "PellikoUploadDataManager/SupportedFileTypes.h"
#include "PellikoUploadDataManager/UploadNotiData.h"
#include "PellikoUploadManager/UploadStatus.h"
#include "PellikoVelmoraLog/PellikoVelmoraLog.h"

#include <cstdio>
#include <glib.h>
#include <memory>
#include <pelliko_client.h>
#include <sys/stat.h>
#include <vector>

namespace pelliko
{

namespace
{

// Their meaning is the service's.
constexpr pelliko_upload_options_s uploadOptions = {1, 0};

// What the service is told about the recipients. Owns its records, in the order of the share.
class RecipientArray
{
public:
    RecipientArray(const UploadItem *item, const char *sender_ccc)
    {
        const Eina_List *list = item ? item->recipient_list : nullptr;
        count_ = static_cast<int>(eina_list_count(list));
        LOG_DEBUG("Recipient count = %d", count_);
        pointers_.assign(static_cast<size_t>(count_) + 1, nullptr);
        for (const Eina_List *l = list; l; l = eina_list_next(l))
            append(*static_cast<const UploadRecipient *>(eina_list_data_get(l)), sender_ccc);
    }
    ~RecipientArray()
    {
        for (pelliko_recipient_s *recipient : pointers_) {
            if (!recipient)
                continue;
            g_free(recipient->sender_ccc);
            g_free(recipient->number);
            g_free(recipient);
        }
    }
    RecipientArray(const RecipientArray &) = delete;
    RecipientArray &operator=(const RecipientArray &) = delete;

    pelliko_recipient_s **data() { return pointers_.data(); }
    int count() const { return count_; }

private:
    // Without memory for a record the recipient is left out; the count stays, the tail is null.
    void append(const UploadRecipient &from, const char *sender_ccc)
    {
        auto *recipient =
            static_cast<pelliko_recipient_s *>(g_try_malloc0(sizeof(pelliko_recipient_s)));
        if (!recipient)
            return;
        recipient->number = g_strdup(from.number);
        recipient->number_id = from.number_id;
        LOG_DEBUG("Recipient number_id %d = %d", static_cast<int>(used_), recipient->number_id);
        if (sender_ccc)
            recipient->sender_ccc = g_strdup(sender_ccc);
        else
            LOG_ERROR("sender_ccc is NULL !!");
        pointers_[used_++] = recipient;
    }

    std::vector<pelliko_recipient_s *> pointers_;
    size_t used_ = 0;
    int count_ = 0;
};

struct StrvFree {
    void operator()(char **texts) const { g_strfreev(texts); }
};
using PathArray = std::unique_ptr<char *, StrvFree>;

// Bytes of the files of the last new upload that exist. A reshare, whose files are not read, is
// counted with it.
uint32_t g_total_size = 0;

// The files of a share as the service and, later, the node keep them.
struct FileArrays {
    PathArray paths; ///< null-terminated
    int count = 0;
    std::vector<const char *> types; ///< for the usage log, one per file, null when there is none
};

FileArrays _collectFiles(const Eina_List *files)
{
    FileArrays arrays;
    arrays.count = static_cast<int>(eina_list_count(files));
    LOG_DEBUG("Files count = %d", arrays.count);
    arrays.paths.reset(g_new0(char *, static_cast<gsize>(arrays.count) + 1));
    g_total_size = 0;
    const char *type = nullptr;
    int index = 0;
    for (const Eina_List *l = files; l; l = eina_list_next(l)) {
        const auto *path = static_cast<const char *>(eina_list_data_get(l));
        arrays.paths.get()[index++] = g_strdup(path);
        type = _uploadFileType(path, type);
        arrays.types.push_back(type);
        struct stat info;
        if (stat(path, &info) == 0)
            g_total_size += static_cast<uint32_t>(info.st_size);
    }
    return arrays;
}

char *_newText(size_t size, const char *text)
{
    auto *copy = static_cast<char *>(g_malloc0(size));
    copyText(copy, size, text);
    return copy;
}

// Makes an accepted request known: to the list's other readers, and to the table.
void _recordRequest(UploadNotiData *node)
{
    node->upload_status = 0;
    node->recipient_list = _newText(recipientListSize, getRecipientListText());
    node->recipient_index_list = _newText(recipientIndexSize, getRecipientIndexListText());
    snprintf(node->noti_priv_id, sizeof(node->noti_priv_id), "%d", node->request_id);
    LOG_DEBUG("upload_noti_data_new_node->noti_priv_id = %s", node->noti_priv_id);
    writeUploadDataToDb(node);
}

int _logRequestError(int ret)
{
    if (ret == PELLIKO_ERROR_SERVICE_NOT_RUNNING)
        LOG_ERROR("pelliko_request_upload error PELLIKO_ERROR_SERVICE_NOT_RUNNING");
    else
        LOG_ERROR("pelliko_request_upload error = %d", ret);
    return ret;
}

} // namespace

const char *_uploadFileType(const char *path, const char *previous)
{
    const char *row = supportedExtensionAt(supportedExtensionPosition(path));
    return row ? row : previous;
}

int uploadStart(PellikoAppData *ad)
{
    RETURN_VALUE_IF_NULL(ad, -1, "Appdata is NULL");
    RETURN_VALUE_IF_NULL(ad->upload_item, -1, "Upload item is NULL");
    RecipientArray recipients(ad->upload_item, ad->sender_ccc);
    FileArrays files = _collectFiles(ad->upload_item->files);
    const int wifi_only = ad->wifi_check == 1 ? 1 : 0;
    LOG_DEBUG("Is upload wifi only = %d", wifi_only);

    UploadNotiData *node = addUploadNotiDataNode();
    if (!node)
        return 0;
    const int ret = pelliko_request_upload(&uploadOptions, recipients.data(), recipients.count(),
                                           files.paths.get(), files.count, wifi_only,
                                           uploadResponseStatusCb, ad, &node->request_id);
    if (ret != PELLIKO_ERROR_NONE)
        return _logRequestError(ret);

    node->total_files = files.count;
    node->file_list = files.paths.release();
    node->total_size = static_cast<int32_t>(g_total_size);
    ad->upload_item->request_id = node->request_id;
    _recordRequest(node);
    PellikoVelmoraLog::getInstance()->insertVelmoraLogShareVia(
        ad, recipients.count(), files.types.data(), files.count, static_cast<uint8_t>(wifi_only),
        files.count, g_total_size);
    return 0;
}

int reshareUploadStart(PellikoAppData *ad)
{
    RETURN_VALUE_IF_NULL(ad, -1, "Appdata is NULL");
    RETURN_VALUE_IF(ad->req_id_to_reshare == 0, -1, "req_id_to_reshare is zero");
    RecipientArray recipients(ad->upload_item, ad->sender_ccc);
    const int wifi_only = ad->wifi_check == 1 ? 1 : 0;
    LOG_DEBUG("Is reshare upload wifi only = %d", wifi_only);

    UploadNotiData *node = addUploadNotiDataNode();
    if (!node)
        return 0;
    LOG_DEBUG("Calling Service Api to start reshare upload...");
    const int ret = pelliko_request_reshare_upload(
        &uploadOptions, recipients.data(), recipients.count(), wifi_only, uploadResponseStatusCb,
        ad, ad->req_id_to_reshare, &ad->reshared_request_id);
    if (ret != PELLIKO_ERROR_NONE)
        return _logRequestError(ret);

    node->request_id = ad->reshared_request_id;
    if (ad->upload_item) {
        node->total_files = ad->upload_item->files_count;
        node->total_size = ad->upload_item->files_size;
    }
    _recordRequest(node);
    PellikoVelmoraLog::getInstance()->insertVelmoraLogShareVia(
        ad, recipients.count(), nullptr, 0, static_cast<uint8_t>(wifi_only), 0, g_total_size);
    return 0;
}

} // namespace pelliko
