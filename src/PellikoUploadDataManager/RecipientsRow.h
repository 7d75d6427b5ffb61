// The row of recipients in the confirmation popup. Main loop only.
#pragma once

namespace pelliko
{

class PellikoAppData;

/// Builds the row (round pictures with names, SMS badges) from the recipients of the share in hand
/// and puts it into `ad->popup_layout`, whose earlier row is deleted.
void addRecipientsFromUploadData(PellikoAppData *ad);

} // namespace pelliko
