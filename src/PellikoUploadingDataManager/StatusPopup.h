// The popup that follows the upload whose notification was tapped (g_noti_press_data). It is built
// on the confirmation popup's frame. Main loop only.
#pragma once

#include <Evas.h>

namespace pelliko
{

class PellikoAppData;

/// The theme's group for the tapped upload, or null when its state is none that can be shown.
const char *statusPopupGroup();

/// Fills the content layout, which must be in `ad->popup_layout`, and puts the OK button into
/// `ad->popup`. `leave` is what OK does; it gets the record.
void addStatusContents(PellikoAppData *ad, Evas_Smart_Cb leave);

/// Whether the open popup, if any, is a status popup: the operation in hand may be another by now.
bool isStatusPopup(const PellikoAppData *ad);

/// Brings the open status popup up to date with a report about its upload.
/// @param status PellikoUploadStatus
/// @param progress_percent 0 to 100
/// @param error_code 0: none
void updatePopupStatus(int status, double progress_percent, int error_code);

/// Writes every text of the open status popup anew, in the current language.
void setStatusTexts(PellikoAppData *ad);

/// "clicked" of the cancel button: takes the tapped upload back. `data` is the record.
void cancelUploadCb(void *data, Evas_Object *button, void *event_info);

} // namespace pelliko
