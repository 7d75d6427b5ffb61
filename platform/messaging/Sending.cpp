// The messaging handle and the sending of a request.
#include <cstdio>
#include <exception>
#include <memory>

#include "ModemTransport.h"
#include "OutboxTransport.h"
#include "Structure.h"
#include "msg.h"
#include "msg_fate.h"
#include "msg_transport.h"

using namespace pelliko::messaging;

namespace
{

struct Service {
    std::unique_ptr<SmsTransport> transport;
};

int deliver(SmsTransport &transport, const Structure &message)
{
    const std::string *text = message.text(MSG_MESSAGE_SMS_DATA_STR);
    const int *sim = message.intValue(MSG_MESSAGE_SIM_INDEX_INT);
    const auto addresses = message.items(MSG_MESSAGE_ADDR_LIST_STRUCT);
    if (!text || addresses.empty())
        return MSG_ERR_INVALID_PARAMETER;
    for (const Structure *address : addresses) {
        const std::string *number = address->text(MSG_ADDRESS_INFO_ADDRESS_VALUE_STR);
        if (!number || number->empty())
            return MSG_ERR_INVALID_PARAMETER;
    }
    for (const Structure *address : addresses) {
        const std::string *number = address->text(MSG_ADDRESS_INFO_ADDRESS_VALUE_STR);
        const std::string error = transport.send({*number, *text, sim ? *sim : 1});
        if (!error.empty()) {
            std::fprintf(stderr, "messaging: %s\n", error.c_str());
            return MSG_ERR_TRANSPORT_ERROR;
        }
    }
    return MSG_SUCCESS;
}

int deliverRequest(const Service &service, const Structure &request)
{
    const Structure *message = request.partIfSet(MSG_REQUEST_MESSAGE_HND);
    return message ? deliver(*service.transport, *message) : MSG_ERR_INVALID_PARAMETER;
}

msg_fate_e answerOf(Fate fate)
{
    switch (fate) {
    case Fate::Taken:
        return MSG_FATE_TAKEN;
    case Fate::NotTaken:
        return MSG_FATE_NOT_TAKEN;
    case Fate::Unknown:
        break;
    }
    return MSG_FATE_UNKNOWN;
}

} // namespace

extern "C" {

msg_error_t msg_open_msg_handle(msg_handle_t *handle)
{
    if (!handle)
        return MSG_ERR_NULL_POINTER;
    try {
        auto outbox = std::make_unique<OutboxTransport>(OutboxTransport::defaultPath());
        *handle = new Service{std::make_unique<ModemTransport>(std::move(outbox))};
        return MSG_SUCCESS;
    } catch (const std::exception &error) {
        std::fprintf(stderr, "messaging: cannot open the outbox: %s\n", error.what());
        return MSG_ERR_UNKNOWN;
    }
}

int msg_close_msg_handle(msg_handle_t *handle)
{
    if (!handle || !*handle)
        return MSG_ERR_NULL_POINTER;
    delete static_cast<Service *>(*handle);
    *handle = nullptr;
    return MSG_SUCCESS;
}

int msg_sms_send_message(msg_handle_t handle, msg_struct_t request)
{
    if (!handle || !request)
        return MSG_ERR_NULL_POINTER;
    try {
        return deliverRequest(*static_cast<Service *>(handle), *static_cast<Structure *>(request));
    } catch (const std::exception &error) {
        std::fprintf(stderr, "messaging: %s\n", error.what());
        return MSG_ERR_UNKNOWN;
    }
}

msg_fate_e msg_sms_fate(msg_handle_t handle, const char *number, const char *text)
{
    if (!handle || !number || !text)
        return MSG_FATE_UNKNOWN;
    try {
        return answerOf(static_cast<Service *>(handle)->transport->fateOf({number, text, 1}));
    } catch (const std::exception &error) {
        std::fprintf(stderr, "messaging: %s\n", error.what());
        return MSG_FATE_UNKNOWN;
    }
}
}
