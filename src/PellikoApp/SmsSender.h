#pragma once

#include "PellikoApp/AppData.h"

#include <app_control.h>
#include <cstdint>
#include <memory>
#include <optional>
#include <string>
#include <vector>

// The messages that tell the recipients of a share where the files are. The background service asks
// for them with a launch request; they are sent from the user's own phone, one per recipient.

namespace pelliko
{

/// Everything that one round of messages needs. It is copied on the main loop, because the worker
/// may still be sending when the next request replaces the record's fields, and because the
/// language may change meanwhile.
struct SmsJob {
    std::optional<std::string> from_msisdn;
    std::vector<std::string> to_msisdn_list;
    std::optional<std::string> url;
    int32_t file_count = 0;
    std::optional<std::string> expired_time; ///< decimal seconds since the epoch, or milliseconds
    int32_t sim_index = 0;                   ///< SIM slot, from 0
    std::string text_format;                 ///< translated; takes the address and the date
    /// The share's name in the journal of messages; empty: whoever asks again gets them again.
    std::string journal_key;
    /// Who asked and wants to know when the messages are settled; none without a key.
    std::shared_ptr<app_control_s> request;
};

/// Reads the data of a "send_text" request into the record; what the request does not carry keeps
/// its value. Main loop only.
void _getSmsData(app_control_h request, PellikoAppData *ad);

/// The recipients of a "send_text" request; a request without any keeps the previous ones.
void _parseSmsTo(PellikoAppData *ad, app_control_h request);

/// A copy of the record's fields for a worker, with the text in the current language. Main loop
/// only.
SmsJob makeSmsJob(const PellikoAppData *ad);

/// Sends one message per recipient; blocks until the messaging service has accepted or refused each
/// of them. Failures are logged only. With a key, messages that were settled before are left out;
/// false when one could not be sent because the journal cannot be used. Any thread.
bool _sendSms(const SmsJob &job);

/// The end of a round of messages: tells who asked for it that all are settled, or that they must
/// be asked for again, then announces that the messages are done. Any thread.
void endSmsJob(const SmsJob &job, bool settled);

/// What the worker does: sends, then ends the round, also when sending failed. Any thread.
void runSmsJob(const SmsJob &job);

} // namespace pelliko
