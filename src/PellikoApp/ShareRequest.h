#pragma once

#include "PellikoApp/AppData.h"

#include <cstdint>

// From the data of a launch request to the share in hand (ad->upload_item), the recipients' number
// ids and the ids to resume. Main loop only. What cannot be shared ends the application by its exit
// rule after a toast.

namespace pelliko
{

/// Makes a new share (the old one is freed) of one file, given as "file:///path" or as a path.
/// 0, or -1 when nothing can be shared.
int _parseSingleDataPath(const char *uri, PellikoAppData *ad, app_control_h request);

/// Appends the file of a "file:///path" text to the share in hand, whatever its type.
void _parseFileUri(PellikoAppData *ad, app_control_h request, const char *uri);

/// Fills the share in hand (made if there is none) from the request's array of paths; 0 or -1. A
/// request without paths leaves the share as it is and gives 0.
int _parseMultipleDataPath(app_control_h request, PellikoAppData *ad);

/// Size in bytes, 0 for a missing file, -1 for a null path.
int64_t _getFileSize(const char *path);

/// Saves the request's text as a memo file; its path for g_free, or null when there is no text.
char *_createTextUri(app_control_h request, PellikoAppData *ad);

/// Reads the contact number ids of the recipients; without them the earlier ones stay.
void _parseDataTo(PellikoAppData *ad, app_control_h request);

/// Reads the request ids that are to be resumed.
void _parseUploadResume(PellikoAppData *ad, app_control_h request);

} // namespace pelliko
