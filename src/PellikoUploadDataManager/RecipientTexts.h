// The two texts that describe the recipients of a share: who they are and their contact number ids.
// One pair of buffers serves the new upload and the extra data of its notifications. Main loop
// only.
#pragma once

namespace pelliko
{

class PellikoAppData;

/// Display names, each with "+SMS" for a recipient told by SMS and "?" after it. Never null.
const char *getRecipientListText();

/// Contact number ids in decimal, each followed by "?". Never null.
const char *getRecipientIndexListText();

/// Overwrites both texts with copies, cut between characters to recipientListSize and
/// recipientIndexSize bytes; null counts as empty.
void setRecipientTexts(const char *recipient_list, const char *recipient_index_list);

/// Fills both texts from the share in hand (`ad->upload_item`); empty without one.
void _populateExtraData(PellikoAppData *ad);

} // namespace pelliko
