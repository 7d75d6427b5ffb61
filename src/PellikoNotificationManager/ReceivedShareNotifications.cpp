#include "PellikoNotificationManager/ReceivedShareNotifications.h"

#include "AppLog/AppLog.h"
#include "PellikoApp/CText.h"
#include "PellikoApp/TextFormat.h"
#include "PellikoNotificationManager/ContactNames.h"
#include "PellikoNotificationManager/SenderNames.h"

#include <app_common.h>
#include <app_control.h>
#include <ctime>
#include <glib.h>
#include <notification.h>
#include <pelliko_operations.h>
#include <string>
#include <unistd.h>

namespace pelliko
{

namespace
{

constexpr const char *newSharesId = "IDS_RSH_TMBODY_NEW_PELLIKO_ABB";
constexpr const char *sharedWithYouId = "IDS_RSH_SBODY_SHARED_PD_FILES_WITH_YOU_M_STATUS_ABB";
constexpr const char *sharedFilesId = "IDS_RSH_TMBODY_SHARED_PD_FILES_WITH_YOU_ABB";
constexpr const char *personSharedId = "IDS_RSH_TPOP_P1SS_SHARED_P2SD_FILES_WITH_YOU";
constexpr const char *sharesReceivedId = "IDS_RSH_TPOP_PD_NEW_PELLIKO_MESSAGES_RECEIVED_ABB";

constexpr const char *viewerId = "com.velmora.pelliko-viewer";
constexpr const char *historyId = "com.velmora.pelliko-history";
constexpr const char *indicatorPicture =
    "/opt/usr/apps/com.velmora.pelliko/res/images/sender-images/WVGA/noti_icon_pelliko.png";
constexpr const char *defaultCallerPicture = "reserved:default_caller_id";
constexpr const char *tickerTag = "TICKER";
constexpr const char *singleTickerTag = "PUSH_TICKER_SINGLE";

constexpr int displayEverywhere = NOTIFICATION_DISPLAY_APP_NOTIFICATION_TRAY |
                                  NOTIFICATION_DISPLAY_APP_LOCK |
                                  NOTIFICATION_DISPLAY_APP_INDICATOR;
constexpr size_t textSize = 128;
constexpr size_t listSize = 500;
constexpr size_t countSize = 4; ///< three digits
constexpr int several = 2;

// A notification, its ticker and its launch request, until they are posted. Posting keeps none of
// the handles.
struct Announcement {
    notification_h noti = notification_create(NOTIFICATION_TYPE_NOTI);
    notification_h ticker = notification_create(NOTIFICATION_TYPE_NOTI);
    app_control_h request = nullptr;

