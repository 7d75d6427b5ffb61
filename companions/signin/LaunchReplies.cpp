#include "LaunchReplies.h"

#include <glib.h>
#include <kor_sim.h>

#include <cstdlib>
#include <cstring>
#include <memory>

namespace pelliko::signin
{
namespace
{

constexpr const char *operationAuth = "http://velmora.com/korrin/appcontrol/operation/auth";

// A lasting name that tells nothing of the secret it is made from.
std::string fingerprint(const std::string &secret, const std::string &purpose)
{
    g_autofree char *hex = g_compute_hmac_for_string(
        G_CHECKSUM_SHA256, reinterpret_cast<const guchar *>(secret.data()), secret.size(),
        purpose.data(), static_cast<gssize>(purpose.size()));
    return std::string(hex).substr(0, 32);
}

std::string machineSecret()
{
    g_autofree char *id = nullptr;
    gsize length = 0;
    if (g_file_get_contents("/etc/machine-id", &id, &length, nullptr) && length > 0)
        return {id, length};
    return g_get_host_name();
}

struct Reply {
    Reply() { app_control_create(&handle); }
    ~Reply() { app_control_destroy(handle); }
    Reply(const Reply &) = delete;
    Reply &operator=(const Reply &) = delete;
    void add(const char *key, const std::string &value) const
    {
        app_control_add_extra_data(handle, key, value.c_str());
    }
    app_control_h handle = nullptr;
};

} // namespace

LaunchReplies::~LaunchReplies()
{
    for (app_control_h request : requests_)
        app_control_destroy(request);
}

bool LaunchReplies::take(app_control_h request)
{
    char *operation = nullptr;
    app_control_get_operation(request, &operation);
    const std::unique_ptr<char, decltype(&free)> owned(operation, free);
    if (!operation || std::strcmp(operation, operationAuth) != 0)
        return false;
    app_control_h kept = nullptr;
    if (app_control_clone(&kept, request) == APP_CONTROL_ERROR_NONE)
        requests_.push_back(kept);
    return true;
}

void LaunchReplies::succeed(const korrin::Account &account)
{
    const Reply reply;
    reply.add("imsi", account.imsi.empty() ? korrin::composedImsi(account.number) : account.imsi);
    reply.add("accessToken", fingerprint(account.token, "access"));
    reply.add("duid", fingerprint(machineSecret(), "device"));
    reply.add("pushToken", fingerprint(account.token, "push"));
    reply.add("msisdn", account.number);
    answer(reply.handle, APP_CONTROL_RESULT_SUCCEEDED);
}

void LaunchReplies::fail(const std::string &code, const std::string &message)
{
    const Reply reply;
    reply.add("errorCode", code);
    reply.add("errorMessage", message);
    answer(reply.handle, APP_CONTROL_RESULT_FAILED);
}

void LaunchReplies::cancel()
{
    const Reply reply;
    answer(reply.handle, APP_CONTROL_RESULT_CANCELED);
}

void LaunchReplies::answer(app_control_h reply, app_control_result_e result)
{
    for (app_control_h request : requests_) {
        app_control_reply_to_launch_request(reply, request, result);
        app_control_destroy(request);
    }
    requests_.clear();
}

} // namespace pelliko::signin
