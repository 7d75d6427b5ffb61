#pragma once

#include "PellikoApp/AppData.h"

// The received shares that the panel announces outlive a time in which the service is switched off:
// their tokens are kept as preferences. Main loop only.

namespace pelliko
{

/// Integer: number of content tokens that the notification of received shares announces.
constexpr const char *shareNotiBackupedKey = "remote-share-settings-share_noti_backuped";
/// Text: those tokens, separated by "|".
constexpr const char *shareNotiTokensKey = "remote-share-settings-share_noti_tokens";

/// Keeps the tokens of the notification that is shown (none when it is not shown) and removes every
/// other preference and the thumbnails. The notification itself is the caller's to delete.
void backupNotiInfo(PellikoAppData *ad);

/// Puts the kept tokens into the record. Where count and tokens disagree, the smaller number is
/// taken, so that every entry of the list is a token.
/// @return 0 when the push handling is to go on with the record, also when the tokens cannot be
///         read and the record is as it was; -1 when nothing is kept
int restoreNotiInfo(PellikoAppData *ad);

/// Removes all preferences of the application and the thumbnails of received shares. Failures are
/// logged only.
void deleteAllThumbnails();

/// Puts `length` tokens into the record and releases the ones before. The array and its texts are
/// from malloc and become the record's. No push may be under way.
void replaceContentsTokens(PellikoAppData *ad, char **tokens, int32_t length);

} // namespace pelliko
