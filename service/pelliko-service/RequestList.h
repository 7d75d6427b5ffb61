#pragma once

#include "Uploads.h"

#include <glib.h>

namespace pelliko::service
{

/** All requests as a floating aa{sv}, oldest first. */
GVariant *requestList(UploadQueue &queue, const Uploads &uploads);

} // namespace pelliko::service
