#pragma once

#include <cstddef>

// The people of whom received shares are to be announced. The push handling fills the slots on the
// upload library's thread; the notification of several shares lists and empties them on the main
// loop, once the push is complete.

namespace pelliko
{

constexpr size_t senderSlots = 10;

/// Distinct display names, owned, filled from slot 0 upward; a null slot ends the table.
extern char *g_sender_info[senderSlots];

/// Puts a copy of a name into the first empty slot. It is left out when all slots are taken, or
/// when a name that is there already begins with it.
void addSenderName(const char *name);

/// Lists the names separated by ", ", the latest first, into a buffer of `size` bytes; a longer
/// list is cut between characters.
void listSenderNames(char *buffer, size_t size);

/// Forgets all names.
void clearSenderNames();

} // namespace pelliko
