#include <gtest/gtest.h>

#include "MessageBuilder.h"

namespace
{

struct Numbers {
    int value;
    int number;
};

TEST(MessageStructure, KeepsTheNumbersThatTheServiceReceives)
{
    const Numbers table[] = {
        {MSG_STRUCT_MESSAGE_INFO, 512},
        {MSG_MESSAGE_TYPE_INT, 516},
        {MSG_MESSAGE_ENCODE_TYPE_INT, 524},
        {MSG_MESSAGE_SMS_DATA_STR, 535},
        {MSG_MESSAGE_ADDR_LIST_STRUCT, 537},
        {MSG_MESSAGE_SIM_INDEX_INT, 539},
        {MSG_ADDRESS_INFO_ADDRESS_TYPE_INT, 16385},
        {MSG_ADDRESS_INFO_RECIPIENT_TYPE_INT, 16386},
        {MSG_ADDRESS_INFO_ADDRESS_VALUE_STR, 16388},
        {MSG_STRUCT_SENDOPT, 16640},
        {MSG_SEND_OPT_SETTING_BOOL, 16641},
        {MSG_STRUCT_REQUEST_INFO, 17664},
        {MSG_REQUEST_MESSAGE_HND, 17666},
        {MSG_REQUEST_SENDOPT_HND, 17667},
        {MSG_TYPE_SMS_OUTGOING, 68},
        {MSG_ENCODE_AUTO, 3},
    };
    for (const auto &row : table)
        EXPECT_EQ(row.value, row.number);
}

TEST(MessageStructure, UnknownTypeGivesNothing)
{
    EXPECT_EQ(msg_create_struct(0), nullptr);
    EXPECT_EQ(msg_create_struct(MSG_MESSAGE_TYPE_INT), nullptr);
}

TEST(MessageStructure, RefusesUnknownFieldsAndWrongKinds)
{
    msg_struct_t message = msg_create_struct(MSG_STRUCT_MESSAGE_INFO);
    msg_struct_t part = nullptr;
    EXPECT_NE(msg_set_int_value(message, 1, 1), 0);
    EXPECT_NE(msg_set_int_value(message, MSG_ADDRESS_INFO_ADDRESS_TYPE_INT, 1), 0);
    EXPECT_NE(msg_set_int_value(message, MSG_MESSAGE_SMS_DATA_STR, 1), 0);
    EXPECT_NE(msg_set_bool_value(message, MSG_MESSAGE_TYPE_INT, true), 0);
    EXPECT_NE(setText(message, MSG_MESSAGE_TYPE_INT, "68"), 0);
    EXPECT_NE(msg_get_struct_handle(message, MSG_MESSAGE_ADDR_LIST_STRUCT, &part), 0);
    EXPECT_NE(msg_list_add_item(message, MSG_MESSAGE_TYPE_INT, &part), 0);
    EXPECT_EQ(part, nullptr);
    EXPECT_EQ(msg_set_int_value(message, MSG_MESSAGE_TYPE_INT, MSG_TYPE_SMS_OUTGOING), 0);
    EXPECT_EQ(msg_release_struct(&message), 0);
}

TEST(MessageStructure, RefusesNullArguments)
{
    msg_struct_t message = msg_create_struct(MSG_STRUCT_MESSAGE_INFO);
    msg_struct_t nothing = nullptr;
    char text[] = "x";
    EXPECT_NE(msg_set_int_value(nullptr, MSG_MESSAGE_TYPE_INT, 1), 0);
    EXPECT_NE(msg_set_bool_value(nullptr, MSG_SEND_OPT_SETTING_BOOL, true), 0);
    EXPECT_NE(msg_set_str_value(nullptr, MSG_MESSAGE_SMS_DATA_STR, text, 1), 0);
    EXPECT_NE(msg_set_str_value(message, MSG_MESSAGE_SMS_DATA_STR, nullptr, 1), 0);
    EXPECT_NE(msg_set_str_value(message, MSG_MESSAGE_SMS_DATA_STR, text, -1), 0);
    EXPECT_NE(msg_list_add_item(message, MSG_MESSAGE_ADDR_LIST_STRUCT, nullptr), 0);
    EXPECT_NE(msg_get_struct_handle(nullptr, MSG_REQUEST_SENDOPT_HND, &nothing), 0);
    EXPECT_NE(msg_set_struct_handle(message, MSG_REQUEST_MESSAGE_HND, nullptr), 0);
    EXPECT_NE(msg_release_struct(nullptr), 0);
    EXPECT_NE(msg_release_struct(&nothing), 0);
    EXPECT_NE(msg_close_msg_handle(nullptr), 0);
    EXPECT_NE(msg_open_msg_handle(nullptr), 0);
    EXPECT_NE(msg_sms_send_message(nullptr, message), 0);
    EXPECT_EQ(msg_release_struct(&message), 0);
}

TEST(MessageStructure, ReleasingAndClosingNullTheHandle)
{
    msg_struct_t message = msg_create_struct(MSG_STRUCT_MESSAGE_INFO);
    EXPECT_EQ(msg_release_struct(&message), 0);
    EXPECT_EQ(message, nullptr);
    msg_handle_t handle = nullptr;
    ASSERT_EQ(msg_open_msg_handle(&handle), 0);
    EXPECT_NE(handle, nullptr);
    EXPECT_EQ(msg_close_msg_handle(&handle), 0);
    EXPECT_EQ(handle, nullptr);
}

TEST(MessageStructure, BorrowedPartsCannotBeReleased)
{
    msg_struct_t message = msg_create_struct(MSG_STRUCT_MESSAGE_INFO);
    msg_struct_t item = nullptr;
    ASSERT_EQ(msg_list_add_item(message, MSG_MESSAGE_ADDR_LIST_STRUCT, &item), 0);
    msg_struct_t borrowed = item;
    EXPECT_NE(msg_release_struct(&borrowed), 0);
    EXPECT_EQ(setText(item, MSG_ADDRESS_INFO_ADDRESS_VALUE_STR, "+491"), 0);
    EXPECT_EQ(msg_release_struct(&message), 0);
}

TEST(MessageStructure, SendOptionsAreTheRequestsOwn)
{
    msg_struct_t request = msg_create_struct(MSG_STRUCT_REQUEST_INFO);
    msg_struct_t first = nullptr;
    msg_struct_t second = nullptr;
    EXPECT_EQ(msg_get_struct_handle(request, MSG_REQUEST_SENDOPT_HND, &first), 0);
    EXPECT_EQ(msg_get_struct_handle(request, MSG_REQUEST_SENDOPT_HND, &second), 0);
    EXPECT_EQ(first, second);
    EXPECT_EQ(msg_set_bool_value(first, MSG_SEND_OPT_SETTING_BOOL, false), 0);
    EXPECT_EQ(msg_release_struct(&request), 0);
}

} // namespace
