/* What became of a message whose sender did not live to see it. Not a part of the handset's
 * interface: there the messages' own storage answers this. */
#ifndef PELLIKO_PLATFORM_MSG_FATE_H
#define PELLIKO_PLATFORM_MSG_FATE_H

#include <msg.h>

#ifdef __cplusplus
extern "C" {
#endif

typedef enum {
    MSG_FATE_UNKNOWN = 0,  /* it may have been sent, and may not */
    MSG_FATE_TAKEN = 1,    /* it was sent */
    MSG_FATE_NOT_TAKEN = 2 /* it surely was not: it may be sent again */
} msg_fate_e;

/**
 * For a message that a process was submitting with msg_sms_send_message when it ended. The message
 * must be told from all others by its number (UTF-8) and text together. Waits while another process
 * is writing the outbox. Any thread, needs no main loop.
 */
msg_fate_e msg_sms_fate(msg_handle_t handle, const char *number, const char *text);

#ifdef __cplusplus
}
#endif

#endif
