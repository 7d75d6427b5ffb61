/*
 * Messages as trees of numbered fields. The numbers are what a messaging service receives.
 *
 * Every function may be called on any thread and needs no main loop; a structure is used by one
 * thread at a time. Functions return MSG_SUCCESS or a negative msg error; a null argument, a field
 * that the structure does not have and a value of the wrong kind are refused without changing
 * anything.
 */
#ifndef PELLIKO_PLATFORM_MSG_H
#define PELLIKO_PLATFORM_MSG_H

#include <tizen.h>

#ifdef __cplusplus
extern "C" {
#endif

typedef void *msg_handle_t;
typedef void *msg_struct_t;
typedef int msg_error_t;

#define MSG_SUCCESS 0
#define MSG_ERR_NULL_POINTER (-1)
#define MSG_ERR_INVALID_PARAMETER (-2)
#define MSG_ERR_UNKNOWN (-5)
#define MSG_ERR_TRANSPORT_ERROR (-9)

/* Structures and their fields. */
enum {
    MSG_STRUCT_MESSAGE_INFO = 512,
    MSG_MESSAGE_TYPE_INT = 516,
    MSG_MESSAGE_ENCODE_TYPE_INT = 524,
    MSG_MESSAGE_SMS_DATA_STR = 535,
    MSG_MESSAGE_ADDR_LIST_STRUCT = 537,
    MSG_MESSAGE_SIM_INDEX_INT = 539, /* SIM slot, 1-based */
    MSG_STRUCT_ADDRESS_INFO = 16384,
    MSG_ADDRESS_INFO_ADDRESS_TYPE_INT = 16385,
    MSG_ADDRESS_INFO_RECIPIENT_TYPE_INT = 16386,
    MSG_ADDRESS_INFO_ADDRESS_VALUE_STR = 16388,
    MSG_STRUCT_SENDOPT = 16640,
    MSG_SEND_OPT_SETTING_BOOL = 16641,
    MSG_STRUCT_REQUEST_INFO = 17664,
    MSG_REQUEST_MESSAGE_HND = 17666,
    MSG_REQUEST_SENDOPT_HND = 17667
};

/* Values of the fields. */
enum {
    MSG_TYPE_SMS_OUTGOING = 68,
    MSG_ENCODE_AUTO = 3,
    MSG_ADDRESS_TYPE_PLMN = 1,
    MSG_RECIPIENTS_TYPE_TO = 1
};

/** Opens the messaging service; close the handle with msg_close_msg_handle. */
msg_error_t msg_open_msg_handle(msg_handle_t *handle);
/** Takes the address of the handle and sets it to NULL. */
int msg_close_msg_handle(msg_handle_t *handle);

/** An empty structure that the caller releases once with msg_release_struct; NULL for an unknown
 * type. */
msg_struct_t msg_create_struct(int struct_type);
/** Takes the address of an owned structure and sets it to NULL; borrowed structures are refused. */
int msg_release_struct(msg_struct_t *msg_struct);

int msg_set_int_value(msg_struct_t msg_struct, int field, int value);
/** Copies size bytes, up to a terminator that comes earlier. */
int msg_set_str_value(msg_struct_t msg_struct, int field, char *value, int size);
int msg_set_bool_value(msg_struct_t msg_struct, int field, bool value);
/** *value is borrowed: it belongs to msg_struct, and writing to it changes msg_struct. */
int msg_get_struct_handle(msg_struct_t msg_struct, int field, msg_struct_t *value);
/** Copies the contents of value, which stays the caller's. */
int msg_set_struct_handle(msg_struct_t msg_struct, int field, msg_struct_t value);
/** Adds an empty item to a list field; *item is borrowed and dies with msg_struct. */
int msg_list_add_item(msg_struct_t msg_struct, int field, msg_struct_t *item);

#ifdef __cplusplus
}
#endif

#endif
