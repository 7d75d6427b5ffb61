/* Sending of messages. */
#ifndef PELLIKO_PLATFORM_MSG_TRANSPORT_H
#define PELLIKO_PLATFORM_MSG_TRANSPORT_H

#include <msg.h>

#ifdef __cplusplus
extern "C" {
#endif

/**
 * Submits the message of a request to each of its addresses and blocks until the transport has
 * taken it for good. The text must have been set but may be empty; every address needs a number.
 * MSG_SUCCESS, MSG_ERR_INVALID_PARAMETER for an incomplete request, or MSG_ERR_TRANSPORT_ERROR when
 * the transport failed; the request may then be sent again.
 */
int msg_sms_send_message(msg_handle_t handle, msg_struct_t request);

#ifdef __cplusplus
}
#endif

#endif
