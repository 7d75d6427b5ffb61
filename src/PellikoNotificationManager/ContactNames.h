#pragma once

// What a sender is called in the user's contacts.

namespace pelliko
{

/// The display name of the first person with a name whose phone number contains `number`. The
/// picture of that person goes into the record's sender_image_path. A thread that calls this is
/// connected to the contacts store; only the push that is under way calls it, from one thread at a
/// time.
/// @return owned by the caller, for g_free; null when nobody has that number
char *getContactName(const char *number);

} // namespace pelliko
