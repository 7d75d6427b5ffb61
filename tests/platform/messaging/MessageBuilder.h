// Builds requests the way an application does, field by field.
#pragma once

#include <string>

#include <msg.h>
#include <msg_transport.h>

inline int setText(msg_struct_t target, int field, std::string text)
{
    return msg_set_str_value(target, field, text.data(), static_cast<int>(text.size()));
}

inline msg_struct_t makeMessage(const std::string &to, const std::string &text, int sim)
{
    msg_struct_t message = msg_create_struct(MSG_STRUCT_MESSAGE_INFO);
    msg_set_int_value(message, MSG_MESSAGE_TYPE_INT, MSG_TYPE_SMS_OUTGOING);
    msg_set_int_value(message, MSG_MESSAGE_ENCODE_TYPE_INT, MSG_ENCODE_AUTO);
    msg_set_int_value(message, MSG_MESSAGE_SIM_INDEX_INT, sim);
    setText(message, MSG_MESSAGE_SMS_DATA_STR, text);
    msg_struct_t item = nullptr;
    msg_list_add_item(message, MSG_MESSAGE_ADDR_LIST_STRUCT, &item);
    msg_set_int_value(item, MSG_ADDRESS_INFO_ADDRESS_TYPE_INT, MSG_ADDRESS_TYPE_PLMN);
    msg_set_int_value(item, MSG_ADDRESS_INFO_RECIPIENT_TYPE_INT, MSG_RECIPIENTS_TYPE_TO);
    setText(item, MSG_ADDRESS_INFO_ADDRESS_VALUE_STR, to);
    return message;
}

inline msg_struct_t makeRequest(msg_struct_t message)
{
    msg_struct_t request = msg_create_struct(MSG_STRUCT_REQUEST_INFO);
    msg_struct_t options = nullptr;
    msg_get_struct_handle(request, MSG_REQUEST_SENDOPT_HND, &options);
    msg_set_bool_value(options, MSG_SEND_OPT_SETTING_BOOL, false);
    msg_set_struct_handle(request, MSG_REQUEST_MESSAGE_HND, message);
    return request;
}

inline int sendOne(msg_handle_t handle, const std::string &to, const std::string &text, int sim)
{
    msg_struct_t message = makeMessage(to, text, sim);
    msg_struct_t request = makeRequest(message);
    const int result = msg_sms_send_message(handle, request);
    msg_release_struct(&request);
    msg_release_struct(&message);
    return result;
}
