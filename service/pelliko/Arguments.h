#pragma once

#include "pelliko_client.h"

#include <gio/gio.h>

namespace pelliko::client
{

/** The options as a floating (ii). */
GVariant *optionsVariant(const pelliko_upload_options_s &options);

/** The recipients as a floating a(ssi); null entries are left out, text that is no UTF-8 is made
 * valid. */
GVariant *recipientsVariant(pelliko_recipient_s *const *recipients, int count);

/** The paths made absolute, null entries left out; release with g_strfreev(). */
char **absolutePaths(char *const *paths, int count);

} // namespace pelliko::client
