#pragma once

#include <notification.h>
#include <string>

// The steps that the upload notifications are put together from. Each returns 0 or a negative
// notification error and logs what failed. Main loop only.

namespace pelliko
{

constexpr const char *panelIcon =
    "/usr/apps/com.velmora.quickpanel/shared/res/noti_icons/Common/noti_upload_complete.png";
constexpr const char *indicatorIcon =
    "/usr/apps/com.velmora.indicator/res/icons/Processing/b03_processing_upload_complete.png";
constexpr const char *animatedPanelIcon = "reserved://quickpanel/ani/uploading";
constexpr const char *animatedIndicatorIcon = "reserved://indicator/ani/uploading";

constexpr int displayTray = NOTIFICATION_DISPLAY_APP_NOTIFICATION_TRAY;
constexpr int displayTrayAndIndicator =
    NOTIFICATION_DISPLAY_APP_NOTIFICATION_TRAY | NOTIFICATION_DISPLAY_APP_INDICATOR;

int setLayout(notification_h notification, notification_ly_type_e layout);
int setImages(notification_h notification, const char *panel, const char *indicator);
int setDisplay(notification_h notification, int display_list);

/// Shows the translation of a message id.
int setText(notification_h notification, notification_text_type_e type, const char *id);

/// Shows `shown`, which was made from a message id and a count.
int setCountText(notification_h notification, notification_text_type_e type, const char *shown,
                 const char *id, int count);

/// What to do about figures that an earlier request may have left.
enum class OldFigures { none, remove };

/// What to do when no launch request can be made.
enum class WithoutRequest { go_on, give_up };

/// Gives the notification its launch request with the figures of `state_code`; false when none
/// could be made and the notification is to be given up.
bool attachLaunchRequest(notification_h notification, int state_code, OldFigures old_figures,
                         WithoutRequest without_request, const char *failure_text);

/// Posts a short status-bar notification and forgets it. `id` may be null: then the text is not
/// translated again.
/// @return true when it was posted
bool postTicker(notification_ly_type_e layout, const char *shown, const char *id);

/// The title of a handle, empty when it has none; an error is logged and gives false.
bool readTitle(notification_h notification, std::string &title);

/// Whether a title begins with the translation of a message id.
bool titleIs(const std::string &title, const char *id);

} // namespace pelliko
