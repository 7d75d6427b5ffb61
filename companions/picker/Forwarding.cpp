#include "Forwarding.h"

#include <Requests.h>

#include <string>

namespace pelliko::picker
{

namespace
{

constexpr const char *application = "com.velmora.pelliko";
constexpr const char *pickedIn = "ct_app_id";

void addRecipients(app_control_h request, const std::vector<int32_t> &numberIds)
{
    std::vector<std::string> texts;
    std::vector<const char *> pointers;
    texts.reserve(numberIds.size());
    pointers.reserve(numberIds.size());
    for (const int32_t id : numberIds)
        pointers.push_back(texts.emplace_back(std::to_string(id)).c_str());
    app_control_add_extra_data_array(request, APP_CONTROL_DATA_TO, pointers.data(),
                                     static_cast<int>(pointers.size()));
}

} // namespace

int shareWith(app_control_h request, const std::vector<int32_t> &numberIds,
              app_control_delivered_cb taken, void *data)
{
    app_control_h forwarded = nullptr;
    if (const int failed = app_control_clone(&forwarded, request); failed != 0)
        return failed;
    app_control_set_app_id(forwarded, application);
    addRecipients(forwarded, numberIds);
    // Names the application whose view of contacts the people were picked in. The usage statistics
    // tell people from contacts and recent ones by it, and these are from contacts.
    if (companion::extraOf(forwarded, pickedIn).empty())
        app_control_add_extra_data(forwarded, pickedIn, application);
    // A request that is merely under way could be lost when the picker ends after its last window.
    const int result = app_control_send_for_delivery(forwarded, taken, data);
    app_control_destroy(forwarded);
    return result;
}

void answer(app_control_h request, app_control_result_e result)
{
    app_control_h reply = nullptr;
    app_control_create(&reply);
    app_control_reply_to_launch_request(reply, request, result);
    app_control_destroy(reply);
}

} // namespace pelliko::picker
