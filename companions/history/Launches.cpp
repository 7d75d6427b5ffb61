#include "Launches.h"

#include <app_control.h>
#include <pelliko_operations.h>

namespace pelliko::history
{
namespace
{

constexpr const char *application = "com.velmora.pelliko";
constexpr const char *viewer = "com.velmora.pelliko-viewer";

class Request
{
public:
    Request(const char *receiver, const char *operation)
    {
        app_control_create(&handle_);
        app_control_set_app_id(handle_, receiver);
        app_control_set_operation(handle_, operation);
    }
    ~Request() { app_control_destroy(handle_); }
    Request(const Request &) = delete;
    Request &operator=(const Request &) = delete;

    void add(const char *key, const std::string &value) const
    {
        app_control_add_extra_data(handle_, key, value.c_str());
    }
    void add(const char *key, std::vector<const char *> values) const
    {
        app_control_add_extra_data_array(handle_, key, values.data(),
                                         static_cast<int>(values.size()));
    }
    int send() const { return app_control_send_launch_request(handle_, nullptr, nullptr); }

private:
    app_control_h handle_ = nullptr;
};

} // namespace

int shareAgain(int32_t requestId, const std::vector<int32_t> &numberIds)
{
    std::vector<std::string> texts;
    for (size_t i = 0; i < numberIds.size() && i < mostRecipients; ++i)
        texts.push_back(std::to_string(numberIds[i]));
    std::vector<const char *> pointers;
    pointers.reserve(texts.size());
    for (const std::string &text : texts)
        pointers.push_back(text.c_str());

    const Request request(application, APP_CONTROL_OPERATION_SHARE);
    request.add("pk_reshare", std::to_string(requestId));
    request.add(APP_CONTROL_DATA_TO, std::move(pointers));
    // Names the application whose view of contacts the people were picked in. The usage statistics
    // tell people from contacts and recent ones by it, and these are from contacts.
    request.add("ct_app_id", application);
    return request.send();
}

int openViewer(const std::string &contentsToken)
{
    const Request request(viewer, APP_CONTROL_OPERATION_LAUNCH_VIEWER);
    request.add("contents_token", contentsToken);
    request.add("share_type", "single_share");
    return request.send();
}

} // namespace pelliko::history
