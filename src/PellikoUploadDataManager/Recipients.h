#pragma once

#include "PellikoApp/AppData.h"

#include <cstdint>

// From the contact number ids of a share request to recipients. The contacts store is read
// synchronously; main loop only.

namespace pelliko
{

/// 1 once any share of this process had a recipient who is told by SMS; never cleared.
extern int g_has_sms_receiver;

/// Rebuilds ad->upload_item->recipient_list from the record's number ids, making the item if
/// needed.
void _createRecipientToUpload(PellikoAppData *ad);

/// The number without its formatting characters as a new text for g_free; null when it has none of
/// " ", "/", "-", "(", ")" and is good as it is, or when `src` is null (logged).
char *_makeNormalizedNumber(const char *src);

/// Sets *joined to 1 when the number belongs to a user of the sharing service, else leaves it.
void _getStatusByNumberId(int32_t number_id, uint8_t *joined);

} // namespace pelliko
