#include "pelliko_client.h"

#include "Arguments.h"
#include "ServiceProxy.h"
#include "StatusReports.h"

using namespace pelliko::client;

namespace
{
constexpr int invalidParameter = -22;

bool validRecipients(pelliko_recipient_s **recipients, int count)
{
    return recipients && count > 0;
}

// Hands the new id out and takes its reports; they arrive from the loop, so none can have been
// missed.
int accepted(int32_t id, pelliko_upload_status_cb callback, void *userData, int32_t *out)
{
    subscribe(id, callback, userData);
    *out = id;
    return PELLIKO_ERROR_NONE;
}
} // namespace

int pelliko_request_upload(const pelliko_upload_options_s *options,
                           pelliko_recipient_s **recipients, int recipient_count, char **file_paths,
                           int file_count, int wifi_only, pelliko_upload_status_cb callback,
                           void *user_data, int32_t *request_id)
{
    if (!options || !validRecipients(recipients, recipient_count) || !file_paths ||
        file_count <= 0 || !callback || !request_id) {
        return invalidParameter;
    }
    PellikoService1 *proxy = serviceProxy();
    if (!proxy) {
        return PELLIKO_ERROR_SERVICE_NOT_RUNNING;
    }
    g_auto(GStrv) paths = absolutePaths(file_paths, file_count);
    gint code = 0;
    gint id = 0;
    g_autoptr(GError) error = nullptr;
    if (!pelliko_service1_call_request_upload_sync(
            proxy, optionsVariant(*options), recipientsVariant(recipients, recipient_count), paths,
            wifi_only != 0, &code, &id, nullptr, &error)) {
        return codeOf(error);
    }
    return code != 0 ? code : accepted(id, callback, user_data, request_id);
}

int pelliko_request_reshare_upload(const pelliko_upload_options_s *options,
                                   pelliko_recipient_s **recipients, int recipient_count,
                                   int wifi_only, pelliko_upload_status_cb callback,
                                   void *user_data, int32_t request_id, int32_t *new_request_id)
{
    if (!options || !validRecipients(recipients, recipient_count) || !callback || request_id <= 0 ||
        !new_request_id) {
        return invalidParameter;
    }
    PellikoService1 *proxy = serviceProxy();
    if (!proxy) {
        return PELLIKO_ERROR_SERVICE_NOT_RUNNING;
    }
    gint code = 0;
    gint id = 0;
    g_autoptr(GError) error = nullptr;
    if (!pelliko_service1_call_request_reshare_sync(
            proxy, optionsVariant(*options), recipientsVariant(recipients, recipient_count),
            request_id, wifi_only != 0, &code, &id, nullptr, &error)) {
        return codeOf(error);
    }
    return code != 0 ? code : accepted(id, callback, user_data, new_request_id);
}

int pelliko_cancel_upload(int32_t request_id)
{
    PellikoService1 *proxy = serviceProxy();
    if (!proxy) {
        return PELLIKO_ERROR_SERVICE_NOT_RUNNING;
    }
    gint code = 0;
    g_autoptr(GError) error = nullptr;
    if (!pelliko_service1_call_cancel_sync(proxy, request_id, &code, nullptr, &error)) {
        return codeOf(error);
    }
    return code;
}

int pelliko_resume_upload_by_reboot(int32_t request_id, pelliko_upload_status_cb callback,
                                    void *user_data)
{
    if (request_id <= 0 || !callback) {
        return invalidParameter;
    }
    PellikoService1 *proxy = serviceProxy();
    if (!proxy) {
        return PELLIKO_ERROR_SERVICE_NOT_RUNNING;
    }
    gint code = 0;
    g_autoptr(GError) error = nullptr;
    if (!pelliko_service1_call_resume_sync(proxy, request_id, &code, nullptr, &error)) {
        return codeOf(error);
    }
    if (code == 0) {
        subscribe(request_id, callback, user_data);
    }
    return code;
}
