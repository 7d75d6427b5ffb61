// The device language: environment, C locale and message catalogue. Main loop only.
#pragma once

#include "app.h"

namespace pelliko
{

/// Applies the device language. The platform's handler of language changes
/// (APP_EVENT_LANGUAGE_CHANGED) and called once by hand at start; the event is not looked at. `ad`
/// is the application record.
void _langChanged(app_event_info_h event, void *ad);

/// Sets the locale (the environment's, else `locale`) and binds the catalogue of `domain` in `dir`.
/// 0, or -1 when no locale is to be had or the binding fails.
int _initI18n(const char *domain, const char *dir, const char *locale);

} // namespace pelliko
