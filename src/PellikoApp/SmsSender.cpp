#include "PellikoApp/SmsSender.h"

#include "AppLog/AppLog.h"
#include "PellikoApp/Decimal.h"
#include "PellikoApp/OwedMessages.h"
#include "PellikoApp/TextFormat.h"
#include "PellikoUploadManager/UsagePreferences.h"
#include "PellikoVelmoraLog/PellikoVelmoraLog.h"

#include <cstdlib>
#include <cstring>
#include <ctime>
#include <glib.h>
#include <msg.h>
#include <msg_transport.h>

namespace pelliko
{

namespace
{

constexpr const char *textId =
    "IDS_RSH_BODY_FILES_HAVE_BEEN_SHARED_VIA_PELLIKO_C_NP1SS_HEXPIRES_C_P2SS_ABB";
constexpr const char *keyOfShare = "sms_key";
constexpr size_t textSize = 256; ///< bytes of a message with its terminator
constexpr size_t dateSize = 32;
constexpr size_t secondsDigits = 10; ///< what follows in expired_time are milliseconds

void _readText(app_control_h request, const char *key, char **field)
{
    char *value = nullptr;
    if (app_control_get_extra_data(request, key, &value) != APP_CONTROL_ERROR_NONE || !value)
        return;
    g_free(*field);
    *field = g_strdup(value);
    free(value);
}

void _readFileCount(app_control_h request, PellikoAppData *ad)
{
    char *value = nullptr;
    if (app_control_get_extra_data(request, "file_count", &value) != APP_CONTROL_ERROR_NONE ||
        !value)
        return;
    ad->file_count = decimalValue(value);
    free(value);
}

std::optional<std::string> _copy(const char *text)
{
    return text ? std::optional<std::string>(text) : std::nullopt;
}

void _formatDate(const std::optional<std::string> &expired_time, char (&date)[dateSize])
{
    LOG_DEBUG("expired_time=%s", textOrNull(expired_time ? expired_time->c_str() : nullptr));
    date[0] = '\0';
    if (!expired_time)
        return;
    const std::string digits = expired_time->substr(0, secondsDigits);
    const auto seconds = static_cast<time_t>(strtoll(digits.c_str(), nullptr, 10));
    struct tm local = {};
    if (localtime_r(&seconds, &local) == nullptr ||
        strftime(date, sizeof(date), "%Y/%m/%d", &local) == 0)
        date[0] = '\0';
}

void _buildText(const SmsJob &job, char (&text)[textSize])
{
    char date[dateSize];
    _formatDate(job.expired_time, date);
    text[0] = '\0';
    if (job.file_count < 1) {
        LOG_DEBUG("invalid file_count %d", job.file_count);
        return;
    }
    formatTranslated(text, sizeof(text), job.text_format.c_str(), "ss", job.url->c_str(), date);
}

void _setText(msg_struct_t structure, int field, const char *text)
{
    std::string copy(text); // the interface takes the text without const
    msg_set_str_value(structure, field, copy.data(), static_cast<int>(copy.size()));
}

void _fillMessage(msg_struct_t message, const char *number, const char *text, int32_t sim_index)
{
    msg_set_int_value(message, MSG_MESSAGE_TYPE_INT, MSG_TYPE_SMS_OUTGOING);
    msg_set_int_value(message, MSG_MESSAGE_ENCODE_TYPE_INT, MSG_ENCODE_AUTO);
    LOG_DEBUG("SIM index = %d", sim_index);
    const auto slot = static_cast<int32_t>(static_cast<uint32_t>(sim_index) + 1U);
    msg_set_int_value(message, MSG_MESSAGE_SIM_INDEX_INT, slot);
    _setText(message, MSG_MESSAGE_SMS_DATA_STR, text);

    msg_struct_t address = nullptr;
    msg_list_add_item(message, MSG_MESSAGE_ADDR_LIST_STRUCT, &address);
    msg_set_int_value(address, MSG_ADDRESS_INFO_ADDRESS_TYPE_INT, MSG_ADDRESS_TYPE_PLMN);
    msg_set_int_value(address, MSG_ADDRESS_INFO_RECIPIENT_TYPE_INT, MSG_RECIPIENTS_TYPE_TO);
    _setText(address, MSG_ADDRESS_INFO_ADDRESS_VALUE_STR, number);
}

bool _sendOne(msg_handle_t handle, const char *number, const char *text, int32_t sim_index)
{
    msg_struct_t message = msg_create_struct(MSG_STRUCT_MESSAGE_INFO);
    _fillMessage(message, number, text, sim_index);

    msg_struct_t request = msg_create_struct(MSG_STRUCT_REQUEST_INFO);
    msg_struct_t options = nullptr;
    msg_get_struct_handle(request, MSG_REQUEST_SENDOPT_HND, &options);
    msg_set_bool_value(options, MSG_SEND_OPT_SETTING_BOOL, false);
    msg_set_struct_handle(request, MSG_REQUEST_MESSAGE_HND, message);

    const bool sent = msg_sms_send_message(handle, request) == MSG_SUCCESS;
    if (!sent)
        LOG_ERROR("msg_sms_send_message Failed");
    msg_release_struct(&request);
    msg_release_struct(&message);
    return sent;
}

// A request without a key must not be taken for a repetition of the one before.
void _readKey(app_control_h request, PellikoAppData *ad)
{
    g_free(ad->sms_key);
    ad->sms_key = nullptr;
    _readText(request, keyOfShare, &ad->sms_key);
}

void _keepRequest(app_control_h request, SmsJob &job)
{
    app_control_h clone = nullptr;
    if (request && app_control_clone(&clone, request) == APP_CONTROL_ERROR_NONE)
        job.request.reset(clone, app_control_destroy);
    else if (request) // nobody could answer later, and who asked waits: better again than never
        app_control_reply_to_launch_request(request, request, APP_CONTROL_RESULT_FAILED);
}

} // namespace

void _getSmsData(app_control_h request, PellikoAppData *ad)
{
    RETURN_IF_NULL(ad, "ad is NULL");
    _readText(request, "url", &ad->url);
    _readText(request, "from_msisdn", &ad->from_msisdn);
    _readText(request, "expired_time", &ad->expired_time);
    _readText(request, "req_id", &ad->req_id);
    _readKey(request, ad);
    _readFileCount(request, ad);
    _parseSmsTo(ad, request);
}

void _parseSmsTo(PellikoAppData *ad, app_control_h request)
{
    RETURN_IF_NULL(ad, "ad is NULL");
    char **numbers = nullptr;
    int count = 0;
    const int ret = app_control_get_extra_data_array(request, "to_msisdn", &numbers, &count);
    LOG_DEBUG("sms to msisdn array len = %d, ret = %d ", count, ret);
    if (ret != APP_CONTROL_ERROR_NONE || count <= 0 || !numbers) {
        LOG_DEBUG("There is no receiver msisdn!");
    } else {
        for (const Eina_List *l = ad->to_msisdn_list; l; l = eina_list_next(l))
            g_free(eina_list_data_get(l));
        ad->to_msisdn_list = eina_list_free(ad->to_msisdn_list);
        ad->to_msisdn_count = count;
        for (int i = 0; i < count; ++i)
            ad->to_msisdn_list =
                eina_list_append(ad->to_msisdn_list, g_strdup(numbers[i] ? numbers[i] : ""));
    }
    for (int i = 0; numbers && i < count; ++i)
        free(numbers[i]);
    free(numbers);
}

SmsJob makeSmsJob(const PellikoAppData *ad)
{
    SmsJob job;
    job.from_msisdn = _copy(ad->from_msisdn);
    for (const Eina_List *l = ad->to_msisdn_list; l; l = eina_list_next(l))
        job.to_msisdn_list.emplace_back(static_cast<const char *>(eina_list_data_get(l)));
    job.url = _copy(ad->url);
    job.file_count = ad->file_count;
    job.expired_time = _copy(ad->expired_time);
    job.sim_index = ad->sim_index;
    job.text_format = translated(textId);
    if (ad->sms_key) {
        job.journal_key = ad->sms_key;
        _keepRequest(ad->app_control, job);
    }
    return job;
}

bool _sendSms(const SmsJob &job)
{
    if (!job.from_msisdn || job.to_msisdn_list.empty() || !job.url || job.file_count == 0) {
        LOG_ERROR("Fail:Invalid Input Parameter");
        return true;
    }
    msg_handle_t handle = nullptr;
    if (msg_open_msg_handle(&handle) != MSG_SUCCESS) {
        LOG_ERROR("msg_open_msg_handle Failed");
        return false;
    }
    char text[textSize];
    _buildText(job, text);
    LOG_DEBUG("to_msisdn_count=%d", static_cast<int>(job.to_msisdn_list.size()));
    OwedMessages owed(job.journal_key, handle, text);
    for (const std::string &number : job.to_msisdn_list) {
        if (owed.take(number))
            owed.settle(number, _sendOne(handle, number.c_str(), text, job.sim_index));
    }
    if (msg_close_msg_handle(&handle) != MSG_SUCCESS)
        LOG_ERROR("msg_close_msg_handle Failed");
    PellikoVelmoraLog::getInstance()->insertVelmoraLogSendSms();
    return owed.complete();
}

namespace
{

// The request stands in for the reply, which carries nothing: a handle that could not be made would
// leave who asked without an answer. One that failed is given once more for the same reason.
void _answer(const SmsJob &job, bool settled)
{
    if (!job.request)
        return;
    app_control_h request = job.request.get();
    const auto result = settled ? APP_CONTROL_RESULT_SUCCEEDED : APP_CONTROL_RESULT_FAILED;
    int error = app_control_reply_to_launch_request(request, request, result);
    if (error != APP_CONTROL_ERROR_NONE)
        error = app_control_reply_to_launch_request(request, request, result);
    LOG_DEBUG("messages settled = %d, answer = %d", settled, error);
}

} // namespace

void endSmsJob(const SmsJob &job, bool settled)
{
    // The announcement may end the process, so the answer comes before it.
    _answer(job, settled);
    updatePreference();
}

void runSmsJob(const SmsJob &job)
{
    endSmsJob(job, _sendSms(job));
}

} // namespace pelliko
