#include "Launches.h"

#include <app_control.h>
#include <pelliko_operations.h>

namespace pelliko::history
{
namespace
{

constexpr const char *picker = "com.velmora.pelliko-picker";
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
    int send() const { return app_control_send_launch_request(handle_, nullptr, nullptr); }

private:
    app_control_h handle_ = nullptr;
};

} // namespace

int shareAgain(int32_t requestId)
{
    const Request request(picker, APP_CONTROL_OPERATION_SHARE);
    request.add("pk_reshare", std::to_string(requestId));
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
