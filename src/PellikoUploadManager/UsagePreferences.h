#pragma once

// The writers and watchers of the values that the application keeps across runs: what was shared
// today, that the messages were sent, and the status that is handed to the uploading-status popup.
// Errors are logged and the work goes on. Main loop only, but for updatePreference.

namespace pelliko
{

/// Real number: start of the current 24-hour counting period (periodSeconds), 0.0: none runs.
constexpr const char *shareTimeLastKey = "remote-share-settings-share_time_last";
/// Integer: bytes shared in the current period.
constexpr const char *shareTotalSizeKey = "remote-share-settings-share_total_size";
/// Integer: set to 1 when the messages are sent; every set is an event, also of the same value.
constexpr const char *shareSmsDoneKey = "remote-share-settings-share_sms_done";
/// Text: "status+percent+error" of the last report for the uploading-status popup.
constexpr const char *updatePopupDataKey = "remote-share-settings-update-popup-data";

/// Announces that the messages of a share are sent; the main loop then decides whether the
/// application may leave. Any thread.
void updatePreference();

/// Starts the counting period now.
void _updateTimestamp();

/// Adds the total size of g_current_node to the bytes of the period; the sum wraps at 32 bits.
void _updateUploadedData();

/// Tells whose reports are handed over from here on. Reports about the end of an upload are handed
/// over whichever upload it is, and the status popup must not take another's for its own.
void notePopupDataRequest(int request_id);

/// Hands a status to the uploading-status popup through the preference store.
/// @param status PellikoUploadStatus
/// @param progress_percent 0 to 100
void _updatePopupPreference(int status, double progress_percent, int error_code);

/// Called on the main loop for every set of updatePopupDataKey: updates the status popup when the
/// text is about its upload.
void _popupDataPreferenceUpdatedCb(const char *key, void *user_data);

/// Called on the main loop for every set of shareSmsDoneKey: the first of "upload ended" and
/// "messages sent" is remembered in the node, the second lets the application go.
void _preferenceUpdatedCb(const char *key, void *user_data);

} // namespace pelliko