    Announcement() = default;
    Announcement(const Announcement &) = delete;
    Announcement &operator=(const Announcement &) = delete;
    ~Announcement()
    {
        if (request && app_control_destroy(request) != APP_CONTROL_ERROR_NONE)
            LOG_ERROR("Fail to service_destroy");
        if (noti)
            notification_free(noti);
        if (ticker)
            notification_free(ticker);
    }
};

bool _failed(int err, const char *text)
{
    if (err == NOTIFICATION_ERROR_NONE)
        return false;
    LOG_ERROR("%s[%d]", text, err);
    return true;
}

bool _prepare(const Announcement &a)
{
    if (!a.noti || !a.ticker) {
        LOG_ERROR("fail to create notification box");
        return false;
    }
    if (_failed(notification_set_display_applist(a.noti, displayEverywhere),
                "fail to set notification display applist ") ||
        _failed(notification_set_display_applist(a.ticker, NOTIFICATION_DISPLAY_APP_TICKER),
                "fail to set notification display applist "))
        return false;
    LOG_DEBUG(">>>>>>>>>>>>> noti create success <<<<<<<<<<<<<<<<");
    return true;
}

bool _setLayouts(const Announcement &a)
{
    return !_failed(notification_set_layout(a.noti, NOTIFICATION_LY_NOTI_EVENT_MULTIPLE),
                    "fail to set notification layout ") &&
           !_failed(notification_set_layout(a.ticker, NOTIFICATION_LY_NOTI_EVENT_MULTIPLE),
                    "fail to set notification layout ");
}

bool _setPicture(notification_h noti, notification_image_type_e type, const char *path)
{
    return !_failed(notification_set_image(noti, type, path), "fail to set notification box icon ");
}

std::string _applicationIcon()
{
    const CText directory(app_get_shared_resource_path());
    return std::string(directory ? directory.get() : "") + "/com.velmora.pelliko.png";
}

// The ticker's looks and sound, and the time of the notification.
bool _setSurroundings(const Announcement &a)
{
    return !_failed(notification_set_image(a.ticker, NOTIFICATION_IMAGE_TYPE_ICON_FOR_INDICATOR,
                                           indicatorPicture),
                    "fail to set notification box icon for indicator") &&
           !_failed(notification_set_sound(a.ticker, NOTIFICATION_SOUND_TYPE_DEFAULT, nullptr),
                    "fail to set notification sound for indicator") &&
           !_failed(notification_set_time(a.noti, time(nullptr)),
                    "fail to set notification time for indicator");
}

bool _createRequest(Announcement &a, const char *app_id, const char *operation)
{
    if (app_control_create(&a.request) != APP_CONTROL_ERROR_NONE) {
        LOG_ERROR("app_control_create failed!");
        return false;
    }
    if (!a.request) {
        LOG_ERROR("app_control_handle is NULL!");
        return false;
    }
    app_control_set_app_id(a.request, app_id);
    app_control_set_operation(a.request, operation);
    return true;
}

bool _addExtra(const Announcement &a, const char *key, const char *value)
{
    const int err = app_control_add_extra_data(a.request, key, value);
    if (err != APP_CONTROL_ERROR_NONE)
        LOG_ERROR("app_control_add_extra_data_array fail, noti_err = %d", err);
    return err == APP_CONTROL_ERROR_NONE;
}

// The push handling may still be at the name: it gets a second.
void _resolveSenderName(PellikoAppData *ad)
{
    if (!ad->sender_name)
        sleep(1);
    if (ad->sender_name)
        return;
    ad->sender_name_fallback = ad->sender_msisdn;
    char *name = getContactName(ad->sender_msisdn);
    ad->sender_name = g_strdup(name ? name : ad->sender_name_fallback);
    g_free(name);
}

// An empty text is not set.
bool _setPlainText(notification_h noti, notification_text_type_e type, const char *text)
{
    return text[0] == '\0' || !_failed(notification_set_text(noti, type, text, nullptr,
                                                             NOTIFICATION_VARIABLE_TYPE_NONE),
                                       "fail to set notification text ");
}

bool _setTitles(const Announcement &a, const char *title, const char *title_id, const char *ticker)
{
    LOG_DEBUG("ticker_title = %s", ticker);
    if (title[0] != '\0' &&
        _failed(notification_set_text(a.noti, NOTIFICATION_TEXT_TYPE_TITLE, title, title_id,
                                      NOTIFICATION_VARIABLE_TYPE_NONE),
                "fail to set notification text "))
        return false;
    if (!_setPlainText(a.ticker, NOTIFICATION_TEXT_TYPE_TITLE, ticker))
        return false;
    LOG_DEBUG("title = %s", title);
    return true;
}

bool _setSingleTexts(const Announcement &a, const PellikoAppData *ad)
{
    char title[textSize];
    char ticker[textSize] = "";
    char content[textSize];
    copyText(title, sizeof(title), ad->sender_name);
    if (title[0] != '\0')
        formatTranslated(ticker, sizeof(ticker), translated(personSharedId), "sd", ad->sender_name,
                         ad->thumbnails_count);
    formatTranslated(content, sizeof(content), translated(sharedWithYouId), "d",
                     ad->thumbnails_count);
    return _setTitles(a, title, nullptr, ticker) &&
           !_failed(notification_set_text(a.noti, NOTIFICATION_TEXT_TYPE_CONTENT, content,
                                          sharedWithYouId, NOTIFICATION_VARIABLE_TYPE_INT,
                                          ad->thumbnails_count, NOTIFICATION_VARIABLE_TYPE_NONE),
                    "fail to set notification text ");
}

bool _setSeveralTitles(const Announcement &a, const PellikoAppData *ad)
{
    char ticker[textSize];
    if (ad->token_length >= several) {
        char title[textSize];
        copyText(title, sizeof(title), translated(newSharesId));
        formatTranslated(ticker, sizeof(ticker), translated(sharesReceivedId), "d",
                         ad->token_length);
        return _setTitles(a, title, newSharesId, ticker);
    }
    char title[textSize];
    copyText(title, sizeof(title), ad->sender_name);
    formatTranslated(ticker, sizeof(ticker), translated(personSharedId), "sd", title,
                     ad->token_length);
    return _setTitles(a, title, nullptr, ticker);
}

bool _setSeveralContent(const Announcement &a, const PellikoAppData *ad)
{
    char content[listSize];
    if (ad->token_length >= several) {
        char list[listSize];
        listSenderNames(list, sizeof(list));
        formatTranslated(content, sizeof(content), translated("%s"), "s", list);
    } else {
        formatTranslated(content, sizeof(content), translated(sharedFilesId), "d",
                         ad->thumbnails_count);
    }
    char count[countSize];
    g_snprintf(count, sizeof(count), "%d", ad->token_length);
    return !_failed(notification_set_text(a.noti, NOTIFICATION_TEXT_TYPE_CONTENT, content, nullptr,
                                          NOTIFICATION_VARIABLE_TYPE_NONE),
                    "fail to set notification text ") &&
           _setPlainText(a.noti, NOTIFICATION_TEXT_TYPE_EVENT_COUNT, count);
}

bool _attachRequest(const Announcement &a)
{
    if (_failed(notification_set_launch_option(a.noti, NOTIFICATION_LAUNCH_OPTION_APP_CONTROL,
                                               a.request),
                "fail to set notification launch option "))
        return false;
    LOG_DEBUG("$$$$$$$$$$$$$ before noti_id created, noti = %p", static_cast<void *>(a.noti));
    return true;
}

bool _postTagged(notification_h noti, const char *tag)
{
    int err = notification_set_tag(noti, tag);
    if (err != NOTIFICATION_ERROR_NONE) {
        LOG_ERROR("notification_set_tag fail, noti_err = %d", err);
        return false;
    }
    err = notification_post(noti);
    if (err != NOTIFICATION_ERROR_NONE)
        LOG_ERROR("notification_post fail, noti_err = %d", err);
    return err == NOTIFICATION_ERROR_NONE;
}

bool _post(const Announcement &a, const char *ticker_tag)
{
    return _postTagged(a.noti, pushNotificationTag) && _postTagged(a.ticker, ticker_tag);
}

bool _announceSingle(PellikoAppData *ad)
{
    Announcement a;
    const char *picture = ad->sender_image_path ? ad->sender_image_path : defaultCallerPicture;
    if (!_prepare(a) || !_setPicture(a.noti, NOTIFICATION_IMAGE_TYPE_ICON, picture) ||
        !_setPicture(a.noti, NOTIFICATION_IMAGE_TYPE_ICON_SUB, _applicationIcon().c_str()) ||
        !_setSurroundings(a) || !_createRequest(a, viewerId, APP_CONTROL_OPERATION_LAUNCH_VIEWER) ||
        !_addExtra(a, "contents_token",
                   ad->contents_token_list ? ad->contents_token_list[0] : nullptr) ||
        !_addExtra(a, "share_type", "single_share"))
        return false;
    _resolveSenderName(ad);
    return _setSingleTexts(a, ad) && _attachRequest(a) && _post(a, singleTickerTag);
}

bool _announceSeveral(PellikoAppData *ad)
{
    Announcement a;
    if (!_prepare(a) || !_setLayouts(a) ||
        !_setPicture(a.noti, NOTIFICATION_IMAGE_TYPE_ICON, _applicationIcon().c_str()) ||
        !_setSurroundings(a) || !_createRequest(a, historyId, APP_CONTROL_OPERATION_VIEW))
        return false;
    app_control_add_extra_data(a.request, "view_type", "received");
    _resolveSenderName(ad);
    if (!_setSeveralTitles(a, ad) || !_setSeveralContent(a, ad) ||
        !_addExtra(a, "remoteShare", "remoteview") || !_attachRequest(a) || !_post(a, tickerTag))
        return false;
    clearSenderNames();
    return true;
}

} // namespace

int addPushNotification(PellikoAppData *ad)
{
    RETURN_VALUE_IF_NULL(ad, -1, "appdata is NULL");
    if (ad->token_length == 1)
        return _addSingleSharedPushNotification(ad);
    return _announceSeveral(ad) ? 0 : -1;
}

int _addSingleSharedPushNotification(PellikoAppData *ad)
{
    RETURN_VALUE_IF_NULL(ad, -1, "appdata is NULL");
    return _announceSingle(ad) ? 0 : -1;
}

} // namespace pelliko
