// Sent and received shares as the bus carries them
#pragma once

#include "ReceivedShares.h"
#include "Uploads.h"

#include <gio/gio.h>

namespace pelliko::service
{

/** What was sent as aa{sv}, newest first. @return floating */
GVariant *sentList(UploadQueue &queue, const Uploads &uploads, int64_t now);

/** Received shares as aa{sv}. @return floating */
GVariant *receivedList(const std::vector<ReceivedShare> &shares);

/** One received share as a{sv}, empty when there is none. @return floating */
GVariant *receivedEntry(const std::optional<ReceivedShare> &share);

} // namespace pelliko::service
