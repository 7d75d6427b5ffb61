#include "PellikoNotificationManager/NotificationBackup.h"

#include "AppLog/AppLog.h"
#include "PellikoApp/CText.h"
#include "PellikoNotificationManager/ReceivedShareNotifications.h"

#include <Ecore_File.h>
#include <algorithm>
#include <app_preference.h>
#include <cstdlib>
#include <cstring>
#include <notification.h>

namespace pelliko
{

namespace
{

constexpr const char *thumbnailDirectory =
    "/opt/usr/apps/com.velmora.pelliko/shared/data/thumbnail";
constexpr const char *bigThumbnailDirectory =
    "/opt/usr/apps/com.velmora.pelliko/shared/data/big_thumbnail";
constexpr const char *separator = "|";

int _readCount()
{
    int count = 0;
    if (preference_get_int(shareNotiBackupedKey, &count) != PREFERENCE_ERROR_NONE)
        LOG_ERROR("Error in setting PREFERENCE KEY SHARE_NOTI_BACKUPED");
    return count;
}

// Null when there is none or it cannot be read.
CText _readTokens()
{
    char *tokens = nullptr;
    preference_get_string(shareNotiTokensKey, &tokens);
    return CText(tokens);
}

// Fills at most `count` entries with the pieces of `text` and returns how many it filled.
int _splitTokens(char *text, char **tokens, int count)
{
    char *rest = nullptr;
    int filled = 0;
    for (char *piece = strtok_r(text, separator, &rest); piece;
         piece = strtok_r(nullptr, separator, &rest), ++filled) {
        if (filled < count)
            tokens[filled] = strdup(piece);
    }
    if (filled != count)
        LOG_ERROR("backuped_count=%d, but %d tokens are stored", count, filled);
    return filled < count ? filled : count;
}

void _removeDirectory(const char *path, const char *name)
{
    if (ecore_file_recursive_rm(path))
        LOG_DEBUG("%s delete success.", name);
    else
        LOG_DEBUG("%s delete failed.", name);
}

} // namespace

void backupNotiInfo(PellikoAppData *ad)
{
    RETURN_IF_NULL(ad, "ad is NULL");
    notification_h noti = notification_load_by_tag(pushNotificationTag);
    LOG_DEBUG("noti: %p", static_cast<void *>(noti));
    int count = 0;
    CText tokens;
    if (noti) {
        count = _readCount();
        LOG_DEBUG("Noti exist, backuped_count=%d", count);
        tokens = _readTokens();
        notification_free(noti);
    } else {
        LOG_DEBUG("Noti not exist to backup");
    }
    deleteAllThumbnails();
    const int err = preference_set_string(shareNotiTokensKey, tokens.get());
    if (err != PREFERENCE_ERROR_NONE)
        LOG_ERROR("preference set thumbnail path fail %d", err);
    if (preference_set_int(shareNotiBackupedKey, count) != PREFERENCE_ERROR_NONE)
        LOG_ERROR("Error in setting PREFERENCE KEY SHARE_NOTI_BACKUPED");
}

int restoreNotiInfo(PellikoAppData *ad)
{
    RETURN_VALUE_IF_NULL(ad, -1, "ad is NULL");
    const int count = _readCount();
    LOG_DEBUG("backuped_count=%d", count);
    if (count <= 0)
        return -1;
    const CText text = _readTokens();
    if (!text)
        return 0;
    // No text has more pieces than characters, whatever the count says.
    const size_t room = std::min(static_cast<size_t>(count), strlen(text.get()) + 1);
    auto **tokens = static_cast<char **>(calloc(room, sizeof(char *)));
    const int filled = tokens ? _splitTokens(text.get(), tokens, count) : 0;
    if (filled == 0) {
        free(tokens);
        return -1;
    }
    replaceContentsTokens(ad, tokens, filled);
    return 0;
}

void deleteAllThumbnails()
{
    if (preference_remove_all() == PREFERENCE_ERROR_NONE)
        LOG_DEBUG("thumbnail preference delete success.");
    else
        LOG_DEBUG("thumbnail preference delete failed.");
    _removeDirectory(thumbnailDirectory, "thumbnail");
    _removeDirectory(bigThumbnailDirectory, "big thumbnail");
}

void replaceContentsTokens(PellikoAppData *ad, char **tokens, int32_t length)
{
    for (int32_t i = 0; ad->contents_token_list_head && i < ad->token_length; ++i)
        free(ad->contents_token_list_head[i]);
    free(ad->contents_token_list_head);
    ad->contents_token_list = tokens;
    ad->contents_token_list_head = tokens;
    ad->token_length = length;
}

} // namespace pelliko
