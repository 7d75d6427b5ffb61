#pragma once

#include "pelliko_client.h"

namespace pelliko::client
{

/** One report of the service; the text is borrowed and may be empty. */
struct Report {
    int32_t id;
    int status;
    const char *input;
    int percent;
    int64_t expired;
    int error;
};

/** Remembers who gets the reports of a request, in place of an earlier receiver. */
void subscribe(int32_t id, pelliko_upload_status_cb callback, void *userData);

/** Calls the request's callback; the last report ends the subscription and is confirmed to the
 * service. */
void deliverReport(const Report &report);

/** Asks for the reports of all unfinished requests again, which also starts the service again. */
void serviceVanished();

} // namespace pelliko::client
