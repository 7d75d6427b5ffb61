#include "PellikoNotificationManager/SenderNames.h"

#include "AppLog/AppLog.h"
#include "PellikoApp/TextFormat.h"

#include <cstring>
#include <glib.h>

namespace pelliko
{

char *g_sender_info[senderSlots] = {};

void addSenderName(const char *name)
{
    if (!name || g_sender_info[senderSlots - 1])
        return;
    const size_t length = strlen(name);
    for (char *&slot : g_sender_info) {
        if (!slot) {
            slot = g_strdup(name);
            return;
        }
        if (strncmp(slot, name, length) == 0)
            return;
    }
}

void listSenderNames(char *buffer, size_t size)
{
    if (size == 0)
        return;
    buffer[0] = '\0';
    bool cut = false;
    for (size_t slot = senderSlots; slot-- > 0;) {
        const char *name = g_sender_info[slot];
        if (!name)
            continue;
        LOG_DEBUG("g_sender_info[%d] = %s", static_cast<int>(slot), name);
        if (buffer[0] != '\0')
            cut = g_strlcat(buffer, ", ", size) >= size || cut;
        cut = g_strlcat(buffer, name, size) >= size || cut;
    }
    if (cut)
        dropBrokenCharacter(buffer);
}

void clearSenderNames()
{
    for (char *&slot : g_sender_info) {
        if (!slot)
            return;
        g_free(slot);
        slot = nullptr;
    }
}

} // namespace pelliko
