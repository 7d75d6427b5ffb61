#pragma once

#include <Eina.h>
#include <cstdint>

namespace pelliko
{

/// One phone number of a contact that was chosen as recipient. The record owns its texts.
struct UploadRecipient {
    int32_t type = 0;           ///< the number's type as the contacts store gives it
    int32_t number_id = 0;      ///< id of the phone-number record in the contacts store
    char *number = nullptr;     ///< without formatting characters
    char *name = nullptr;       ///< the contact's display name
    char *image_path = nullptr; ///< the person's thumbnail, may be null
    int32_t is_sms = 0;         ///< 1: not joined to the sharing service, is told by SMS
};

/// The share that is being prepared. It owns both lists and what is in them. Main loop only.
struct UploadItem {
    Eina_List *recipient_list = nullptr; ///< UploadRecipient *, in the order of the number ids
    Eina_List *files = nullptr;          ///< char * (g_strdup), absolute paths in request order
    int32_t request_id = 0;              ///< given by the upload service once it accepted the share
    int32_t files_count = 0;
    int32_t files_size = 0;         ///< bytes; wraps at 32 bits
    uint64_t before_files_size = 0; ///< the same sum at 64 bits
};

/// A new item with every field zero, owned by the caller; null after logging "Malloc failed".
UploadItem *createUploadData();

/// Frees an item with its lists; null is fine.
void freeUploadData(UploadItem *item);

/// Frees one recipient with its texts; null is fine.
void freeUploadRecipient(UploadRecipient *recipient);

/// Empties the recipients of an item.
void clearUploadRecipients(UploadItem &item);

/// Empties the files of an item and sets both sums to zero; `files_count` stays.
void clearUploadFiles(UploadItem &item);

/// Appends a copy of `path` to the files and adds `size` bytes to both sums.
void appendUploadFile(UploadItem &item, const char *path, int64_t size);

} // namespace pelliko
