#pragma once

#include <cstdint>

// What a usage record says instead of the figures of a share. Every text is static; null: the
// record says nothing.

namespace pelliko
{

/// "Contacts_personal", "Contacts_group", "Recent_personal" or "Recent_group": whether the
/// recipients were picked in this application's contact view (`ct_app_id` is its id; may be null),
/// and whether it is one.
const char *_shareViaTo(int recipient_count, const char *ct_app_id);

/// Kind of content of a row of the extension table.
const char *_contentKind(int row);

/// "1_10", "11_50" or "51_100".
const char *_fileCountBucket(int file_count);

/// "0_100MB", "100MB_500MB" or "500MB_1GB", for a size in bytes.
const char *_fileSizeBucket(uint32_t file_size);

/// "size_exceeded_once", "size_exceeded_day", "not_supported_files" or "file_count".
const char *_rejectReason(int reason);

} // namespace pelliko
