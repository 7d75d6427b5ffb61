/* Sending of messages. */
#ifndef PELLIKO_PLATFORM_MSG_TRANSPORT_H
#define PELLIKO_PLATFORM_MSG_TRANSPORT_H

#include <msg.h>

#ifdef __cplusplus
extern "C" {
#endif

/**
 * Submits the message of a request to each of its addresses and blocks until the transport has
 * taken it for good. MSG_SUCCESS, MSG_ERR_INVALID_PARAMETER for a request without message, text or
 * number, or MSG_ERR_TRANSPORT_ERROR when the transport failed; it may then be sent again.
 */
int msg_sms_send_message(msg_handle_t handle, msg_struct_t request);

#ifdef __cplusplus
}
#endif

#endif
