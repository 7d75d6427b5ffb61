#include "PellikoUploadDataManager/UploadItem.h"

#include "AppLog/AppLog.h"

#include <glib.h>
#include <new>

namespace pelliko
{

namespace
{

// Removes the first element of a list and gives its data.
void *_takeFirst(Eina_List *&list)
{
    void *data = eina_list_data_get(list);
    list = eina_list_remove_list(list, list);
    return data;
}

} // namespace

UploadItem *createUploadData()
{
    auto *item = new (std::nothrow) UploadItem;
    if (!item)
        LOG_ERROR("Malloc failed");
    return item;
}

void freeUploadRecipient(UploadRecipient *recipient)
{
    if (!recipient)
        return;
    g_free(recipient->number);
    g_free(recipient->name);
    g_free(recipient->image_path);
    delete recipient;
}

void clearUploadRecipients(UploadItem &item)
{
    while (item.recipient_list)
        freeUploadRecipient(static_cast<UploadRecipient *>(_takeFirst(item.recipient_list)));
}

void clearUploadFiles(UploadItem &item)
{
    while (item.files)
        g_free(_takeFirst(item.files));
    item.files_size = 0;
    item.before_files_size = 0;
}

void appendUploadFile(UploadItem &item, const char *path, int64_t size)
{
    item.files = eina_list_append(item.files, g_strdup(path));
    item.files_size =
        static_cast<int32_t>(static_cast<uint32_t>(item.files_size) + static_cast<uint32_t>(size));
    item.before_files_size += static_cast<uint64_t>(size);
}

void freeUploadData(UploadItem *item)
{
    if (!item)
        return;
    clearUploadRecipients(*item);
    clearUploadFiles(*item);
    delete item;
}

} // namespace pelliko
